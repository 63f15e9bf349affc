#ifndef FILEINDEX_CORE_LOCK_RETRY_H
#define FILEINDEX_CORE_LOCK_RETRY_H

#include <cerrno>
#include <cstdlib>
#include <unistd.h>

// The one rule by which every lock is retried.

namespace VANO::FILEINDEX {

constexpr int kLockAttempts = 3;

// Whether a failed flock() is worth another attempt.
inline bool IsLockBusy(int error) {
    return error == EAGAIN || error == EINTR;
}

// 0 to 9 ms, so that two callers that met once do not meet again.
inline void PauseBeforeNextLockAttempt() {
    ::usleep(static_cast<useconds_t>(std::rand() % 10) * 1000);
}

} // namespace VANO::FILEINDEX

#endif
