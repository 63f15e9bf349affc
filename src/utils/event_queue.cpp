#include <fileindex/event_queue.h>

#include <cerrno>
#include <fcntl.h>
#include <fileindex/config.h>
#include <fileindex/share_path.h>
#include <fileindex/status_mgr.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/json_io.h"
#include "base/log.h"
#include "base/unique_fd.h"
#include "config/lock_retry.h"
#include "config/paths.h"
#include "utils/event_codes.h"
#include "utils/metadata_entry.h"
#include "utils/queue_reader.h"
#include "utils/share_location.h"
#include "utils/share_of_full_path.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";

bool IsVerbose() {
    return LOG_LEVEL == 7;
}

// Whether a re-index of exactly this path waits in the queue file, which exists.
bool HoldsReindex(QueueReader &&reader, const std::string &queueFile, const std::string &fullPath) {
    if (!reader.IsOpen()) {
        LogError(kUnit, 95, "Failed to open queue=%s, reason=%s", queueFile.c_str(),
                 ErrnoText().c_str());
        return false;
    }
    std::string_view line;
    QueueEvent event{};
    while (reader.NextLine(line)) {
        if (reader.ParseEvent(event, line) && event.code == kEventReindexFolder &&
            event.path == fullPath) {
            return true;
        }
    }
    return false;
}

// The same of the share's queue and of the one that the daemon took over.
bool IsReindexQueued(const MetadataEntry &queue, const std::string &queueFile,
                     const std::string &fullPath) {
    const std::string taken = queueFile + kTakenQueueSuffix;
    return (IsFileExist(queueFile) && HoldsReindex(QueueReader(queue), queueFile, fullPath)) ||
           (IsFileExist(taken) && HoldsReindex(QueueReader(taken), taken, fullPath));
}

// A queue that was opened, and what it is.
struct OpenedQueue {
    UniqueFd fd;
    struct stat info;
};

// Users can write beside the queue. Only a regular file is appended to, and none that has a second
// name: it may be somebody else's file.
OpenedQueue OpenQueue(const MetadataEntry &entry) {
    OpenedQueue queue{entry.Open(O_WRONLY | O_APPEND | O_CREAT, 0666), {}};
    if (queue.fd && (::fstat(queue.fd.Get(), &queue.info) != 0 || !S_ISREG(queue.info.st_mode) ||
                     queue.info.st_nlink > 1)) {
        queue.fd = UniqueFd();
    }
    return queue;
}

// Between opening the queue and locking it the daemon may have taken it over: what is written to
// that file then is lost.
bool IsTakenOver(const OpenedQueue &queue, const MetadataEntry &entry) {
    struct stat named {};
    return !entry.Stat(named) || queue.info.st_dev != named.st_dev ||
           queue.info.st_ino != named.st_ino;
}

void WriteAndUnlock(const UniqueFd &queue, const std::string &line) {
    const ssize_t written = ::write(queue.Get(), line.data(), line.size());
    if (written < static_cast<ssize_t>(line.size()) && IsVerbose()) {
        LogError(kUnit, 502, "write fail, (%ld, %ld)", static_cast<long>(written),
                 static_cast<long>(line.size()));
    }
    (void)::flock(queue.Get(), LOCK_UN); // closing it does the same
}

enum class Append { kDone, kBusy, kTakenOver, kFailed };

Append TryToAppend(const MetadataEntry &entry, const std::string &queueFile,
                   const std::string &line) {
    const OpenedQueue queue = OpenQueue(entry);
    if (!queue.fd) {
        return Append::kFailed;
    }
    if (::flock(queue.fd.Get(), LOCK_EX | LOCK_NB) != 0) {
        if (IsLockBusy(errno)) {
            return Append::kBusy;
        }
        if (IsVerbose()) {
            LogError(kUnit, 507, "flock fail, path=%s, reason=%s", queueFile.c_str(),
                     ErrnoText().c_str());
        }
        return Append::kFailed;
    }
    if (IsTakenOver(queue, entry)) {
        return Append::kTakenOver;
    }
    WriteAndUnlock(queue.fd, line);
    return Append::kDone;
}

// False when the queue cannot be opened or locked at all. One that only stays busy drops the line,
// which counts as done.
bool AppendLine(const MetadataEntry &entry, const std::string &queueFile, const std::string &line) {
    Append result = Append::kFailed;
    for (int attempt = 0; attempt < kLockAttempts; ++attempt) {
        result = TryToAppend(entry, queueFile, line);
        if (result == Append::kDone || result == Append::kFailed) {
            return result == Append::kDone;
        }
        if (result == Append::kBusy) {
            const int busy = errno;
            PauseBeforeNextLockAttempt();
            errno = busy;
        }
    }
    if (result == Append::kTakenOver) {
        return false;
    }
    if (IsVerbose()) {
        LogError(kUnit, 516, "try lock too many times, path=%s, reason=%s", queueFile.c_str(),
                 ErrnoText().c_str());
    }
    return true;
}

std::string EventLine(int event, const std::string &fullPath, const Json::Value &data) {
    Json::Value object(Json::objectValue);
    object["event"] = event;
    object["path"] = fullPath;
    object["data"] = data;
    return JsonToString(object) + "\n";
}

// False when the event could not be handed to the queue. `shareName` is left empty when the path
// lies in no share.
bool QueueEventOnce(std::string &shareName, int event, const std::string &fullPath,
                    const Json::Value &data) {
    ShareOfFullPath found;
    if (!FindShareOfFullPath(found, fullPath)) {
        LogError(kUnit, 472, "VANOShareNamePathGet failed, path=%s", fullPath.c_str());
        return false;
    }
    shareName = found.name.data();
    std::string queueFile;
    if (!GetQueueLocation(queueFile, shareName, kUnit, 478)) {
        return false;
    }
    const MetadataEntry queue(queueFile);
    return IsReindexQueued(queue, queueFile, fullPath) ||
           AppendLine(queue, queueFile, EventLine(event, fullPath, data));
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
