#include "support/files.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <json/reader.h>
#include <json/writer.h>
#include <memory>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "support/event_trace.h"

namespace VANO::TESTS {

namespace fs = std::filesystem;

void PutFile(const std::string &path, std::string_view text) {
    const KitScope kit;
    MakeDirs(fs::path(path).parent_path());
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file << text << std::flush;
    EXPECT_TRUE(file.good()) << "cannot write " << path;
}

std::optional<std::string> ReadIfThere(const std::string &path) {
    const KitScope kit;
    std::ifstream file(path, std::ios::binary);
    if (!file || !fs::is_regular_file(path)) {
        return std::nullopt;
    }
    std::string text(fs::file_size(path), '\0');
    file.read(text.data(), static_cast<std::streamsize>(text.size()));
    text.resize(static_cast<std::size_t>(file.gcount()));
    return text;
}

std::string ReadText(const std::string &path) {
    std::optional<std::string> text = ReadIfThere(path);
    EXPECT_TRUE(text) << "cannot read " << path;
    return text.value_or("");
}

Json::Value ReadJson(const std::string &path) {
    return Json(ReadText(path));
}

Json::Value Json(std::string_view text) {
    Json::CharReaderBuilder settings;
    settings["failIfExtra"] = true;
    const std::unique_ptr<Json::CharReader> reader(settings.newCharReader());
    Json::Value value;
    std::string errors;
    EXPECT_TRUE(reader->parse(text.data(), text.data() + text.size(), &value, &errors))
        << errors << "in " << text;
    return value;
}

std::string CompactText(const Json::Value &value) {
    Json::StreamWriterBuilder settings;
    settings["indentation"] = "";
    settings["emitUTF8"] = true;
    return Json::writeString(settings, value);
}

void MakeDirs(const std::string &path) {
    const KitScope kit;
    std::error_code error;
    fs::create_directories(path, error);
    EXPECT_FALSE(error) << "cannot make " << path << ": " << error.message();
}

void RemoveTree(const std::string &path) {
    const KitScope kit;
    std::error_code error;
    fs::remove_all(path, error);
    EXPECT_FALSE(error) << "cannot remove " << path << ": " << error.message();
}

bool Exists(const std::string &path) {
    const KitScope kit;
    struct stat info {};
    return ::lstat(path.c_str(), &info) == 0;
}

std::vector<std::string> NamesIn(const std::string &directory) {
    const KitScope kit;
    std::vector<std::string> names;
    std::error_code error;
    for (const fs::directory_entry &entry : fs::directory_iterator(directory, error)) {
        names.push_back(entry.path().filename());
    }
    std::sort(names.begin(), names.end());
    return names;
}

mode_t ModeOf(const std::string &path) {
    const KitScope kit;
    struct stat info {};
    EXPECT_EQ(::stat(path.c_str(), &info), 0) << path;
    return info.st_mode & 07777;
}

std::map<int, std::string> OpenDescriptors() {
    constexpr char kDescriptors[] = "/proc/self/fd/";
    const KitScope kit;
    std::map<int, std::string> open;
    for (const std::string &name : NamesIn(kDescriptors)) {
        std::error_code error;
        const auto target = fs::read_symlink(kDescriptors + name, error);
        if (!error) { // the descriptor that listed the others is gone
            open[std::stoi(name)] = target;
        }
    }
    return open;
}

void RequireSandbox() {
    if (!Exists("/.fileindex-sandbox")) {
        (void)std::fputs("This program changes system paths; run it through scripts/sandbox.\n",
                         stderr);
        std::_Exit(2);
    }
}

HoldLock::HoldLock(const std::string &path, bool exclusive) : fd_(-1) {
    const KitScope kit;
    fd_ = ::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
    EXPECT_EQ(::flock(fd_, (exclusive ? LOCK_EX : LOCK_SH) | LOCK_NB), 0) << "cannot lock " << path;
}

HoldLock::~HoldLock() {
    const KitScope kit;
    ::close(fd_);
}

bool IsLocked(const std::string &path) {
    const KitScope kit;
    const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (fd < 0) {
        return false;
    }
    const bool free = ::flock(fd, LOCK_EX | LOCK_NB) == 0;
    ::close(fd);
    return !free;
}

} // namespace VANO::TESTS
