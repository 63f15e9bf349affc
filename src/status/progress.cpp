#include <fileindex/status_mgr.h>

#include <ctime>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <set>

#include "base/log.h"
#include "config/paths.h"
#include "status/resume_time.h"
#include "utils/contains.h"
#include "utils/event_codes.h"
#include "utils/queue_reader.h"
#include "utils/share_location.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "status_mgr";
constexpr char kFinished[] = "finished";
constexpr char kProcessing[] = "processing";
constexpr char kPaused[] = "paused";
constexpr char kNoSpace[] = "err_no_space";

// Whether the queue file holds an event at or under the folder. Reads the whole file, so that each
// malformed line in it is logged.
bool IsPathInQueue(const std::string &path, const std::string &queueFile) {
    if (!IsFileExist(queueFile)) {
        return false;
    }
    std::string folder;
    if (!GetFullPath(folder, path)) {
        LogError(kUnit, 30, "Cannot get full path: %s", path.c_str());
        return false;
    }
    QueueReader reader(queueFile);
    if (!reader.IsOpen()) {
        LogError(kUnit, 37, "Failed to open queue=%s, reason=%s", queueFile.c_str(),
                 ErrnoText().c_str());
        return false;
    }
    bool found = false;
    std::string_view line;
    QueueEvent event{};
    while (reader.NextLine(line)) {
        if (!reader.ParseEvent(event, line)) {
            LogError(kUnit, 47, "Malformed command: %s", std::string(line).c_str());
            continue;
        }
        // The former path of a move stands for every later event too, whatever its code: what it
        // reaches, the move itself has reached.
        found = found || IsSameOrBelow(event.path, folder) ||
                (event.code == kEventMoved && IsSameOrBelow(event.formerPath, folder));
    }
    return found;
}

const char *WaitingStatus(long long resumeTime) {
    return resumeTime != kPausedWithoutEnd && resumeTime <= static_cast<long long>(::time(nullptr))
               ? kProcessing
               : kPaused;
}

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
    if (!CanPathBeIndexed(path)) {
        return kPaused;
    }
    std::string share;
    if (!GetShareNameByPath(share, path)) {
        LogError(kUnit, 88, "Failed to get share name from path: %s", path.c_str());
        return kFinished;
    }
    if (ShareIsNoSpace(share)) {
        return kNoSpace;
    }
    std::string queue;
    if (!GetQueueLocation(queue, share, kUnit, 100)) {
        return kFinished;
    }
    long long resumeTime = kNotPaused;
    (void)GetPauseInfo(resumeTime); // a pause that cannot be read is none
    if (!IsPathInQueue(path, queue) && !IsPathInQueue(path, queue + kTakenQueueSuffix)) {
        return kFinished;
    }
    return WaitingStatus(resumeTime);
}

bool StatusMgr::GetStatus(std::string &status) {
    std::vector<Folder> folders;
    std::set<std::string> shares;
    if (!IndexMgr::List(folders) || !ListIndexableShares(shares, folders)) {
        return false;
    }
    bool waiting = false;
    for (const std::string &share : shares) {
        std::string queue;
        if (!GetQueueLocation(queue, share, kUnit, 146)) {
            return false;
        }
        if (IsFileExist(queue) || IsFileExist(queue + kTakenQueueSuffix)) {
            waiting = true;
            break;
        }
    }
    if (!waiting) {
        status = kFinished;
        return true;
    }
    long long resumeTime = kNotPaused;
    if (!GetPauseInfo(resumeTime)) {
        return false;
    }
    status = WaitingStatus(resumeTime);
    return true;
}

} // namespace VANO::FILEINDEX
