#ifndef FILEINDEX_STATUS_FOLDER_PROGRESS_H
#define FILEINDEX_STATUS_FOLDER_PROGRESS_H

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "status/pending_folders.h"

namespace VANO::FILEINDEX {

class QueueReader;

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
    [[nodiscard]] bool IsPathInQueue(const std::string &path, const std::string &queueFile);
    [[nodiscard]] bool Scan(QueueReader &reader, const std::string &folder,
                            const std::string &queueFile);

    std::vector<std::string> fullPaths_;
    // What the first scan of a queue file found; nothing when it logged.
    std::map<std::string, std::optional<PendingFolders>> scans_;
};

} // namespace VANO::FILEINDEX

#endif
