#ifndef FILEINDEX_UTILS_SHARE_OF_FULL_PATH_H
#define FILEINDEX_UTILS_SHARE_OF_FULL_PATH_H

#include <array>
#include <string>

#include "platform/vano_platform.h"

namespace VANO::FILEINDEX {

// What the platform says of a full path: zero-terminated strings.
struct ShareOfFullPath {
    std::array<char, 492> name{};
    std::array<char, 4096> path{};
};

// False when the full path lies in no share.
inline bool FindShareOfFullPath(ShareOfFullPath &found, const std::string &fullPath) {
    return VANOShareNamePathGet(fullPath.c_str(), found.name.data(),
                                static_cast<int>(found.name.size()), found.path.data(),
                                static_cast<int>(found.path.size())) >= 0;
}

} // namespace VANO::FILEINDEX

#endif
