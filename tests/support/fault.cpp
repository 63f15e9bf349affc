#ifdef _FORTIFY_SOURCE
#undef _FORTIFY_SOURCE // whose inline versions stand in the way of definitions
#endif

#include "support/fault.h"

#include <array>
#include <atomic>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdarg>
#include <cstdlib>
#include <ctime>
#include <dlfcn.h>
#include <fcntl.h>
#include <memory>
#include <mutex>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include "support/event_trace.h"

namespace VANO::TESTS {

namespace {

constexpr std::size_t kCallCount = static_cast<std::size_t>(Call::Count_);

constexpr std::array<const char *, kCallCount> kNames = {
    "chmod",     "close", "connect",   "fallocate", "fchmod", "fchown",     "flock",
    "fstat",     "fsync", "ftruncate", "lstat",     "mkdir",  "mkostemp",   "open",
    "open_path", "rand",  "read",      "realpath",  "rename", "setsockopt", "signal",
    "socket",    "stat",  "time",      "unlink",    "usleep", "write"};

struct Rules {
    std::shared_ptr<Fault::Hook> hook; // shared, so that a hook with a counter keeps counting
    bool record = false;
    std::vector<CallInfo> log;
};

// Looked at on every call, so it must work before any constructor has run.
std::array<std::atomic<bool>, kCallCount> g_active{};

std::mutex &Mutex() {
    static std::mutex &mutex = *new std::mutex;
    return mutex;
}

std::array<Rules, kCallCount> &AllRules() {
    static auto &rules = *new std::array<Rules, kCallCount>;
    return rules;
}

std::size_t Index(Call call) {
    return static_cast<std::size_t>(call);
}

bool IsActive(Call call) {
    return g_active[Index(call)].load(std::memory_order_acquire) && !KitScope::IsActive();
}

std::string PathOf(int fd) {
    std::array<char, PATH_MAX> target{};
    const std::string link = "/proc/self/fd/" + std::to_string(fd);
    const ssize_t length = ::readlink(link.c_str(), target.data(), target.size() - 1);
    return length > 0 ? std::string(target.data(), static_cast<std::size_t>(length)) : "?";
}

std::optional<long> Enter(CallInfo &info) {
    const int reason = errno;
    std::shared_ptr<Fault::Hook> hook;
    bool record = false;
    {
        const KitScope kit;
        if (info.fd >= 0 && info.path.empty()) {
            info.path = PathOf(info.fd);
        }
        const std::lock_guard<std::mutex> lock(Mutex());
        Rules &rules = AllRules()[Index(info.call)];
        rules.log.push_back(info);
        hook = rules.hook;
        record = rules.record;
    }
    if (record) {
        EventTrace::Get().Add(info.Text());
    }
    errno = reason;
    if (!hook) {
        return std::nullopt;
    }
    const KitScope kit;
    return (*hook)(info);
}

void SetHook(Call call, Fault::Hook hook) {
    const std::lock_guard<std::mutex> lock(Mutex());
    AllRules()[Index(call)].hook = std::make_shared<Fault::Hook>(std::move(hook));
    g_active[Index(call)].store(true, std::memory_order_release);
}

std::optional<long> Failed(int error) {
    errno = error;
    return -1;
}

bool EndsWith(const std::string &text, const std::string &suffix) {
    return text.size() >= suffix.size() &&
           text.compare(text.size() - suffix.size(), suffix.size(), suffix) == 0;
}

} // namespace

std::string CallInfo::Text() const {
    std::string text = std::string(kNames[Index(call)]) + "(" + path;
    switch (call) {
    case Call::Rename:
        text += ", " + otherPath;
        break;
    case Call::Read:
    case Call::Write:
        text += ", " + std::to_string(size);
        break;
    case Call::Chmod:
    case Call::Fchmod:
    case Call::Flock:
    case Call::Ftruncate:
    case Call::Mkdir:
    case Call::Open:
    case Call::OpenPath:
        text += ", " + std::to_string(number);
        break;
    case Call::Setsockopt:
    case Call::Signal:
    case Call::Usleep:
        text += (path.empty() ? "" : ", ") + std::to_string(number);
        break;
    default:
        break;
    }
    return text + ")";
}

void Fault::Fail(Call call, int error, int nth) {
    SetHook(call, [error, left = nth](CallInfo &) mutable {
        return --left == 0 ? Failed(error) : std::nullopt;
    });
}

void Fault::FailAlways(Call call, int error) {
    SetHook(call, [error](CallInfo &) { return Failed(error); });
}

void Fault::FailPath(Call call, const std::string &suffix, int error) {
    SetHook(call, [suffix, error](CallInfo &info) {
        return EndsWith(info.path, suffix) ? Failed(error) : std::nullopt;
    });
}

void Fault::Return(Call call, const std::vector<long> &results) {
    SetHook(call, [results, next = std::size_t{0}](CallInfo &) mutable {
        return next < results.size() ? std::optional<long>(results[next++]) : std::nullopt;
    });
}

void Fault::Quiet(Call call) {
    SetHook(call, [](CallInfo &) { return 0; });
}

void Fault::On(Call call, Hook hook) {
    SetHook(call, std::move(hook));
}

void Fault::Record(Call call) {
    const std::lock_guard<std::mutex> lock(Mutex());
    AllRules()[Index(call)].record = true;
    g_active[Index(call)].store(true, std::memory_order_release);
}

void Fault::Count(Call call) {
    g_active[Index(call)].store(true, std::memory_order_release);
}

std::size_t Fault::Calls(Call call) {
    const std::lock_guard<std::mutex> lock(Mutex());
    return AllRules()[Index(call)].log.size();
}

std::vector<CallInfo> Fault::Log(Call call) {
    const std::lock_guard<std::mutex> lock(Mutex());
    return AllRules()[Index(call)].log;
}

void Fault::Reset() {
    const std::lock_guard<std::mutex> lock(Mutex());
    for (auto &active : g_active) {
        active.store(false, std::memory_order_release);
    }
    AllRules() = {};
}

namespace {

// The definition that stands behind this one: a sanitizer's or the C library's.
template <class Function>
Function Next(const char *name) {
    return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

CallInfo OfPath(Call call, const char *path, long number = 0) {
    CallInfo info{call, path != nullptr ? path : "", {}};
    info.number = number;
    return info;
}

// The path of a call that takes one relative to a directory.
CallInfo OfPathAt(Call call, int directory, const char *path, long number = 0) {
    CallInfo info = OfPath(call, path, number);
    if (directory != AT_FDCWD && info.path.compare(0, 1, "/") != 0) {
        const KitScope kit;
        const int reason = errno;
        info.path = PathOf(directory) + "/" + info.path;
        errno = reason;
    }
    return info;
}

Call KindOfOpen(int flags) {
    return (flags & O_PATH) != 0 ? Call::OpenPath : Call::Open;
}

CallInfo OfFd(Call call, int fd, long number = 0) {
    CallInfo info{call, {}, {}};
    info.fd = fd;
    info.number = number;
    return info;
}

// Before a call that others can see: what happened earlier is to stand earlier in the trace.
void PollBefore() {
    const int reason = errno;
    EventTrace::Get().Poll();
    errno = reason;
}

} // namespace

} // namespace VANO::TESTS

using VANO::TESTS::Call;
using VANO::TESTS::CallInfo;
using VANO::TESTS::Enter;
using VANO::TESTS::IsActive;
using VANO::TESTS::KindOfOpen;
using VANO::TESTS::Next;
using VANO::TESTS::OfFd;
using VANO::TESTS::OfPath;
using VANO::TESTS::OfPathAt;
using VANO::TESTS::PollBefore;

// Tells a hook of the call; `return` with its result when it has one.
#define FILEINDEX_TELL(call, description, type)                                                    \
    if (IsActive(call)) {                                                                          \
        CallInfo told = description;                                                               \
        if (const auto result = Enter(told)) {                                                     \
            return static_cast<type>(*result);                                                     \
        }                                                                                          \
    }

#pragma GCC visibility push(default)
extern "C" {

int open(const char *path, int flags, ...) {
    static const auto next = Next<int (*)(const char *, int, ...)>("open");
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & (O_CREAT | O_TMPFILE)) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    const Call kind = KindOfOpen(flags);
    FILEINDEX_TELL(kind, OfPath(kind, path, flags), int)
    return next(path, flags, mode);
}

int open64(const char *path, int flags, ...) {
    static const auto next = Next<int (*)(const char *, int, ...)>("open64");
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & (O_CREAT | O_TMPFILE)) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    const Call kind = KindOfOpen(flags);
    FILEINDEX_TELL(kind, OfPath(kind, path, flags), int)
    return next(path, flags, mode);
}

