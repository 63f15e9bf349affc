#ifndef FILEINDEX_CORE_QUEUE_LOCK_H
#define FILEINDEX_CORE_QUEUE_LOCK_H

#include <string_view>
#include <sys/types.h>

#include "base/unique_fd.h"

namespace VANO::FILEINDEX {

class ShareFile;

// A queue file that is open and locked to append to, created when missing. The lock is held for
// the lifetime of this object; whoever takes the queue over has to hold it too.
class QueueLock {
  public:
    enum class Outcome {
        kHeld,
        kBusy,      // somebody else held it at every attempt
        kTakenOver, // the file was taken over between opening and locking, at one attempt at least
        kNoFile,    // it cannot be opened, or is no regular file
        kNoLock,    // it cannot be locked
    };

    // At most three attempts, with a pause of at most 9 ms after one that met a busy lock.
    explicit QueueLock(const ShareFile &queue);
    QueueLock(const QueueLock &) = delete;
    QueueLock &operator=(const QueueLock &) = delete;
    ~QueueLock();

    [[nodiscard]] Outcome Result() const { return outcome_; }
    [[nodiscard]] bool IsHeld() const { return outcome_ == Outcome::kHeld; }
    // The errno of what kept the lock from being held.
    [[nodiscard]] int Error() const { return error_; }

    // Appends whole lines in one write. The number of bytes written, which may be fewer, or -1.
    [[nodiscard]] ssize_t Append(std::string_view lines) const;

  private:
    [[nodiscard]] Outcome Try(const ShareFile &queue);

    UniqueFd file_;
    Outcome outcome_ = Outcome::kBusy;
    int error_ = 0;
};

} // namespace VANO::FILEINDEX

#endif
