#include "core/queue_lock.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "core/lock_retry.h"
#include "core/share_files.h"

namespace VANO::FILEINDEX {

QueueLock::QueueLock(const ShareFile &queue) {
    bool wasTakenOver = false;
    for (int attempt = 0; attempt < kLockAttempts; ++attempt) {
        outcome_ = Try(queue);
        error_ = errno;
        if (outcome_ == Outcome::kBusy) {
            file_ = UniqueFd();
            PauseBeforeNextLockAttempt();
        } else if (outcome_ != Outcome::kTakenOver) {
            return;
        }
        wasTakenOver = wasTakenOver || outcome_ == Outcome::kTakenOver;
    }
    outcome_ = wasTakenOver ? Outcome::kTakenOver : Outcome::kBusy;
}

QueueLock::~QueueLock() {
    if (IsHeld()) {
        (void)::flock(file_.Get(), LOCK_UN); // closing does the same, unless a child has the file
    }
}

// Users can write beside the queue: only a regular file is appended to. What is written to a file
// that the daemon took over after it was opened here is lost.
QueueLock::Outcome QueueLock::Try(const ShareFile &queue) {
    file_ = queue.Open(O_WRONLY | O_APPEND | O_CREAT, 0666);
    struct stat opened {};
    if (!file_ || ::fstat(file_.Get(), &opened) != 0 || !S_ISREG(opened.st_mode)) {
        return Outcome::kNoFile;
    }
    if (::flock(file_.Get(), LOCK_EX | LOCK_NB) != 0) {
        return IsLockBusy(errno) ? Outcome::kBusy : Outcome::kNoLock;
    }
    struct stat named {};
    const bool isSame =
        queue.Stat(named) && opened.st_dev == named.st_dev && opened.st_ino == named.st_ino;
    return isSame ? Outcome::kHeld : Outcome::kTakenOver;
}

ssize_t QueueLock::Append(std::string_view lines) const {
    return ::write(file_.Get(), lines.data(), lines.size());
}

} // namespace VANO::FILEINDEX