int openat64(int directory, const char *path, int flags, ...) {
    static const auto next = Next<int (*)(int, const char *, int, ...)>("openat64");
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & (O_CREAT | O_TMPFILE)) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    const Call kind = KindOfOpen(flags);
    FILEINDEX_TELL(kind, OfPathAt(kind, directory, path, flags), int)
    return next(directory, path, flags, mode);
}

int openat(int directory, const char *path, int flags, ...) {
    static const auto next = Next<int (*)(int, const char *, int, ...)>("openat");
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & (O_CREAT | O_TMPFILE)) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    const Call kind = KindOfOpen(flags);
    FILEINDEX_TELL(kind, OfPathAt(kind, directory, path, flags), int)
    return next(directory, path, flags, mode);
}

int close(int fd) {
    static const auto next = Next<int (*)(int)>("close");
    FILEINDEX_TELL(Call::Close, OfFd(Call::Close, fd), int)
    return next(fd);
}

ssize_t read(int fd, void *buffer, size_t size) {
    static const auto next = Next<ssize_t (*)(int, void *, size_t)>("read");
    if (IsActive(Call::Read)) {
        CallInfo info = OfFd(Call::Read, fd);
        info.size = size;
        if (const auto result = Enter(info)) {
            return *result;
        }
        size = info.size;
    }
    return next(fd, buffer, size);
}

