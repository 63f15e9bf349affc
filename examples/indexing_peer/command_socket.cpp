#include "command_socket.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>

#include "json_text.h"

namespace peer {

namespace {

constexpr char kSocketPath[] = "/var/run/fileindexd.sock";
constexpr char kNewSocketPath[] = "/var/run/fileindexd.sock.new";
constexpr char kLockPath[] = "/var/run/fileindexd.sock.lock";
constexpr int kBacklog = 64;
constexpr std::size_t kMaxConnections = 64;
constexpr std::chrono::seconds kConnectionTime{2};
// A command holds a name and a path or two.
constexpr std::uint32_t kMaxMessageBytes = 256U * 1024;
constexpr std::size_t kLengthBytes = sizeof(std::uint32_t);

sockaddr_un AddressOf(const char *path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strncpy(address.sun_path, path, sizeof(address.sun_path) - 1);
    return address;
}

int CallWith(int (*call)(int, const sockaddr *, socklen_t), int fd, const char *path) {
    const sockaddr_un address = AddressOf(path);
    return call(fd, reinterpret_cast<const sockaddr *>(&address), sizeof(address));
}

OwnedFd NewSocket() {
    return OwnedFd(::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
}

bool FailWith(std::string &reason, const std::string &what) {
    reason = what + ": " + std::strerror(errno);
    return false;
}

// Whether the socket's place is free: nothing there, or the socket of a daemon that died.
bool IsPlaceFree(std::string &reason) {
    struct stat info {};
    if (::lstat(kSocketPath, &info) != 0) {
        return errno == ENOENT || FailWith(reason, kSocketPath);
    }
    if (!S_ISSOCK(info.st_mode)) {
        reason = std::string(kSocketPath) + " is in the way and no socket";
        return false;
    }
    const OwnedFd probe = NewSocket();
    if (!probe) {
        return FailWith(reason, "socket");
    }
    if (CallWith(::connect, probe.Get(), kSocketPath) != 0 && errno == ECONNREFUSED) {
        return true;
    }
    reason = std::string("another daemon listens at ") + kSocketPath;
    return false;
}

std::uint32_t LengthIn(const std::string &received) {
    std::uint32_t length = 0;
    std::memcpy(&length, received.data(), sizeof(length));
    return length;
}

bool IsWouldBlock(int error) {
    return error == EAGAIN || error == EWOULDBLOCK || error == EINTR;
}

} // namespace

CommandSocket::~CommandSocket() {
    if (listener_) {
        (void)::unlink(kSocketPath);
    }
}

bool CommandSocket::Listen(std::string &reason) {
    // The lock decides between daemons that start at the same time. Its file stays: removing it
    // would let two of them hold a lock each.
    OwnedFd lock(::open(kLockPath, O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!lock) {
        return FailWith(reason, kLockPath);
    }
    if (::flock(lock.Get(), LOCK_EX | LOCK_NB) != 0) {
        reason = std::string("another daemon holds ") + kLockPath;
        return false;
    }
    if (!IsPlaceFree(reason)) {
        return false;
    }
    // Bound under another name and renamed, the socket listens from the moment it can be seen.
    OwnedFd listener = NewSocket();
    (void)::unlink(kNewSocketPath);
    if (!listener || CallWith(::bind, listener.Get(), kNewSocketPath) != 0) {
        return FailWith(reason, kNewSocketPath);
    }
    if (::listen(listener.Get(), kBacklog) != 0 || ::rename(kNewSocketPath, kSocketPath) != 0) {
        return FailWith(reason, kSocketPath);
    }
    lock_ = std::move(lock);
    listener_ = std::move(listener);
    return true;
}

void CommandSocket::AddTo(std::vector<pollfd> &waiting) const {
    if (connections_.size() < kMaxConnections) {
        waiting.push_back({listener_.Get(), POLLIN, 0});
    }
    for (const Connection &connection : connections_) {
        waiting.push_back({connection.fd.Get(), POLLIN, 0});
    }
}

void CommandSocket::AcceptAll() {
    while (connections_.size() < kMaxConnections) {
        OwnedFd fd(::accept4(listener_.Get(), nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC));
        if (!fd) {
            return;
        }
        connections_.push_back({std::move(fd), Clock::now() + kConnectionTime, {}});
    }
}

CommandSocket::Progress CommandSocket::ReadOn(Connection &connection, std::string &reason) {
    std::array<char, 4096> chunk{};
    for (;;) {
        std::string &received = connection.received;
        std::size_t wanted = kLengthBytes;
        if (received.size() >= kLengthBytes) {
            const std::uint32_t length = LengthIn(received);
            if (length == 0 || length > kMaxMessageBytes) {
                reason = "length " + std::to_string(length);
                return Progress::kRefused;
            }
            wanted += length;
        }
        if (received.size() == wanted) {
            return Progress::kComplete;
        }
        const ssize_t count = ::read(connection.fd.Get(), chunk.data(),
                                     std::min(chunk.size(), wanted - received.size()));
        if (count > 0) {
            received.append(chunk.data(), static_cast<std::size_t>(count));
            continue;
        }
        if (count < 0 && IsWouldBlock(errno)) {
            reason = "not complete in time";
            return Clock::now() < connection.deadline ? Progress::kWaiting : Progress::kRefused;
        }
        reason = "ends after " + std::to_string(received.size()) + " bytes";
        return Progress::kRefused;
    }
}

bool CommandSocket::Dispatch(const Connection &connection, const OnCommand &onCommand,
                             std::string &reason) {
    if (connection.received.back() != '\0') {
        reason = "no zero byte at the end";
        return false;
    }
    const std::string_view message(connection.received);
    Json::Value command;
    if (!ParseJson(command, message.substr(kLengthBytes, message.size() - kLengthBytes - 1))) {
        reason = "no JSON";
        return false;
    }
    if (!command.isObject() || !command["type"].isString() || !command.isMember("data")) {
        reason = "no command";
        return false;
    }
    onCommand(command["type"].asString(), command["data"]);
    return true;
}

void CommandSocket::Work(const OnCommand &onCommand, const OnRefusal &onRefusal) {
    AcceptAll();
    std::vector<Connection> unfinished;
    for (Connection &connection : connections_) {
        std::string reason;
        const Progress progress = ReadOn(connection, reason);
        if (progress == Progress::kWaiting) {
            unfinished.push_back(std::move(connection));
        } else if (progress == Progress::kRefused || !Dispatch(connection, onCommand, reason)) {
            onRefusal(reason);
        }
    }
    connections_ = std::move(unfinished);
}

} // namespace peer
