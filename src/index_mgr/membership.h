#ifndef FILEINDEX_INDEX_MGR_MEMBERSHIP_H
#define FILEINDEX_INDEX_MGR_MEMBERSHIP_H

#include <fileindex/folder.h>
#include <string>
#include <vector>

namespace VANO::FILEINDEX {

// Whether one of the folders lies in the share. A folder without a share is skipped, with one line
// logged.
[[nodiscard]] bool HoldsFolderOfShare(const std::vector<Folder> &folders, const std::string &share);

} // namespace VANO::FILEINDEX

#endif