ssize_t write(int fd, const void *buffer, size_t size) {
    static const auto next = Next<ssize_t (*)(int, const void *, size_t)>("write");
    if (IsActive(Call::Write)) {
        CallInfo info = OfFd(Call::Write, fd);
        info.size = size;
        info.data = buffer;
        if (const auto result = Enter(info)) {
            return *result;
        }
        size = info.size;
    }
    return next(fd, buffer, size);
}

int flock(int fd, int operation) __THROW {
    static const auto next = Next<int (*)(int, int)>("flock");
    FILEINDEX_TELL(Call::Flock, OfFd(Call::Flock, fd, operation), int)
    return next(fd, operation);
}

int fsync(int fd) {
    static const auto next = Next<int (*)(int)>("fsync");
    FILEINDEX_TELL(Call::Fsync, OfFd(Call::Fsync, fd), int)
    return next(fd);
}

int rename(const char *from, const char *to) __THROW {
    static const auto next = Next<int (*)(const char *, const char *)>("rename");
    PollBefore();
    if (IsActive(Call::Rename)) {
        CallInfo info = OfPath(Call::Rename, from);
        info.otherPath = to;
        if (const auto result = Enter(info)) {
            return static_cast<int>(*result);
        }
    }
    return next(from, to);
}

int unlink(const char *path) __THROW {
    static const auto next = Next<int (*)(const char *)>("unlink");
    FILEINDEX_TELL(Call::Unlink, OfPath(Call::Unlink, path), int)
    return next(path);
}

int chmod(const char *path, mode_t mode) __THROW {
    static const auto next = Next<int (*)(const char *, mode_t)>("chmod");
    FILEINDEX_TELL(Call::Chmod, OfPath(Call::Chmod, path, mode), int)
    return next(path, mode);
}

int fchmod(int fd, mode_t mode) __THROW {
    static const auto next = Next<int (*)(int, mode_t)>("fchmod");
    FILEINDEX_TELL(Call::Fchmod, OfFd(Call::Fchmod, fd, mode), int)
    return next(fd, mode);
}

int fchown(int fd, uid_t owner, gid_t group) __THROW {
    static const auto next = Next<int (*)(int, uid_t, gid_t)>("fchown");
    FILEINDEX_TELL(Call::Fchown, OfFd(Call::Fchown, fd, owner), int)
    return next(fd, owner, group);
}

int mkdir(const char *path, mode_t mode) __THROW {
    static const auto next = Next<int (*)(const char *, mode_t)>("mkdir");
    FILEINDEX_TELL(Call::Mkdir, OfPath(Call::Mkdir, path, mode), int)
    return next(path, mode);
}

