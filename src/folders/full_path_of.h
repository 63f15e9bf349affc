#ifndef FILEINDEX_FOLDERS_FULL_PATH_OF_H
#define FILEINDEX_FOLDERS_FULL_PATH_OF_H

#include <fileindex/folder.h>
#include <string>

namespace VANO::FILEINDEX {

// Folder::GetFullPath() without a copy of the cached path. `scratch` holds a path that had to be
// resolved; empty when it cannot be.
inline const std::string &FullPathOf(const Folder &folder, std::string &scratch) {
    if (!folder.full_path.empty()) {
        return folder.full_path;
    }
    scratch = folder.GetFullPath();
    return scratch;
}

} // namespace VANO::FILEINDEX

#endif
