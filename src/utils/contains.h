#ifndef FILEINDEX_UTILS_CONTAINS_H
#define FILEINDEX_UTILS_CONTAINS_H

#include <cstring>
#include <string>

namespace VANO::FILEINDEX {

// Whether `path` is `folder` or lies below it, by whole path components: the same answer as
// StringStartWith(path + "/", folder + "/"), without building either string. The comparison ends
// at a zero byte, which no path of a file system holds.
inline bool IsSameOrBelow(const std::string &path, const std::string &folder) {
    if (path.size() < folder.size() ||
        std::strncmp(path.c_str(), folder.c_str(), folder.size()) != 0) {
        return false;
    }
    return path.size() == folder.size() || path[folder.size()] == '/' ||
           std::memchr(folder.data(), '\0', folder.size()) != nullptr;
}

} // namespace VANO::FILEINDEX

#endif
