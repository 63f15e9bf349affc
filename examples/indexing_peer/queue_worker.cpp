#include "queue_worker.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <memory>
#include <string_view>
#include <sys/file.h>
#include <sys/stat.h>

#include "json_text.h"
#include "owned_fd.h"

namespace peer {

namespace {

constexpr char kTakenSuffix[] = ".tmp";

QueueResult FailWith(std::string &reason, const std::string &path) {
    reason = path + ": " + std::strerror(errno);
    return QueueResult::kFailed;
}

// kDone with the locked file in `fd`.
QueueResult OpenAndLock(OwnedFd &fd, const std::string &path, std::string &reason) {
    fd = OwnedFd(::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (!fd) {
        return errno == ENOENT ? QueueResult::kIdle : FailWith(reason, path);
    }
    struct stat info {};
    if (::fstat(fd.Get(), &info) != 0) {
        return FailWith(reason, path);
    }
    if (!S_ISREG(info.st_mode)) {
        reason = path + ": not a regular file";
        return QueueResult::kFailed;
    }
    if (::flock(fd.Get(), LOCK_EX | LOCK_NB) != 0) {
        return errno == EWOULDBLOCK || errno == EINTR ? QueueResult::kIdle : FailWith(reason, path);
    }
    return QueueResult::kDone;
}

bool IsNamedBy(const OwnedFd &fd, const std::string &path) {
    struct stat opened {};
    struct stat named {};
    return ::fstat(fd.Get(), &opened) == 0 && ::lstat(path.c_str(), &named) == 0 &&
           opened.st_dev == named.st_dev && opened.st_ino == named.st_ino;
}

bool ParseEvent(Event &event, std::string_view text) {
    Json::Value value;
    if (!ParseJson(value, text) || !value.isObject() || !value["event"].isUInt() ||
        !value["path"].isString()) {
        return false;
    }
    event.code = value["event"].asUInt();
    event.path = value["path"].asString();
    event.data = value["data"];
    return true;
}

// A writer that died half-way leaves a torn line, and the next event is appended to it: the line
// then ends with a whole event.
bool FindEventAtEnd(Event &event, std::string_view line, std::size_t &begin) {
    for (begin = line.find('{', 1); begin != std::string_view::npos;
         begin = line.find('{', begin + 1)) {
        if (ParseEvent(event, line.substr(begin))) {
            return true;
        }
    }
    return false;
}

bool HandleLine(const std::string &queue, std::string_view line, const QueueHandlers &handlers) {
    Event event;
    if (ParseEvent(event, line)) {
        return handlers.onEvent(queue, event);
    }
    std::size_t begin = 0;
    if (FindEventAtEnd(event, line, begin)) {
        return handlers.onMalformed(queue, std::string(line.substr(0, begin))) &&
               handlers.onEvent(queue, event);
    }
    return handlers.onMalformed(queue, std::string(line));
}

struct CloseFile {
    void operator()(std::FILE *file) const { (void)std::fclose(file); }
};

// What getline() reads into.
struct LineBuffer {
    LineBuffer() = default;
    LineBuffer(const LineBuffer &) = delete;
    LineBuffer &operator=(const LineBuffer &) = delete;
    ~LineBuffer() { std::free(text); }

    char *text = nullptr;
    std::size_t size = 0;
};

// The last line counts with or without a newline after it.
QueueResult HandleLines(const OwnedFd &fd, const std::string &queue, const QueueHandlers &handlers,
                        std::string &reason) {
    // A duplicate shares the lock, so that closing the stream leaves the lock to its owner.
    const std::unique_ptr<std::FILE, CloseFile> file(
        ::fdopen(::fcntl(fd.Get(), F_DUPFD_CLOEXEC, 0), "r"));
    if (!file) {
        return FailWith(reason, queue);
    }
    LineBuffer buffer;
    ssize_t length = 0;
    while ((length = ::getline(&buffer.text, &buffer.size, file.get())) >= 0) {
        std::string_view line(buffer.text, static_cast<std::size_t>(length));
        if (!line.empty() && line.back() == '\n') {
            line.remove_suffix(1);
        }
        if (!HandleLine(queue, line, handlers)) {
            return QueueResult::kStopped;
        }
    }
    return std::ferror(file.get()) != 0 ? FailWith(reason, queue) : QueueResult::kDone;
}

QueueResult HandleAndRemove(const OwnedFd &fd, const std::string &queue, const std::string &taken,
                            const QueueHandlers &handlers, std::string &reason) {
    const QueueResult result = HandleLines(fd, queue, handlers, reason);
    if (result != QueueResult::kDone) {
        return result;
    }
    // Whoever cleans a share's index data may have been faster.
    if (::unlink(taken.c_str()) != 0 && errno != ENOENT) {
        return FailWith(reason, taken);
    }
    return QueueResult::kDone;
}

} // namespace

QueueResult WorkOffQueue(const std::string &queue, const QueueHandlers &handlers,
                         std::string &reason) {
    const std::string taken = queue + kTakenSuffix;
    OwnedFd left;
    QueueResult result = OpenAndLock(left, taken, reason);
    if (result == QueueResult::kDone) {
        return HandleAndRemove(left, queue, taken, handlers, reason);
    }
    if (result == QueueResult::kFailed) {
        return result;
    }
    OwnedFd fd;
    result = OpenAndLock(fd, queue, reason);
    if (result != QueueResult::kDone || !IsNamedBy(fd, queue)) {
        return result == QueueResult::kFailed ? result : QueueResult::kIdle;
    }
    // Never over a ".tmp" whose events are not done yet.
    if (::renameat2(AT_FDCWD, queue.c_str(), AT_FDCWD, taken.c_str(), RENAME_NOREPLACE) != 0) {
        return errno == EEXIST || errno == ENOENT ? QueueResult::kIdle : FailWith(reason, queue);
    }
    return HandleAndRemove(fd, queue, taken, handlers, reason);
}

} // namespace peer
