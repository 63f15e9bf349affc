#include "status/folder_progress.h"

#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <fileindex/status_mgr.h>

#include "base/log.h"
#include "config/paths.h"
#include "status/progress_names.h"
#include "utils/event_codes.h"
#include "utils/queue_reader.h"
#include "utils/share_location.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "status_mgr";

// Reads the whole queue, so that each malformed line in it is logged; true when there was none.
bool AddEvents(PendingFolders &folders, QueueReader &reader) {
    bool silent = true;
    std::string_view line;
    QueueEvent event{};
    while (reader.NextLine(line)) {
        if (!reader.ParseEvent(event, line)) {
            LogError(kUnit, 47, "Malformed command: %s", std::string(line).c_str());
            silent = false;
            continue;
        }
        folders.AddEvent(event.path);
        // The former path of a move stands for every later event too, whatever its code: what it
        // reaches, the move itself has reached.
        if (event.code == kEventMoved) {
            folders.AddEvent(event.formerPath);
        }
    }
    return silent;
}

} // namespace

// Whether the queue holds an event at or under the folder.
bool FolderProgress::Scan(QueueReader &reader, const std::string &folder,
                          const std::string &queueFile) {
    const auto [scan, isFirst] = scans_.try_emplace(queueFile);
    std::vector<std::string> wanted = isFirst ? fullPaths_ : std::vector<std::string>();
    wanted.push_back(folder);
    PendingFolders folders(std::move(wanted));
    const bool silent = AddEvents(folders, reader);
    const bool found = folders.IsPending(folder);
    if (isFirst && silent) {
        scan->second = std::move(folders);
    }
    return found;
}

// The same for a folder by its share path and a queue that need not exist.
bool FolderProgress::IsPathInQueue(const std::string &path, const std::string &queueFile) {
    if (!IsFileExist(queueFile)) {
        return false;
    }
    std::string folder;
    if (!GetFullPath(folder, path)) {
        LogError(kUnit, 30, "Cannot get full path: %s", path.c_str());
        return false;
    }
    const auto known = scans_.find(queueFile);
    if (known != scans_.end() && known->second && known->second->Holds(folder)) {
        return known->second->IsPending(folder);
    }
    QueueReader reader(queueFile);
    if (!reader.IsOpen()) {
        LogError(kUnit, 37, "Failed to open queue=%s, reason=%s", queueFile.c_str(),
                 ErrnoText().c_str());
        return false;
    }
    return Scan(reader, folder, queueFile);
}

std::string FolderProgress::StatusOf(const std::string &path) {
    if (!CanPathBeIndexed(path)) {
        return kPaused;
    }
    std::string share;
    if (!GetShareNameByPath(share, path)) {
        LogError(kUnit, 88, "Failed to get share name from path: %s", path.c_str());
        return kFinished;
    }
    if (StatusMgr::ShareIsNoSpace(share)) {
        return kNoSpace;
    }
    std::string queue;
    if (!GetQueueLocation(queue, share, kUnit, 100)) {
        return kFinished;
    }
    long long resumeTime = kNotPaused;
    (void)StatusMgr::GetPauseInfo(resumeTime); // a pause that cannot be read is none
    if (!IsPathInQueue(path, queue) && !IsPathInQueue(path, queue + kTakenQueueSuffix)) {
        return kFinished;
    }
    return WaitingStatus(resumeTime);
}

} // namespace VANO::FILEINDEX
