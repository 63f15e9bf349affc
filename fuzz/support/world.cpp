#include "support/world.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <fileindex/config.h>
#include <fileindex/error_handler.h>

#include "base/unique_fd.h"
#include "support/check.h"
#include "support/event_trace.h"
#include "support/fake_platform.h"
#include "support/files.h"
#include "support/log_tap.h"
#include "support/naive.h"
#include "support/sockets.h"

namespace VANO::FUZZ {

namespace {

using FILEINDEX::UniqueFd;
using TESTS::FakePlatform;

constexpr int kBacklog = 4096;

// Made once, with the first input.
struct World {
    World() {
        GTEST_FLAG_SET(throw_on_failure, true); // in the kit, too, whatever fails ends the process
        TESTS::RequireSandbox();
        FakePlatform &platform = FakePlatform::Get();
        platform.Reset();
        for (const std::string &share : ShareNames()) {
            platform.AddShare(share, "/volume1/" + share);
            for (const char *folder : {"/a", "/2016"}) {
                TESTS::MakeDirs("/volume1/" + share + folder);
            }
            TESTS::MakeDirs("/volume1/" + share + "/@eaDir");
        }
        TESTS::MakeDirs(TESTS::kSettingsDirectory);
    }

    int listener = TESTS::ListenAt(TESTS::kDaemonSocket, SOCK_STREAM | SOCK_NONBLOCK, kBacklog);
};

World &TheWorld() {
    static World &world = *new World;
    return world;
}

Descriptors DescriptorsOfTheWorld() {
    (void)TheWorld();
    return {};
}

Json::Value CommandIn(const std::string &message) {
    std::uint32_t length = 0;
    Check(message.size() > sizeof(length), "a message has a length and a text", message);
    std::memcpy(&length, message.data(), sizeof(length));
    Check(length == message.size() - sizeof(length) && message.back() == '\0',
          "a message is as long as it says and ends with a zero byte", message);
    const std::string text = message.substr(sizeof(length), length - 1);
    const auto command = Parse(text);
    // A request can be nested so deep that a message around it is too deep for any reader.
    if (!command &&
        std::count(text.begin(), text.end(), '[') + std::count(text.begin(), text.end(), '{') >=
            1000) {
        return {};
    }
    Check(command && command->isObject() && command->size() == 2 && command->isMember("data") &&
              (*command)["type"].isString(),
          "a command is an object with a type and data", text);
    return *command;
}

} // namespace

const std::vector<std::string> &ShareNames() {
    static const std::vector<std::string> &names =
        *new std::vector<std::string>{"photos", "music", "a", "Фото"};
    return names;
}

std::string QueueOf(const std::string &share) {
    return TESTS::QueueOf("/volume1/" + share);
}

Run::Run() : descriptors_(DescriptorsOfTheWorld()) {
    for (const std::string &share : ShareNames()) {
        (void)::unlink(QueueOf(share).c_str());
        (void)::unlink((QueueOf(share) + ".tmp").c_str());
    }
    (void)::unlink(kFolderFile);
    (void)::unlink(kStatusFile);
    FakePlatform::Get().monitorCalls.clear();
    FakePlatform::Get().spotlight = false;
    TESTS::EventTrace::Get().Clear();
    FILEINDEX::ErrorHandler::SetError(FILEINDEX::FILEINDEX_ERR_NONE);
    (void)LogTap::Take();
}

Run::~Run() {
    (void)Commands();
    descriptors_.CheckNoneLeft();
    Check(FakePlatform::Get().LiveRecords() == 0, "every share record is released");
    Check(FakePlatform::Get().Violations().empty(), "the platform is called as it wants to be");
    for (const char *lock : {TESTS::kFolderLock, TESTS::kStatusLock}) {
        Check(!TESTS::IsLocked(lock), "every lock is released", lock);
    }
    for (const std::string &name : TESTS::NamesIn(TESTS::kSettingsDirectory)) {
        Check(name == "folder.conf" || name == "status.conf",
              "no other file is left beside the settings", name);
    }
}

std::vector<Json::Value> Run::Commands() {
    std::vector<Json::Value> commands;
    for (;;) {
        const UniqueFd connection(
            ::accept4(TheWorld().listener, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC));
        if (!connection) {
            return commands;
        }
        commands.push_back(CommandIn(TESTS::ReadToEnd(connection.Get())));
    }
}

std::string Get(const std::string &path) {
    return TESTS::ReadIfThere(path).value_or("");
}

} // namespace VANO::FUZZ
