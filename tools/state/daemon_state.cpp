#include "state/daemon_state.h"

#include <cerrno>
#include <cstring>
#include <sys/socket.h>
#include <sys/un.h>

#include "core/paths.h"

namespace CTL {

using VANO::FILEINDEX::UniqueFd;

int ConnectToDaemon(const UniqueFd &socket) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, VANO::FILEINDEX::kDaemonSocketPath,
                sizeof(VANO::FILEINDEX::kDaemonSocketPath));
    return ::connect(socket.Get(), reinterpret_cast<const sockaddr *>(&address), sizeof(address)) ==
                   0
               ? 0
               : errno;
}

DaemonState AskDaemonState() {
    // A real connection would be one without a command, which the daemon may complain about. A
    // datagram socket is refused by the kernel, and the reason tells a stream socket that somebody
    // holds (EPROTOTYPE) from the one that a dead daemon left behind.
    const UniqueFd probe(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    switch (probe ? ConnectToDaemon(probe) : errno) {
    case EPROTOTYPE:
        return DaemonState::kRunning;
    case ENOENT:
    case ECONNREFUSED:
        return DaemonState::kStopped;
    default:
        return DaemonState::kUnknown;
    }
}

const char *NameOf(DaemonState state) {
    switch (state) {
    case DaemonState::kRunning:
        return "running";
    case DaemonState::kStopped:
        return "stopped";
    case DaemonState::kUnknown:
        break;
    }
    return "unknown";
}

Colour ColourOf(DaemonState state) {
    return state == DaemonState::kRunning ? Colour::kGood : Colour::kBad;
}

} // namespace CTL