int mkdirat(int directory, const char *path, mode_t mode) __THROW {
    static const auto next = Next<int (*)(int, const char *, mode_t)>("mkdirat");
    FILEINDEX_TELL(Call::Mkdir, OfPathAt(Call::Mkdir, directory, path, mode), int)
    return next(directory, path, mode);
}

int mkostemp(char *path, int flags) {
    static const auto next = Next<int (*)(char *, int)>("mkostemp");
    FILEINDEX_TELL(Call::Mkostemp, OfPath(Call::Mkostemp, path, flags), int)
    return next(path, flags);
}

int mkostemp64(char *path, int flags) {
    static const auto next = Next<int (*)(char *, int)>("mkostemp64");
    FILEINDEX_TELL(Call::Mkostemp, OfPath(Call::Mkostemp, path, flags), int)
    return next(path, flags);
}

int ftruncate(int fd, off_t length) __THROW {
    static const auto next = Next<int (*)(int, off_t)>("ftruncate");
    FILEINDEX_TELL(Call::Ftruncate, OfFd(Call::Ftruncate, fd, length), int)
    return next(fd, length);
}

int ftruncate64(int fd, off64_t length) __THROW {
    static const auto next = Next<int (*)(int, off64_t)>("ftruncate64");
    FILEINDEX_TELL(Call::Ftruncate, OfFd(Call::Ftruncate, fd, length), int)
    return next(fd, length);
}

int fallocate(int fd, int mode, off_t offset, off_t length) {
    static const auto next = Next<int (*)(int, int, off_t, off_t)>("fallocate");
    FILEINDEX_TELL(Call::Fallocate, OfFd(Call::Fallocate, fd, length), int)
    return next(fd, mode, offset, length);
}

int fallocate64(int fd, int mode, off64_t offset, off64_t length) {
    static const auto next = Next<int (*)(int, int, off64_t, off64_t)>("fallocate64");
    FILEINDEX_TELL(Call::Fallocate, OfFd(Call::Fallocate, fd, length), int)
    return next(fd, mode, offset, length);
}

int stat(const char *path, struct stat *info) __THROW {
    static const auto next = Next<int (*)(const char *, struct stat *)>("stat");
    FILEINDEX_TELL(Call::Stat, OfPath(Call::Stat, path), int)
    return next(path, info);
}

int stat64(const char *path, struct stat64 *info) __THROW {
    static const auto next = Next<int (*)(const char *, struct stat64 *)>("stat64");
    FILEINDEX_TELL(Call::Stat, OfPath(Call::Stat, path), int)
    return next(path, info);
}

int lstat(const char *path, struct stat *info) __THROW {
    static const auto next = Next<int (*)(const char *, struct stat *)>("lstat");
    FILEINDEX_TELL(Call::Lstat, OfPath(Call::Lstat, path), int)
    return next(path, info);
}

int lstat64(const char *path, struct stat64 *info) __THROW {
    static const auto next = Next<int (*)(const char *, struct stat64 *)>("lstat64");
    FILEINDEX_TELL(Call::Lstat, OfPath(Call::Lstat, path), int)
    return next(path, info);
}

int fstatat64(int directory, const char *path, struct stat64 *info, int flags) __THROW {
    static const auto next = Next<int (*)(int, const char *, struct stat64 *, int)>("fstatat64");
    const Call kind = (flags & AT_SYMLINK_NOFOLLOW) != 0 ? Call::Lstat : Call::Stat;
    FILEINDEX_TELL(kind, OfPathAt(kind, directory, path), int)
    return next(directory, path, info, flags);
}

int fstatat(int directory, const char *path, struct stat *info, int flags) __THROW {
    static const auto next = Next<int (*)(int, const char *, struct stat *, int)>("fstatat");
    const Call kind = (flags & AT_SYMLINK_NOFOLLOW) != 0 ? Call::Lstat : Call::Stat;
    FILEINDEX_TELL(kind, OfPathAt(kind, directory, path), int)
    return next(directory, path, info, flags);
}

int fstat(int fd, struct stat *info) __THROW {
    static const auto next = Next<int (*)(int, struct stat *)>("fstat");
    FILEINDEX_TELL(Call::Fstat, OfFd(Call::Fstat, fd), int)
    return next(fd, info);
}

