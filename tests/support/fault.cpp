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

// How a call looks in the trace: its name, and what stands behind its path.
enum class Detail { None, OtherPath, Size, Number };
struct Form {
    const char *name;
    Detail detail = Detail::None;
};
constexpr std::array<Form, kCallCount> kForms = {{{"chmod", Detail::Number},
                                                  {"close"},
                                                  {"connect"},
                                                  {"fallocate"},
                                                  {"fchmod", Detail::Number},
                                                  {"fchown"},
                                                  {"flock", Detail::Number},
                                                  {"fstat"},
                                                  {"fsync"},
                                                  {"ftruncate", Detail::Number},
                                                  {"lstat"},
                                                  {"mkdir", Detail::Number},
                                                  {"mkostemp"},
                                                  {"open", Detail::Number},
                                                  {"open_path", Detail::Number},
                                                  {"rand"},
                                                  {"read", Detail::Size},
                                                  {"realpath"},
                                                  {"rename", Detail::OtherPath},
                                                  {"setsockopt", Detail::Number},
                                                  {"signal", Detail::Number},
                                                  {"socket"},
                                                  {"stat"},
                                                  {"time"},
                                                  {"unlink"},
                                                  {"usleep", Detail::Number},
                                                  {"write", Detail::Size}}};

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

bool EndsWith(const std::string &text, const std::string &suffix) {
    return text.size() >= suffix.size() &&
           text.compare(text.size() - suffix.size(), suffix.size(), suffix) == 0;
}

} // namespace

std::string CallInfo::Text() const {
    const Form &form = kForms[Index(call)];
    std::string detail;
    switch (form.detail) {
    case Detail::None:
        break;
    case Detail::OtherPath:
        detail = otherPath;
        break;
    case Detail::Size:
        detail = std::to_string(size);
        break;
    case Detail::Number:
        detail = std::to_string(number);
        break;
    }
    const char *const separator = path.empty() || detail.empty() ? "" : ", ";
    return std::string(form.name) + "(" + path + separator + detail + ")";
}

std::string CallInfo::Name() const {
    return kForms[Index(call)].name;
}

void Fault::FailWhen(Call call, int error, std::function<bool(const CallInfo &)> isMeant) {
    SetHook(call, [error, isMeant = std::move(isMeant)](CallInfo &info) -> std::optional<long> {
        if (!isMeant(info)) {
            return std::nullopt;
        }
        errno = error;
        return -1;
    });
}

void Fault::Fail(Call call, int error, int nth) {
    FailWhen(call, error, [left = nth](const CallInfo &) mutable { return --left == 0; });
}

void Fault::FailAlways(Call call, int error) {
    FailWhen(call, error, [](const CallInfo &) { return true; });
}

void Fault::FailPath(Call call, const std::string &suffix, int error) {
    FailWhen(call, error, [suffix](const CallInfo &info) { return EndsWith(info.path, suffix); });
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

void Fault::Before(Call call, std::function<void(CallInfo &)> action) {
    SetHook(call, [action = std::move(action)](CallInfo &info) {
        action(info);
        return std::optional<long>();
    });
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

CallInfo OfFd(Call call, int fd, long number = 0, std::size_t size = 0,
              const void *data = nullptr) {
    CallInfo info{call, {}, {}};
    info.fd = fd;
    info.number = number;
    info.size = size;
    info.data = data;
    return info;
}

CallInfo OfRename(const char *from, const char *to) {
    CallInfo info = OfPath(Call::Rename, from);
    info.otherPath = to;
    return info;
}

CallInfo OfConnect(int fd, const sockaddr *address, socklen_t length) {
    CallInfo info = OfFd(Call::Connect, fd, static_cast<long>(length));
    if (address != nullptr && address->sa_family == AF_UNIX) {
        info.path = reinterpret_cast<const sockaddr_un *>(address)->sun_path;
        info.data = address;
    }
    return info;
}

Call KindOfOpen(int flags) {
    return (flags & O_PATH) != 0 ? Call::OpenPath : Call::Open;
}

Call KindOfStat(int flags) {
    return (flags & AT_SYMLINK_NOFOLLOW) != 0 ? Call::Lstat : Call::Stat;
}

// The mode that an open has only when it may make a file.
mode_t ModeOfOpen(int flags, va_list arguments) {
    return (flags & (O_CREAT | O_TMPFILE)) != 0 ? va_arg(arguments, mode_t) : 0;
}

// Before a call that others can see: what happened earlier is to stand earlier in the trace.
void PollBefore() {
    const int reason = errno;
    EventTrace::Get().Poll();
    errno = reason;
}

} // namespace

} // namespace VANO::TESTS

