#include "utils/share_location.h"

#include <climits>
#include <fileindex/fileindex.h>

#include "base/log.h"

namespace VANO::FILEINDEX {

namespace {

using PathGet = int (*)(const char *, char *, int);

bool GetLocation(std::string &location, PathGet get, const std::string &share) {
    char buffer[PATH_MAX] = {};
    if (share.find('\0') != std::string::npos) {
        return false;
    }
    const int length = get(share.c_str(), buffer, sizeof(buffer));
    // A path that fills the buffer may have been cut: it would name something else.
    if (length < 0 || length >= static_cast<int>(sizeof(buffer)) - 1) {
        return false;
    }
    location = buffer;
    return true;
}

} // namespace

bool GetQueueLocation(std::string &location, const std::string &share, const char *unit, int line) {
    if (!GetLocation(location, FILEIDXQueuePathGet, share)) {
        LogError(unit, line, "FILEIDXQueuePathGet failed, share=%s", share.c_str());
        return false;
    }
    return true;
}

bool GetDatabaseLocation(std::string &location, const std::string &share, const char *unit,
                         int line) {
    if (!GetLocation(location, FILEIDXDBPathGet, share)) {
        LogError(unit, line, "FILEIDXDBPathGet failed, share=%s", share.c_str());
        return false;
    }
    return true;
}

} // namespace VANO::FILEINDEX
