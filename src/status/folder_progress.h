#ifndef FILEINDEX_STATUS_FOLDER_PROGRESS_H
#define FILEINDEX_STATUS_FOLDER_PROGRESS_H

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "core/folder_set.h"

namespace VANO::FILEINDEX {

class ShareFile;

// How far folders are indexed, asked one after another within one call of the library.
//
// Folders that are known beforehand share the scan of a queue, unless it holds something to log:
// then each folder scans it for itself, so that every message appears for each folder.
class FolderProgress {
  public:
    // The full paths of the folders that will be asked about, as far as they are known.
    explicit FolderProgress(std::vector<std::string> fullPaths)
        : fullPaths_(std::move(fullPaths)) {}

    // StatusMgr::GetFolderStatus() of a folder.
    [[nodiscard]] std::string StatusOf(const std::string &path);

  private:
    // What the scan of a queue found.
    struct Scan {
        FolderSet folders;
        EventCounts counts;
    };

    [[nodiscard]] bool IsPathInQueue(const std::string &path, const ShareFile &queue);
    [[nodiscard]] bool ScanQueue(const ShareFile &queue, const std::string &folder);

    std::vector<std::string> fullPaths_;
    std::map<std::string, std::optional<Scan>> scans_; // the first of a queue, unless it logged
};

} // namespace VANO::FILEINDEX

#endif