using namespace VANO::TESTS;

// Tells a hook of a call; `return` with its result when it has one, otherwise does what follows.
#define FILEINDEX_TELL(type, kind, description, afterwards)                                        \
    if (IsActive(kind)) {                                                                          \
        CallInfo told = description;                                                               \
        if (const auto result = Enter(told)) {                                                     \
            return static_cast<type>(*result);                                                     \
        }                                                                                          \
        afterwards;                                                                                \
    }

// A function as the C library's headers have it. `call` makes the call by `next`, the C library's.
#define FILEINDEX_FUNCTION(type, name, parameters, kind, description, call)                        \
    type name parameters {                                                                         \
        static const auto next = Next<decltype(&::name)>(#name);                                   \
        FILEINDEX_TELL(type, kind, description, (void)0)                                           \
        return call;                                                                               \
    }

#define FILEINDEX_OPEN(name, parameters, description, ...)                                         \
    int name parameters {                                                                          \
        static const auto next = Next<decltype(&::name)>(#name);                                   \
        va_list arguments;                                                                         \
        va_start(arguments, flags);                                                                \
        const mode_t mode = ModeOfOpen(flags, arguments);                                          \
        va_end(arguments);                                                                         \
        FILEINDEX_TELL(int, KindOfOpen(flags), description, (void)0)                               \
        return next(__VA_ARGS__, flags, mode);                                                     \
    }

// The calls that there are twice: with offsets of the usual width, and of 64 bits.
#define FILEINDEX_FILE_CALLS(bits, offset_type)                                                    \
    FILEINDEX_OPEN(open##bits, (const char *path, int flags, ...),                                 \
                   OfPath(KindOfOpen(flags), path, flags), path)                                   \
    FILEINDEX_OPEN(openat##bits, (int directory, const char *path, int flags, ...),                \
                   OfPathAt(KindOfOpen(flags), directory, path, flags), directory, path)           \
    FILEINDEX_FUNCTION(int, mkostemp##bits, (char *path, int flags), Call::Mkostemp,               \
                       OfPath(Call::Mkostemp, path, flags), next(path, flags))                     \
    FILEINDEX_FUNCTION(int, ftruncate##bits, (int fd, offset_type length)__THROW, Call::Ftruncate, \
                       OfFd(Call::Ftruncate, fd, length), next(fd, length))                        \
    FILEINDEX_FUNCTION(                                                                            \
        int, fallocate##bits, (int fd, int mode, offset_type offset, offset_type length),          \
        Call::Fallocate, OfFd(Call::Fallocate, fd, length), next(fd, mode, offset, length))        \
    FILEINDEX_FUNCTION(int, stat##bits, (const char *path, struct stat##bits *out)__THROW,         \
                       Call::Stat, OfPath(Call::Stat, path), next(path, out))                      \
    FILEINDEX_FUNCTION(int, lstat##bits, (const char *path, struct stat##bits *out)__THROW,        \
                       Call::Lstat, OfPath(Call::Lstat, path), next(path, out))                    \
    FILEINDEX_FUNCTION(int, fstat##bits, (int fd, struct stat##bits *out)__THROW, Call::Fstat,     \
                       OfFd(Call::Fstat, fd), next(fd, out))                                       \
    FILEINDEX_FUNCTION(                                                                            \
        int, fstatat##bits,                                                                        \
        (int directory, const char *path, struct stat##bits *out, int flags)__THROW,               \
        KindOfStat(flags), OfPathAt(KindOfStat(flags), directory, path),                           \
        next(directory, path, out, flags))

#pragma GCC visibility push(default)
extern "C" {

FILEINDEX_FILE_CALLS(, off_t)
FILEINDEX_FILE_CALLS(64, off64_t)

FILEINDEX_FUNCTION(int, close, (int fd), Call::Close, OfFd(Call::Close, fd), next(fd))
FILEINDEX_FUNCTION(int, fsync, (int fd), Call::Fsync, OfFd(Call::Fsync, fd), next(fd))
FILEINDEX_FUNCTION(int, flock, (int fd, int operation)__THROW, Call::Flock,
                   OfFd(Call::Flock, fd, operation), next(fd, operation))
FILEINDEX_FUNCTION(int, chmod, (const char *path, mode_t mode)__THROW, Call::Chmod,
                   OfPath(Call::Chmod, path, mode), next(path, mode))
FILEINDEX_FUNCTION(int, fchmod, (int fd, mode_t mode)__THROW, Call::Fchmod,
                   OfFd(Call::Fchmod, fd, mode), next(fd, mode))
FILEINDEX_FUNCTION(int, fchown, (int fd, uid_t owner, gid_t group)__THROW, Call::Fchown,
                   OfFd(Call::Fchown, fd, owner), next(fd, owner, group))
FILEINDEX_FUNCTION(int, mkdir, (const char *path, mode_t mode)__THROW, Call::Mkdir,
                   OfPath(Call::Mkdir, path, mode), next(path, mode))
FILEINDEX_FUNCTION(int, mkdirat, (int directory, const char *path, mode_t mode)__THROW, Call::Mkdir,
                   OfPathAt(Call::Mkdir, directory, path, mode), next(directory, path, mode))
FILEINDEX_FUNCTION(int, unlink, (const char *path)__THROW, Call::Unlink, OfPath(Call::Unlink, path),
                   next(path))
FILEINDEX_FUNCTION(int, rename, (const char *from, const char *to)__THROW, Call::Rename,
                   OfRename(from, to), (PollBefore(), next(from, to)))
FILEINDEX_FUNCTION(int, socket, (int domain, int kind, int protocol)__THROW, Call::Socket,
                   OfPath(Call::Socket, "", kind), next(domain, kind, protocol))
FILEINDEX_FUNCTION(int, connect, (int fd, const sockaddr *address, socklen_t length), Call::Connect,
                   OfConnect(fd, address, length), (PollBefore(), next(fd, address, length)))
FILEINDEX_FUNCTION(int, setsockopt,
                   (int fd, int level, int name, const void *value, socklen_t length)__THROW,
                   Call::Setsockopt, OfFd(Call::Setsockopt, fd, name, length, value),
                   next(fd, level, name, value, length))
FILEINDEX_FUNCTION(int, usleep, (useconds_t microseconds), Call::Usleep,
                   OfPath(Call::Usleep, "", static_cast<long>(microseconds)), next(microseconds))
FILEINDEX_FUNCTION(int, rand, () __THROW, Call::Rand, OfPath(Call::Rand, ""), next())

ssize_t read(int fd, void *buffer, size_t size) {
    static const auto next = Next<decltype(&::read)>("read");
    FILEINDEX_TELL(ssize_t, Call::Read, OfFd(Call::Read, fd, 0, size), size = told.size)
    return next(fd, buffer, size);
}

ssize_t write(int fd, const void *buffer, size_t size) {
    static const auto next = Next<decltype(&::write)>("write");
    FILEINDEX_TELL(ssize_t, Call::Write, OfFd(Call::Write, fd, 0, size, buffer), size = told.size)
    return next(fd, buffer, size);
}

char *realpath(const char *path, char *resolved) __THROW {
    static const auto next = Next<decltype(&::realpath)>("realpath");
    CallInfo info = OfPath(Call::Realpath, path);
    return IsActive(Call::Realpath) && Enter(info) ? nullptr : next(path, resolved);
}

sighandler_t signal(int number, sighandler_t handler) __THROW {
    static const auto next = Next<decltype(&::signal)>("signal");
    CallInfo info = OfPath(Call::Signal, "", number);
    return IsActive(Call::Signal) && Enter(info) ? SIG_ERR : next(number, handler);
}

time_t time(time_t *out) __THROW {
    static const auto next = Next<decltype(&::time)>("time");
    CallInfo info = OfPath(Call::Time, "");
    const auto result = IsActive(Call::Time) ? Enter(info) : std::nullopt;
    if (result && out != nullptr) {
        *out = *result;
    }
    return result ? *result : next(out);
}

// What a fortified build calls instead of read, realpath, open and openat.
ssize_t __read_chk(int fd, void *buffer, size_t size, size_t) {
    return read(fd, buffer, size);
}
char *__realpath_chk(const char *path, char *resolved, size_t) __THROW {
    return realpath(path, resolved);
}
int __open_2(const char *path, int flags) {
    return open(path, flags);
}
int __open64_2(const char *path, int flags) {
    return open64(path, flags);
}
int __openat_2(int directory, const char *path, int flags) {
    return openat(directory, path, flags);
}
int __openat64_2(int directory, const char *path, int flags) {
    return openat64(directory, path, flags);
}

} // extern "C"
#pragma GCC visibility pop
