#ifndef FILEINDEX_UTILS_SHARE_LOCATION_H
#define FILEINDEX_UTILS_SHARE_LOCATION_H

#include <fileindex/fileindex.h>
#include <string>

namespace VANO::FILEINDEX {

using LocationGet = int (*)(const char *, char *, int);

// FILEIDXQueuePathGet() or FILEIDXDBPathGet() into a string. False for an unknown share.
inline bool GetLocation(std::string &location, LocationGet get, const std::string &share) {
    char buffer[4096] = {};
    if (get(share.c_str(), buffer, sizeof(buffer)) < 0) {
        return false;
    }
    location = buffer;
    return true;
}

} // namespace VANO::FILEINDEX

#endif
