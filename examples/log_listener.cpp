// Stands in for the system logger: listens on /dev/log and prints what programs log, a line each.

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace {

constexpr char kSocketPath[] = "/dev/log";
constexpr std::size_t kMaxMessageBytes = std::size_t{64} * 1024;

int Listen() {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strncpy(address.sun_path, kSocketPath, sizeof(address.sun_path) - 1);
    const int fd = ::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (fd < 0 || ::bind(fd, reinterpret_cast<const sockaddr *>(&address), sizeof(address)) != 0) {
        std::perror(kSocketPath);
        std::exit(EXIT_FAILURE);
    }
    return fd;
}

void RemoveSocket(int) {
    (void)::unlink(kSocketPath);
    std::_Exit(EXIT_SUCCESS);
}

void Print(std::string_view message) {
    // A message may end with a newline or a zero byte of its own.
    while (!message.empty() && (message.back() == '\n' || message.back() == '\0')) {
        message.remove_suffix(1);
    }
    std::string line(message);
    for (char &c : line) {
        c = static_cast<unsigned char>(c) < ' ' ? ' ' : c;
    }
    (void)std::puts(line.c_str());
    (void)std::fflush(stdout);
}

} // namespace

int main(int argc, char **) {
    if (argc > 1) {
        (void)std::fputs("Usage: log_listener\n"
                         "Prints what is logged to /dev/log, which must be free, until SIGTERM.\n",
                         stderr);
        return 2;
    }
    const int fd = Listen();
    (void)std::signal(SIGTERM, RemoveSocket);
    (void)std::signal(SIGINT, RemoveSocket);
    std::string buffer(kMaxMessageBytes, '\0');
    for (;;) {
        const ssize_t length = ::recv(fd, buffer.data(), buffer.size(), 0);
        if (length > 0) {
            Print(std::string_view(buffer).substr(0, static_cast<std::size_t>(length)));
        }
    }
}
