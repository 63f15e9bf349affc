#include <fileindex/status_mgr.h>

#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <set>

#include "base/log.h"
#include "core/progress_words.h"
#include "core/share_files.h"
#include "status/folder_progress.h"
#include "utils/index_location.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "status_mgr";

// The shares of the folders that can be indexed. False, with one line logged, when a share cannot
// be told.
bool ListIndexableShares(std::set<std::string> &shares, const std::vector<Folder> &folders) {
    for (const Folder &folder : folders) {
        std::string share;
        if (!GetShareNameByPath(share, folder.path)) {
            LogError(kUnit, 135, "Failed to get share name from path: %s", folder.path.c_str());
            return false;
        }
        if (CanPathBeIndexed(folder.path)) {
            shares.insert(share);
        }
    }
    return true;
}

} // namespace

std::string StatusMgr::GetFolderStatus(const std::string &path) {
    return FolderProgress({}).StatusOf(path);
}

bool StatusMgr::GetStatus(std::string &status) {
    std::vector<Folder> folders;
    std::set<std::string> shares;
    if (!IndexMgr::List(folders) || !ListIndexableShares(shares, folders)) {
        return false;
    }
    bool waiting = false;
    for (const std::string &share : shares) {
        std::string location;
        if (!GetQueueLocation(location, share, kUnit, 146)) {
            return false;
        }
        const ShareFile queue(location);
        if (queue.IsFile() || queue.TakenOver().IsFile()) {
            waiting = true;
            break;
        }
    }
    if (!waiting) {
        status = kProgressFinished;
        return true;
    }
    long long resumeTime = kNotPaused;
    if (!GetPauseInfo(resumeTime)) {
        return false;
    }
    status = WaitingProgress(resumeTime, ::time(nullptr));
    return true;
}

} // namespace VANO::FILEINDEX
