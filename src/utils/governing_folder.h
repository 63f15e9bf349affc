#ifndef FILEINDEX_UTILS_GOVERNING_FOLDER_H
#define FILEINDEX_UTILS_GOVERNING_FOLDER_H

#include <fileindex/folder.h>
#include <string>

#include "folders/full_path_of.h"
#include "utils/contains.h"

namespace VANO::FILEINDEX {

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

    // The chosen setting; an empty object when none governs the path.
    [[nodiscard]] Json::Value AsJson() const {
        return chosen_ != nullptr ? chosen_->asJson() : Json::Value(Json::objectValue);
    }

  private:
    const std::string &fullPath_;
    const Folder *chosen_ = nullptr;
};

} // namespace VANO::FILEINDEX

#endif
