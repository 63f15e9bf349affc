#ifndef FILEINDEX_STATUS_PROGRESS_NAMES_H
#define FILEINDEX_STATUS_PROGRESS_NAMES_H

#include <ctime>

#include "status/resume_time.h"

namespace VANO::FILEINDEX {

// What the progress of a folder, and of the service as a whole, is called.
constexpr char kFinished[] = "finished";
constexpr char kProcessing[] = "processing";
constexpr char kPaused[] = "paused";
constexpr char kNoSpace[] = "err_no_space";

// The progress where events wait: whether a pause holds them up now.
inline const char *WaitingStatus(long long resumeTime) {
    return resumeTime != kPausedWithoutEnd && resumeTime <= static_cast<long long>(::time(nullptr))
               ? kProcessing
               : kPaused;
}

} // namespace VANO::FILEINDEX

#endif
