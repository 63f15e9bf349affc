#include "bench/peer.h"

#include <array>
#include <chrono>
#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <string>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include "base/unique_fd.h"
#include "core/paths.h"

namespace VANO::BENCH {

using FILEINDEX::UniqueFd;

namespace {

constexpr int kBacklog = 16;

UniqueFd Listen() {
    UniqueFd listener(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, FILEINDEX::kDaemonSocketPath,
                sizeof(FILEINDEX::kDaemonSocketPath));
    (void)::unlink(FILEINDEX::kDaemonSocketPath);
    if (::bind(listener.Get(), reinterpret_cast<sockaddr *>(&address), sizeof(address)) != 0 ||
        ::listen(listener.Get(), kBacklog) != 0) {
        throw std::runtime_error("cannot listen on the daemon's socket");
    }
    return listener;
}

std::string ReadToEnd(const UniqueFd &connection) {
    std::string bytes;
    std::array<char, 4096> buffer;
    ssize_t got = 0;
    while ((got = ::recv(connection.Get(), buffer.data(), buffer.size(), 0)) > 0) {
        bytes.append(buffer.data(), static_cast<std::size_t>(got));
    }
    return bytes;
}

// A length, that many bytes, the last of them zero.
bool IsCompleteCommand(const std::string &bytes) {
    std::uint32_t length = 0;
    if (bytes.size() <= sizeof(length)) {
        return false;
    }
    std::memcpy(&length, bytes.data(), sizeof(length));
    return bytes.size() == sizeof(length) + length && bytes[sizeof(length)] == '{' &&
           bytes.back() == '\0';
}

} // namespace

Peer::Peer() : listener_(Listen()), thread_(&Peer::Serve, this) {}

Peer::~Peer() {
    (void)::shutdown(listener_.Get(), SHUT_RDWR); // wakes accept()
    thread_.join();
    (void)::unlink(FILEINDEX::kDaemonSocketPath);
}

void Peer::Serve() {
    for (;;) {
        const UniqueFd connection(::accept4(listener_.Get(), nullptr, nullptr, SOCK_CLOEXEC));
        if (!connection) {
            return;
        }
        const bool complete = IsCompleteCommand(ReadToEnd(connection));
        const std::lock_guard<std::mutex> lock(mutex_);
        ++(complete ? complete_ : broken_);
        changed_.notify_one();
    }
}

bool Peer::Received(std::size_t count) {
    std::unique_lock<std::mutex> lock(mutex_);
    const bool came = changed_.wait_for(lock, std::chrono::seconds(10),
                                        [&] { return complete_ + broken_ >= count; });
    const bool right = came && complete_ == count && broken_ == 0;
    complete_ = 0;
    broken_ = 0;
    return right;
}

} // namespace VANO::BENCH
