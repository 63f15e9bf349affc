#include "machine.h"

#include <array>
#include <csignal>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <stdexcept>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
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

void CoverProgram(const char *program, const std::string &standIn) {
    if (::mount(standIn.c_str(), program, nullptr, MS_BIND, nullptr) != 0) {
        throw std::runtime_error(std::string("cannot cover ") + program);
    }
}

int Bind(const char *path, int type) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strcpy(address.sun_path, path);
    const int fd = ::socket(AF_UNIX, type | SOCK_CLOEXEC, 0);
    (void)::unlink(path);
    if (fd < 0 || ::bind(fd, reinterpret_cast<const sockaddr *>(&address), sizeof(address)) != 0) {
        throw std::runtime_error(std::string("cannot bind ") + path);
    }
    return fd;
}

// Takes what is sent, and forgets it.
[[noreturn]] void ReadLog(int log) {
    std::array<char, std::size_t{256} * 1024> buffer;
    for (;;) {
        (void)::recv(log, buffer.data(), buffer.size(), 0);
    }
}

[[noreturn]] void ReadCommands(int daemon) {
    std::array<char, 4096> buffer;
    for (;;) {
        const int connection = ::accept(daemon, nullptr, nullptr);
        while (connection >= 0 && ::read(connection, buffer.data(), buffer.size()) > 0) {
        }
        (void)::close(connection);
    }
}

pid_t Play(void (*part)(int), int socket) {
    const pid_t pid = ::fork();
    if (pid == 0) {
        ::prctl(PR_SET_PDEATHSIG, SIGKILL);
        part(socket);
    }
    (void)::close(socket);
    return pid;
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
    std::string table;
    for (const Share &share : kShares) {
        table += (table.empty() ? "{\"" : ",\"") + std::string(share.name) + "\":\"" +
                 share.directory + "\"";
        for (const char *folder : {"/2016", "/2017", "/films", "/@eaDir"}) {
            MakeDirs(share.directory + std::string(folder));
        }
    }
    PutFile("/usr/vano/etc/shares.json", table + "}");
    PutFile(kFolderLock, "");
    PutFile(kStatusLock, "");

    others_.push_back(Play(ReadLog, Bind(kLogSocket, SOCK_DGRAM)));
    if (hasDaemon) {
        const int daemon = Bind(kDaemonSocket, SOCK_STREAM);
        (void)::listen(daemon, 1000);
        others_.push_back(Play(ReadCommands, daemon));
    }
}

Machine::~Machine() {
    for (const pid_t pid : others_) {
        (void)::kill(pid, SIGKILL);
        (void)::waitpid(pid, nullptr, 0);
    }
    (void)::unlink(kDaemonSocket);
    (void)::unlink(kLogSocket);
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
