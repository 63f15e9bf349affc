#ifndef FILEINDEX_CORE_FOLDER_COVER_H
#define FILEINDEX_CORE_FOLDER_COVER_H

#include <cstring>
#include <fileindex/folder.h>
#include <string>

// Which paths a folder's setting covers, and which setting covers a path.

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

// Folder::GetFullPath() without a copy of the cached path. `scratch` holds a path that had to be
// resolved; empty when it cannot be.
inline const std::string &FullPathOf(const Folder &folder, std::string &scratch) {
    if (!folder.full_path.empty()) {
        return folder.full_path;
    }
    scratch = folder.GetFullPath();
    return scratch;
}

// Picks the setting that governs a full path: the last one considered that is the path or contains
// it, not the longest. In the order of the settings file every folder follows those above it, so
// the deepest wins.
class GoverningFolder {
  public:
    // The path and every folder considered must outlive this object.
    explicit GoverningFolder(const std::string &fullPath) : fullPath_(fullPath) {}

    void Consider(const Folder &folder) {
        std::string scratch;
        const std::string &full = FullPathOf(folder, scratch);
        if (!full.empty() && IsSameOrBelow(fullPath_, full)) {
            chosen_ = &folder;
        }
    }

    // The chosen folder; null when none governs the path.
    [[nodiscard]] const Folder *Get() const { return chosen_; }

    // Its setting; an empty object when none governs the path.
    [[nodiscard]] Json::Value AsJson() const {
        return chosen_ != nullptr ? chosen_->asJson() : Json::Value(Json::objectValue);
    }

  private:
    const std::string &fullPath_;
    const Folder *chosen_ = nullptr;
};

} // namespace VANO::FILEINDEX

#endif
