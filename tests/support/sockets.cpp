#include "support/sockets.h"

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <gtest/gtest.h>
#include <sys/un.h>
#include <unistd.h>

#include "support/event_trace.h"

namespace VANO::TESTS {

namespace {

using Call = int (*)(int, const sockaddr *, socklen_t);

// Makes the call with the address that stands for the path.
int CallWith(Call call, int fd, const std::string &path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    (void)path.copy(address.sun_path, sizeof(address.sun_path) - 1);
    return call(fd, reinterpret_cast<const sockaddr *>(&address), sizeof(address));
}

} // namespace

int ListenAt(const std::string &path, int type, int backlog) {
    const KitScope kit;
    const int fd = ::socket(AF_UNIX, type | SOCK_CLOEXEC, 0);
    (void)::unlink(path.c_str());
    EXPECT_EQ(CallWith(::bind, fd, path), 0) << path << ": " << std::strerror(errno);
    if ((type & SOCK_DGRAM) == 0) {
        EXPECT_EQ(::listen(fd, backlog), 0) << path;
    }
    return fd;
}

int ConnectTo(const std::string &path, int flags) {
    const KitScope kit;
    const int fd = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | flags, 0);
    if (CallWith(::connect, fd, path) != 0) {
        const int reason = errno;
        ::close(fd);
        errno = reason;
        return -1;
    }
    return fd;
}

std::string ReadToEnd(int fd) {
    std::string text;
    std::array<char, 65536> buffer;
    ssize_t got = 0;
    while ((got = ::read(fd, buffer.data(), buffer.size())) > 0) {
        text.append(buffer.data(), static_cast<std::size_t>(got));
    }
    return text;
}

std::string CommandBytes(const std::string &text) {
    const auto length = static_cast<std::uint32_t>(text.size() + 1);
    return std::string(reinterpret_cast<const char *>(&length), sizeof(length)) + text + '\0';
}

} // namespace VANO::TESTS
