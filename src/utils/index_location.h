#ifndef FILEINDEX_UTILS_INDEX_LOCATION_H
#define FILEINDEX_UTILS_INDEX_LOCATION_H

#include <string>

namespace VANO::FILEINDEX {

// Where a share's event queue file or index database lies, with what FILEIDXQueuePathGet() and
// FILEIDXDBPathGet() make and log. False, with "<function> failed, share=%s" logged for the unit
// and line, when the share is unknown or the path too long.
[[nodiscard]] bool GetQueueLocation(std::string &location, const std::string &share,
                                    const char *unit, int line);
[[nodiscard]] bool GetDatabaseLocation(std::string &location, const std::string &share,
                                       const char *unit, int line);

} // namespace VANO::FILEINDEX

#endif
