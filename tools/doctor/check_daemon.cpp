// The indexing daemon, as far as its socket tells.

#include <array>
#include <cerrno>
#include <chrono>
#include <fstream>
#include <platform/diagnosis.h>
#include <poll.h>
#include <sys/socket.h>

#include "core/paths.h"
#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "state/daemon_state.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::kDaemonSocketPath;
using VANO::FILEINDEX::UniqueFd;

constexpr int kPatienceMilliseconds = 2000; // the library's own commands wait for a second

std::string StartCommand() {
    return VANO::PLATFORM::ServiceCommand == nullptr
               ? ""
               : VANO::PLATFORM::ServiceCommand("restart", VANO::FILEINDEX::kIndexingService);
}

std::string FirstLine(pid_t pid, const char *file) {
    std::ifstream stream("/proc/" + std::to_string(pid) + "/" + file);
    std::string line;
    std::getline(stream, line);
    return line;
}

// "smbd (PID 123)"; "an unknown process" for one that has ended or that this user may not see.
std::string ProcessName(pid_t pid) {
    const std::string name = pid > 0 ? FirstLine(pid, "comm") : "";
    return name.empty() ? "an unknown process" : Shown(name) + " (PID " + std::to_string(pid) + ")";
}

// The letter of its state; 0 when it cannot be told.
char ProcessState(pid_t pid) {
    // "123 (any name, also with brackets) S ..."
    const std::string line = pid > 0 ? FirstLine(pid, "stat") : "";
    const std::size_t end = line.rfind(')');
    return end == std::string::npos || end + 2 >= line.size() ? '\0' : line[end + 2];
}

Finding NotRunning(const Evidence &evidence, const std::string &what) {
    Finding finding =
        Ok("daemon-stopped", kDaemonSocketPath, what + ", which is right: no folder is set");
    if (evidence.HasFolders()) {
        finding = Error("daemon-stopped", kDaemonSocketPath, what)
                      .Because("Nothing is indexed. Folders that are set: " +
                               std::to_string(evidence.folders.size()) + ".")
                      .Fix("Start it.", StartCommand());
    } else if (!evidence.areFoldersKnown) {
        finding = Warning("daemon-stopped", kDaemonSocketPath, what)
                      .Fix("Fix the settings first, then start it.", StartCommand());
    }
    return finding;
}

pid_t ListenerOf(const UniqueFd &connection) {
    ucred listener{};
    socklen_t size = sizeof(listener);
    return ::getsockopt(connection.Get(), SOL_SOCKET, SO_PEERCRED, &listener, &size) == 0
               ? listener.pid
               : 0;
}

// Whether the daemon takes a connection that brings nothing, and ends it. It gets no command.
bool Answers(const UniqueFd &connection) {
    (void)::shutdown(connection.Get(), SHUT_WR);
    const auto end =
        std::chrono::steady_clock::now() + std::chrono::milliseconds(kPatienceMilliseconds);
    for (;;) {
        const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
            end - std::chrono::steady_clock::now());
        pollfd event = {connection.Get(), POLLIN, 0};
        if (left.count() <= 0 || ::poll(&event, 1, static_cast<int>(left.count())) == 0) {
            return false;
        }
        std::array<char, 256> ignored{};
        if (event.revents != 0 &&
            ::recv(connection.Get(), ignored.data(), ignored.size(), MSG_DONTWAIT) <= 0) {
            return true;
        }
    }
}

Finding Silent(const std::string &why) {
    return Error("daemon-silent", kDaemonSocketPath, "fileindexd does not answer on its socket")
        .Because(why)
        .Fix("Find out what blocks it, or restart it.", StartCommand());
}

Finding Running(const Evidence &evidence, const UniqueFd &connection) {
    const pid_t pid = ListenerOf(connection);
    const std::string name = ProcessName(pid);
    const char state = ProcessState(pid);
    if (state == 'T' || state == 't') {
        return Silent(name + " is stopped by a signal; kill -CONT continues it.").With("pid", pid);
    }
    if (!Answers(connection)) {
        return Silent(name + " listens, but took no connection within 2 seconds.").With("pid", pid);
    }
    const bool isIdle = evidence.areFoldersKnown && !evidence.HasFolders();
    return Ok("daemon-running", kDaemonSocketPath,
              "fileindexd listens and answers: " + name + (isIdle ? "; no folder is set" : ""))
        .With("pid", pid);
}

} // namespace

Findings CheckDaemon(const Evidence &evidence) {
    const UniqueFd connection(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
    const int error = connection ? ConnectToDaemon(connection) : errno;
    switch (error) {
    case 0:
        return {Running(evidence, connection)};
    case ENOENT:
        return {NotRunning(evidence, "fileindexd does not run")};
    case ECONNREFUSED: {
        const FileLook look(kDaemonSocketPath);
        if (look.Exists() && !S_ISSOCK(look.info.st_mode)) {
            return {Error("daemon-socket", kDaemonSocketPath,
                          std::string(kDaemonSocketPath) + " is " + KindOf(look.info.st_mode))
                        .Because("The daemon cannot listen there.")
                        .Fix("Move it away and restart the daemon.", StartCommand())};
        }
        return {NotRunning(evidence, "Nobody listens on the socket that fileindexd left behind")};
    }
    case EAGAIN:
        return {Silent("Too many connections wait for it already.")};
    default:
        return {Unreadable("daemon-unreachable", kDaemonSocketPath, error)};
    }
}

} // namespace CTL::DOCTOR
