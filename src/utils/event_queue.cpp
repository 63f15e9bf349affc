#include <fileindex/event_queue.h>

#include <cerrno>
#include <fcntl.h>
#include <fileindex/config.h>
#include <fileindex/status_mgr.h>

#include "base/log.h"
#include "core/event.h"
#include "core/queue_lock.h"
#include "core/queue_reader.h"
#include "core/share.h"
#include "core/share_files.h"
#include "utils/index_location.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";

bool IsVerbose() {
    return LOG_LEVEL == 7;
}

// Whether a re-index of exactly this path waits in the queue.
bool IsReindexQueued(const ShareFile &queue, const std::string &fullPath) {
    if (!queue.IsFile()) {
        return false;
    }
    QueueReader reader(queue);
    if (!reader.IsOpen()) {
        LogError(kUnit, 95, "Failed to open queue=%s, reason=%s", queue.Path().c_str(),
                 ErrnoText().c_str());
        return false;
    }
    EventParser parser;
    std::string_view line;
    QueueEvent event{};
    while (reader.NextLine(line)) {
        if (parser.Parse(event, line) && event.code == kEventReindexFolder &&
            event.path == fullPath) {
            return true;
        }
    }
    return false;
}

void Append(const QueueLock &queue, const std::string &line) {
    const ssize_t written = queue.Append(line);
    if (written < static_cast<ssize_t>(line.size()) && IsVerbose()) {
        LogError(kUnit, 502, "write fail, (%ld, %ld)", static_cast<long>(written),
                 static_cast<long>(line.size()));
    }
}

// False when the line could not be appended. A queue that only stays busy drops it, which counts as
// done.
bool AppendOrDrop(const ShareFile &file, const std::string &line) {
    const QueueLock queue(file);
    errno = queue.Error();
    switch (queue.Result()) {
    case QueueLock::Outcome::kHeld:
        Append(queue, line);
        return true;
    case QueueLock::Outcome::kBusy:
        if (IsVerbose()) {
            LogError(kUnit, 516, "try lock too many times, path=%s, reason=%s", file.Path().c_str(),
                     ErrnoText().c_str());
        }
        return true;
    case QueueLock::Outcome::kNoLock:
        if (IsVerbose()) {
            LogError(kUnit, 507, "flock fail, path=%s, reason=%s", file.Path().c_str(),
                     ErrnoText().c_str());
        }
        return false;
    default:
        return false;
    }
}

// False when the event could not be handed to the queue. `shareName` is left empty when the path
// lies in no share.
bool QueueEventOnce(std::string &shareName, int event, const std::string &fullPath,
                    const Json::Value &data) {
    const auto found = FindShareOfFullPath(fullPath);
    if (!found) {
        LogError(kUnit, 472, "VANOShareNamePathGet failed, path=%s", fullPath.c_str());
        return false;
    }
    shareName = found->name;
    std::string location;
    if (!GetQueueLocation(location, shareName, kUnit, 478)) {
        return false;
    }
    const ShareFile queue(location);
    if (IsReindexQueued(queue, fullPath) || IsReindexQueued(queue.TakenOver(), fullPath)) {
        return true;
    }
    const std::string line = EventLine(event, fullPath, data);
    return line.size() - 1 <= kMaxEventBytes && AppendOrDrop(queue, line);
}

// A status file of an unexpected shape makes the JSON library throw: the mark is then not set.
bool MarkNeedReindex(const std::string &shareName) {
    try {
        return StatusMgr::ShareSetNeedReindex(shareName, true);
    } catch (const Json::Exception &) {
        return false;
    }
}

} // namespace

bool AddCustomEvent(const int &event, const std::string &fullPath, const Json::Value &data) {
    std::string shareName;
    if (QueueEventOnce(shareName, event, fullPath, data)) {
        return true;
    }
    if (!MarkNeedReindex(shareName)) {
        LogError(kUnit, 522, "ShareSetNeedReindex failed, share=%s", shareName.c_str());
    }
    return false;
}

} // namespace VANO::FILEINDEX
