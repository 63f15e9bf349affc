#ifndef FILEINDEX_STATUS_RESUME_TIME_H
#define FILEINDEX_STATUS_RESUME_TIME_H

namespace VANO::FILEINDEX {

// What "resume_time" means beside the end of a pause in seconds since the epoch.
constexpr long long kNotPaused = -1;
constexpr long long kPausedWithoutEnd = 0;

} // namespace VANO::FILEINDEX

#endif
