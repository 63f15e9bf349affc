#include "machine.h"

#include <csignal>
#include <stdexcept>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include "support/files.h"

namespace VANO::TORTURE {

const std::vector<Share> kShares = {
    {"media", "/volume2/media"}, {"photos", "/volume1/photos"}, {"pictures", "/volume1/pictures"}};

namespace {

using namespace TESTS;

constexpr char kSwitch[] = "/run/torture.spotlight";
constexpr char kDaemonSocket[] = "/run/fileindexd.sock";
constexpr char kLogSocket[] = "/dev/log";
constexpr char kNowhere[] = "/dev/null";

void CoverProgram(const char *program, const std::string &standIn) {
    if (::mount(standIn.c_str(), program, nullptr, MS_BIND, nullptr) != 0) {
        throw std::runtime_error(std::string("cannot cover ") + program);
    }
}

void PutScript(const std::string &path) {
    PutFile(path, "#!/bin/sh\n");
    (void)::chmod(path.c_str(), 0755);
}

void PutOrRemove(const std::string &path, const std::optional<std::string> &text) {
    if (text) {
        PutFile(path, *text);
    } else {
        RemoveTree(path);
    }
}

std::vector<std::string> Names(const std::string &directory) {
    return Exists(directory) ? NamesIn(directory) : std::vector<std::string>();
}

void LookInto(Snapshot &snapshot, const std::string &directory) {
    for (const std::string &name : Names(directory)) {
        const std::string path = directory + "/" + name;
        struct stat info {};
        const bool isFile = ::lstat(path.c_str(), &info) == 0 && S_ISREG(info.st_mode);
        snapshot[path] = isFile ? ReadText(path) : "";
    }
}

} // namespace

std::string QueueOf(const Share &share) {
    return std::string(share.directory) + "/@eaDir/" + kQueueName;
}

std::vector<std::string> EventsAtStart(const Share &share) {
    std::vector<std::string> events;
    for (const char *number : {"1", "2"}) {
        events.push_back(R"({"data":null,"event":2,"path":")" + std::string(share.directory) +
                         "/earlier" + number + "\"}");
    }
    return events;
}

Machine::Machine(const std::string &standIn, bool hasDaemon) {
    for (const char *program :
         {"/usr/bin/testparm", "/usr/bin/net", "/usr/sbin/service", "/usr/sbin/update-rc.d"}) {
        if (Exists(program)) {
            CoverProgram(program, standIn);
        }
    }
    PutFile("/usr/vano/bin/vanozemnotify", "");
    CoverProgram("/usr/vano/bin/vanozemnotify", standIn);
    PutScript("/etc/init.d/fileindexd");
    PutScript("/etc/init.d/smbd");
    Json::Value table;
    for (const Share &share : kShares) {
        table[share.name] = share.directory;
        for (const char *folder : {"/2016", "/2017", "/films", "/@eaDir"}) {
            MakeDirs(share.directory + std::string(folder));
        }
    }
    PutFile("/usr/vano/etc/shares.json", CompactText(table));
    PutFile(kFolderLock, "");
    PutFile(kStatusLock, "");
    Start({LOG_LISTENER_PATH}, kLogSocket);
    if (hasDaemon) {
        Start({PEER_PATH, "--queue", "/tmp/none"}, kDaemonSocket); // leaves the queues alone
    }
}

void Machine::Start(const std::vector<std::string> &program, const char *socket) {
    others_.push_back(std::make_unique<Child>(program, kNowhere, kNowhere));
    if (!Eventually([socket] { return Exists(socket); })) {
        throw std::runtime_error("nobody listens at " + std::string(socket));
    }
}

Machine::~Machine() {
    for (const auto &other : others_) {
        other->Signal(SIGTERM);
        (void)other->Wait();
    }
}

void Machine::Reset(const Start &start) {
    for (const std::string directory : {kSettingsDirectory, kMonitorDirectory}) {
        for (const std::string &name : Names(directory)) {
            RemoveTree(directory + "/" + name);
        }
    }
    PutOrRemove(kFolderConf, start.folders);
    PutOrRemove(kStatusConf, start.status);
    PutFile(kSwitch, start.spotlight ? "yes" : "no");
    for (const Share &share : kShares) {
        const std::string metadata = share.directory + std::string("/@eaDir");
        for (const std::string &name : Names(metadata)) {
            RemoveTree(metadata + "/" + name);
        }
        std::string text;
        for (const std::string &event : EventsAtStart(share)) {
            text += event + "\n";
        }
        PutFile(QueueOf(share), text);
        MakeDirs(metadata + "/VANO@.fileindexdb");
    }
}

Snapshot Machine::Look() {
    Snapshot snapshot;
    for (const char *directory : {kSettingsDirectory, kMonitorDirectory, "/tmp"}) {
        LookInto(snapshot, directory);
    }
    for (const Share &share : kShares) {
        LookInto(snapshot, share.directory + std::string("/@eaDir"));
    }
    return snapshot;
}

} // namespace VANO::TORTURE
