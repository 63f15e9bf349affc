#ifndef FILEINDEXCTL_STATE_STATUS_FILE_H
#define FILEINDEXCTL_STATE_STATUS_FILE_H

#include <json/value.h>

namespace CTL {

// The status file's document, for what the library answers by name only. False, with the last error
// saying why, when it cannot be read or is no object.
[[nodiscard]] bool LoadStatus(Json::Value &status);

} // namespace CTL

#endif
