#ifndef FILEINDEX_INDEX_MGR_PARTS_H
#define FILEINDEX_INDEX_MGR_PARTS_H

#include <fileindex/folder.h>
#include <string>
#include <vector>

// What the files of IndexMgr share.

namespace VANO::FILEINDEX {

// The unit that messages of IndexMgr's operations name, whichever file they stand in.
constexpr char kIndexMgrUnit[] = "index_mgr";

// Whether one of the folders lies in the share. A folder without a share is skipped, with one line
// logged.
[[nodiscard]] bool HoldsFolderOfShare(const std::vector<Folder> &folders, const std::string &share);

// Starts the indexing daemon's service. False, with one line logged, when that fails.
[[nodiscard]] bool StartIndexingService();

// Stops the indexing daemon's service and switches Spotlight off, as the last folder setting is
// gone. Failures are logged only.
void StopIndexing();

// Switches the file-sharing service's Spotlight search on or off, unless it already is, and
// restarts that service to let it notice. Failures are logged only.
void SwitchSpotlight(bool on);

} // namespace VANO::FILEINDEX

#endif
