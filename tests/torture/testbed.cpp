#include "testbed.h"

#include <csignal>
#include <stdexcept>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include "support/files.h"

namespace VANO::TORTURE {

const std::vector<std::string> kShares = {"/volume2/media", kPhotos, "/volume1/pictures"};

namespace {

constexpr char kSwitch[] = "/run/torture.spotlight";
constexpr char kLogSocket[] = "/dev/log";
constexpr char kNowhere[] = "/dev/null";

void CoverProgram(const char *program, const std::string &standIn) {
    if (::mount(standIn.c_str(), program, nullptr, MS_BIND, nullptr) != 0) {
        throw std::runtime_error(std::string("cannot cover ") + program);
    }
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

std::vector<std::string> EventsAtStart(const std::string &share) {
    std::vector<std::string> events;
    for (const char *number : {"1", "2"}) {
        const std::string line = EventLine(share + "/earlier" + number, 2);
        events.push_back(line.substr(0, line.size() - 1));
    }
    return events;
}

Testbed::Testbed(const std::string &standIn, bool hasDaemon) {
    for (const char *program :
         {"/usr/bin/testparm", "/usr/bin/net", "/usr/sbin/service", "/usr/sbin/update-rc.d"}) {
        if (Exists(program)) {
            CoverProgram(program, standIn);
        }
    }
    PutFile("/usr/vano/bin/vanozemnotify", "");
    CoverProgram("/usr/vano/bin/vanozemnotify", standIn);
    PutProgram("/etc/init.d/fileindexd", "");
    PutProgram("/etc/init.d/smbd", "");
    PutShares({{"media", kShares[0]}, {"photos", kShares[1]}, {"pictures", kShares[2]}},
              {"2016", "2017", "films"});
    PutFile(kFolderLock, "");
    PutFile(kStatusLock, "");
    Launch({LOG_LISTENER_PATH}, kLogSocket);
    if (hasDaemon) {
        Launch({PEER_PATH, "--queue", "/tmp/none"}, kDaemonSocket); // leaves the queues alone
    }
}

void Testbed::Launch(const std::vector<std::string> &program, const char *socket) {
    others_.push_back(std::make_unique<Child>(program, kNowhere, kNowhere));
    if (!Eventually([socket] { return Exists(socket); })) {
        throw std::runtime_error("nobody listens at " + std::string(socket));
    }
}

Testbed::~Testbed() {
    for (const auto &other : others_) {
        other->Signal(SIGTERM);
        (void)other->Wait();
    }
}

void Testbed::Reset(const Start &start) {
    for (const std::string directory : {kSettingsDirectory, kMonitorDirectory}) {
        for (const std::string &name : Names(directory)) {
            RemoveTree(directory + "/" + name);
        }
    }
    PutOrRemove(kFolderFile, start.folders);
    PutOrRemove(kStatusFile, start.status);
    PutFile(kSwitch, start.spotlight ? "yes" : "no");
    for (const std::string &share : kShares) {
        RemoveTree(share + "/@eaDir");
        std::string text;
        for (const std::string &event : EventsAtStart(share)) {
            text += event + "\n";
        }
        PutFile(QueueOf(share), text);
        MakeDirs(DatabaseOf(share));
    }
}

Snapshot Testbed::Look() {
    Snapshot snapshot;
    for (const char *directory : {kSettingsDirectory, kMonitorDirectory, "/tmp"}) {
        LookInto(snapshot, directory);
    }
    for (const std::string &share : kShares) {
        LookInto(snapshot, share + "/@eaDir");
    }
    return snapshot;
}

} // namespace VANO::TORTURE
