#include "status/folder_progress.h"

#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <fileindex/status_mgr.h>

#include "base/log.h"
#include "core/event.h"
#include "core/progress_words.h"
#include "core/queue_reader.h"
#include "core/share_files.h"
#include "utils/index_location.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "status_mgr";

// Reads the whole queue, so that each malformed line in it is logged; true when there was none.
//
// The former path of a move stands for every later event too, whatever its code: what it reaches,
// the move itself has reached.
bool CountEvents(EventCounts &counts, const FolderSet &folders, QueueReader &reader) {
    bool silent = true;
    EventParser parser;
    std::string_view line;
    QueueEvent event{};
    while (reader.NextLine(line)) {
        if (parser.Parse(event, line)) {
            folders.Count(counts, event);
        } else {
            LogError(kUnit, 47, "Malformed command: %s", std::string(line).c_str());
            silent = false;
        }
    }
    return silent;
}

} // namespace

// Whether the queue holds an event at or under the folder.
bool FolderProgress::ScanQueue(const ShareFile &queue, const std::string &folder) {
    QueueReader reader(queue);
    if (!reader.IsOpen()) {
        LogError(kUnit, 37, "Failed to open queue=%s, reason=%s", queue.Path().c_str(),
                 ErrnoText().c_str());
        return false;
    }
    const auto [known, isFirst] = scans_.try_emplace(queue.Path());
    std::vector<std::string> wanted = isFirst ? fullPaths_ : std::vector<std::string>();
    wanted.push_back(folder);
    Scan scan{FolderSet(std::move(wanted)), {}};
    const bool silent = CountEvents(scan.counts, scan.folders, reader);
    const bool found = scan.counts.Of(scan.folders.Find(folder)) != 0;
    if (isFirst && silent) {
        known->second = std::move(scan);
    }
    return found;
}

// The same for a folder by its share path and a queue that need not exist.
bool FolderProgress::IsPathInQueue(const std::string &path, const ShareFile &queue) {
    if (!queue.IsFile()) {
        return false;
    }
    std::string folder;
    if (!GetFullPath(folder, path)) {
        LogError(kUnit, 30, "Cannot get full path: %s", path.c_str());
        return false;
    }
    const auto known = scans_.find(queue.Path());
    if (known != scans_.end() && known->second) {
        const std::size_t place = known->second->folders.Find(folder);
        if (place != FolderSet::kNone) {
            return known->second->counts.Of(place) != 0;
        }
    }
    return ScanQueue(queue, folder);
}

std::string FolderProgress::StatusOf(const std::string &path) {
    if (!CanPathBeIndexed(path)) {
        return kProgressPaused;
    }
    std::string share;
    if (!GetShareNameByPath(share, path)) {
        LogError(kUnit, 88, "Failed to get share name from path: %s", path.c_str());
        return kProgressFinished;
    }
    if (StatusMgr::ShareIsNoSpace(share)) {
        return kProgressNoSpace;
    }
    std::string location;
    if (!GetQueueLocation(location, share, kUnit, 100)) {
        return kProgressFinished;
    }
    long long resumeTime = kNotPaused;
    (void)StatusMgr::GetPauseInfo(resumeTime); // a pause that cannot be read is none
    const ShareFile queue(location);
    if (!IsPathInQueue(path, queue) && !IsPathInQueue(path, queue.TakenOver())) {
        return kProgressFinished;
    }
    return WaitingProgress(resumeTime, ::time(nullptr));
}

} // namespace VANO::FILEINDEX
