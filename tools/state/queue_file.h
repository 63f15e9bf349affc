#ifndef FILEINDEXCTL_STATE_QUEUE_FILE_H
#define FILEINDEXCTL_STATE_QUEUE_FILE_H

#include <cstddef>
#include <string>
#include <sys/types.h>
#include <utility>

#include "base/unique_fd.h"

// The queue files of shares, to be looked at: nothing is made, locked or changed.

namespace CTL {

// A queue file, opened to be read, by its absolute path. Anything but a regular file is refused.
class QueueFile {
  public:
    QueueFile() = default; // nothing is there
    explicit QueueFile(const std::string &path);

    [[nodiscard]] bool IsOpen() const { return static_cast<bool>(fd_); }
    // Why it is not open; 0 when nothing is there, which is an empty queue.
    [[nodiscard]] int Error() const { return error_; }

    using Identity = std::pair<dev_t, ino_t>;
    [[nodiscard]] Identity WhichFile() const { return identity_; }

    [[nodiscard]] off_t Size() const { return size_; }

    // Seconds since its first event came, as far as the file system tells.
    [[nodiscard]] long long Age() const;

    // At most `bytes` bytes from `offset` on: fewer at the end of the file, and at a read error,
    // which errno then says; it is 0 otherwise.
    [[nodiscard]] std::string ReadAt(off_t offset, std::size_t bytes) const;

  private:
    VANO::FILEINDEX::UniqueFd fd_;
    int error_ = 0;
    Identity identity_{};
    off_t size_ = 0;
};

} // namespace CTL

#endif