int fstat64(int fd, struct stat64 *info) __THROW {
    static const auto next = Next<int (*)(int, struct stat64 *)>("fstat64");
    FILEINDEX_TELL(Call::Fstat, OfFd(Call::Fstat, fd), int)
    return next(fd, info);
}

char *realpath(const char *path, char *resolved) __THROW {
    static const auto next = Next<char *(*)(const char *, char *)>("realpath");
    if (IsActive(Call::Realpath)) {
        CallInfo info = OfPath(Call::Realpath, path);
        if (Enter(info)) {
            return nullptr;
        }
    }
    return next(path, resolved);
}

// What a fortified build calls instead of read, realpath, open and openat.
ssize_t __read_chk(int fd, void *buffer, size_t size, size_t room);
ssize_t __read_chk(int fd, void *buffer, size_t size, size_t) {
    return read(fd, buffer, size);
}

char *__realpath_chk(const char *path, char *resolved, size_t room) __THROW;
char *__realpath_chk(const char *path, char *resolved, size_t) __THROW {
    return realpath(path, resolved);
}

int __open_2(const char *path, int flags);
int __open_2(const char *path, int flags) {
    return open(path, flags);
}

int __open64_2(const char *path, int flags);
int __open64_2(const char *path, int flags) {
    return open64(path, flags);
}

int __openat_2(int directory, const char *path, int flags);
int __openat_2(int directory, const char *path, int flags) {
    return openat(directory, path, flags);
}

int __openat64_2(int directory, const char *path, int flags);
int __openat64_2(int directory, const char *path, int flags) {
    return openat64(directory, path, flags);
}

int socket(int domain, int type, int protocol) __THROW {
    static const auto next = Next<int (*)(int, int, int)>("socket");
    FILEINDEX_TELL(Call::Socket, OfPath(Call::Socket, "", type), int)
    return next(domain, type, protocol);
}

int connect(int fd, const sockaddr *address, socklen_t length) {
    static const auto next = Next<int (*)(int, const sockaddr *, socklen_t)>("connect");
    PollBefore();
    if (IsActive(Call::Connect)) {
        CallInfo info = OfFd(Call::Connect, fd, static_cast<long>(length));
        if (address != nullptr && address->sa_family == AF_UNIX) {
            info.path = reinterpret_cast<const sockaddr_un *>(address)->sun_path;
            info.data = address;
        }
        if (const auto result = Enter(info)) {
            return static_cast<int>(*result);
        }
    }
    return next(fd, address, length);
}

int setsockopt(int fd, int level, int name, const void *value, socklen_t length) __THROW {
    static const auto next = Next<int (*)(int, int, int, const void *, socklen_t)>("setsockopt");
    if (IsActive(Call::Setsockopt)) {
        CallInfo info = OfFd(Call::Setsockopt, fd, name);
        info.size = length;
        info.data = value;
        if (const auto result = Enter(info)) {
            return static_cast<int>(*result);
        }
    }
    return next(fd, level, name, value, length);
}

sighandler_t signal(int number, sighandler_t handler) __THROW {
    static const auto next = Next<sighandler_t (*)(int, sighandler_t)>("signal");
    if (IsActive(Call::Signal)) {
        CallInfo info = OfPath(Call::Signal, "", number);
        if (Enter(info)) {
            return SIG_ERR;
        }
    }
    return next(number, handler);
}

int usleep(useconds_t microseconds) {
    static const auto next = Next<int (*)(useconds_t)>("usleep");
    FILEINDEX_TELL(Call::Usleep, OfPath(Call::Usleep, "", static_cast<long>(microseconds)), int)
    return next(microseconds);
}

int rand(void) __THROW {
    static const auto next = Next<int (*)()>("rand");
    FILEINDEX_TELL(Call::Rand, OfPath(Call::Rand, ""), int)
    return next();
}

time_t time(time_t *out) __THROW {
    static const auto next = Next<time_t (*)(time_t *)>("time");
    if (IsActive(Call::Time)) {
        CallInfo info = OfPath(Call::Time, "");
        if (const auto result = Enter(info)) {
            if (out != nullptr) {
                *out = *result;
            }
            return *result;
        }
    }
    return next(out);
}

} // extern "C"
#pragma GCC visibility pop
