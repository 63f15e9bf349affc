#ifndef INDEXING_PEER_OWNED_FD_H
#define INDEXING_PEER_OWNED_FD_H

#include <unistd.h>
#include <utility>

namespace peer {

// Owns one descriptor.
class OwnedFd {
  public:
    explicit OwnedFd(int fd = -1) noexcept : fd_(fd) {}
    OwnedFd(OwnedFd &&other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
    OwnedFd &operator=(OwnedFd &&other) noexcept {
        std::swap(fd_, other.fd_);
        return *this;
    }
    ~OwnedFd() {
        if (fd_ >= 0) {
            (void)::close(fd_);
        }
    }

    [[nodiscard]] int Get() const noexcept { return fd_; }
    explicit operator bool() const noexcept { return fd_ >= 0; }

  private:
    int fd_;
};

} // namespace peer

#endif
