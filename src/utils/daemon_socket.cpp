#include <fileindex/daemon_socket.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdint>
#include <cstring>
#include <sys/socket.h>
#include <sys/time.h>
#include <sys/un.h>
#include <unistd.h>

#include "base/json_io.h"
#include "base/unique_fd.h"
#include "core/paths.h"

namespace VANO::FILEINDEX {

namespace {

constexpr std::int64_t kPieceBytes = 1024;
constexpr int kWriteRetries = 3;
constexpr timeval kSendTimeout = {1, 0};

// Writes one piece. A write of nothing that was interrupted is repeated, out of one budget for the
// whole buffer; 0 means that the budget or the peer gave out.
std::int64_t WritePiece(int fd, const char *piece, std::int64_t length, int &retries) {
    ssize_t written = ::write(fd, piece, static_cast<std::size_t>(length));
    while (written == 0 && errno == EINTR && retries > 0) {
        --retries;
        written = ::write(fd, piece, static_cast<std::size_t>(length));
    }
    return written;
}

bool WriteAll(int fd, std::size_t length, const void *buffer) {
    const char *const bytes = static_cast<const char *>(buffer);
    std::int64_t position = 0;
    auto remaining = static_cast<std::int64_t>(length);
    int retries = kWriteRetries;
    while (remaining != 0) {
        const std::int64_t written =
            WritePiece(fd, bytes + position, std::min(remaining, kPieceBytes), retries);
        if (written == 0) {
            return false;
        }
        // A failed write counts as -1 byte: the position steps back over a byte and sends it again.
        // Before the first byte there is nothing to step back to.
        remaining -= written;
        position += written;
        if (position < 0) {
            return false;
        }
    }
    return true;
}

bool SetSendTimeout(const UniqueFd &connection) {
    return ::setsockopt(connection.Get(), SOL_SOCKET, SO_SNDTIMEO, &kSendTimeout,
                        sizeof(kSendTimeout)) == 0;
}

UniqueFd ConnectToDaemon() {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, kDaemonSocketPath, sizeof(kDaemonSocketPath));
    UniqueFd connection(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (!connection) {
        return connection;
    }
    // Already for the connection: a daemon that accepts no more must not hold up the caller, who
    // may hold a lock.
    (void)SetSendTimeout(connection);
    if (::connect(connection.Get(), reinterpret_cast<const sockaddr *>(&address),
                  sizeof(address)) != 0 ||
        !SetSendTimeout(connection)) {
        return UniqueFd();
    }
    return connection;
}

} // namespace

bool SendCammandToDaemon(const std::string &command, const Json::Value &data) {
    // A daemon that hangs up must fail the write, not kill the caller.
    (void)::signal(SIGPIPE, SIG_IGN);
    const UniqueFd connection = ConnectToDaemon();
    if (!connection) {
        return false;
    }
    Json::Value message(Json::objectValue);
    message["type"] = command;
    message["data"] = data;
    const std::string text = JsonToString(message);
    const auto length = static_cast<std::uint32_t>(text.size() + 1);
    return WriteAll(connection.Get(), sizeof(length), &length) &&
           WriteAll(connection.Get(), length, text.c_str());
}

} // namespace VANO::FILEINDEX
