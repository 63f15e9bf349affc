#ifndef FILEINDEX_CORE_PROGRESS_WORDS_H
#define FILEINDEX_CORE_PROGRESS_WORDS_H

#include <ctime>

// What the progress of a folder, and of the service as a whole, is called, and how a pause bears on
// it.

namespace VANO::FILEINDEX {

constexpr char kProgressFinished[] = "finished";
constexpr char kProgressProcessing[] = "processing";
constexpr char kProgressPaused[] = "paused"; // also of a folder that cannot be indexed
constexpr char kProgressNoSpace[] = "err_no_space";

// What "resume_time" means beside the end of a pause in seconds since the epoch.
constexpr long long kNotPaused = -1;
constexpr long long kPausedWithoutEnd = 0;

// Whether indexing is paused at `now`.
inline bool IsPaused(long long resumeTime, std::time_t now) {
    return resumeTime == kPausedWithoutEnd || resumeTime > static_cast<long long>(now);
}

// The progress where events wait: whether a pause holds them up.
inline const char *WaitingProgress(long long resumeTime, std::time_t now) {
    return IsPaused(resumeTime, now) ? kProgressPaused : kProgressProcessing;
}

} // namespace VANO::FILEINDEX

#endif
