#ifndef FILEINDEX_UTILS_PLATFORM_ERROR_H
#define FILEINDEX_UTILS_PLATFORM_ERROR_H

namespace VANO::FILEINDEX {

// Logs "<operation> failed: err=[0x%04X %s:%d]" with the platform's last error: its code and the
// file and line where it was recorded.
void LogPlatformFailure(const char *unit, int line, const char *operation);

} // namespace VANO::FILEINDEX

#endif
