#ifndef FILEINDEX_BASE_UNIQUE_FD_H
#define FILEINDEX_BASE_UNIQUE_FD_H

#include <unistd.h>
#include <utility>

namespace VANO::FILEINDEX {

// Owns one descriptor from the moment it is opened. Closing is never retried: on Linux the
// descriptor is gone even when close() reports an error. The destructor keeps errno, so that a
// failure can still be reported after its descriptors went out of scope.
class UniqueFd {
  public:
    explicit UniqueFd(int fd = -1) noexcept : fd_(fd) {}
    UniqueFd(UniqueFd &&other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
    UniqueFd &operator=(UniqueFd &&other) noexcept {
        std::swap(fd_, other.fd_);
        return *this;
    }
    UniqueFd(const UniqueFd &) = delete;
    UniqueFd &operator=(const UniqueFd &) = delete;
    ~UniqueFd();

    [[nodiscard]] int Get() const noexcept { return fd_; }
    explicit operator bool() const noexcept { return fd_ >= 0; }

  private:
    int fd_;
};

} // namespace VANO::FILEINDEX

#endif
