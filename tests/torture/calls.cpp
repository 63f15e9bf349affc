#include "calls.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/syscall.h>

namespace VANO::TORTURE {

namespace {

using Errors = std::vector<int>;

struct CallKind {
    long number;
    const char *name;
    Errors errors;
    int pathArgument = -1; // -1: the first argument is a descriptor; -2: neither
    bool canBeShort = false;
    bool failsAfter = false; // it has happened even when it reports an error
};

constexpr int kNoFile = -2;

const Errors kLook = {EACCES, EIO};
const Errors kOpen = {EACCES, EIO, EMFILE, EINTR};
const Errors kMake = {ENOSPC, EDQUOT, EROFS};
const Errors kChangeDirectory = {EACCES, EROFS, EIO, ENOSPC, EDQUOT};
const Errors kChangeFile = {EIO, ENOSPC, EDQUOT, EROFS, EINTR};
const Errors kChangeMode = {EACCES, EROFS, EIO, EDQUOT};
const Errors kRead = {EIO, EINTR, EAGAIN};
const Errors kWrite = {EIO, ENOSPC, EDQUOT, EINTR, EAGAIN};
const Errors kLock = {EAGAIN, EINTR, EIO};
const Errors kNewDescriptor = {EMFILE, EACCES};
const Errors kTalk = {EINTR, EAGAIN, EACCES, EIO};
const Errors kNewProcess = {EAGAIN};
const Errors kMemory = {ENOMEM};
const Errors kNever = {};

const std::vector<CallKind> &Kinds() {
    static const std::vector<CallKind> kinds = {
        {SYS_open, "open", kOpen, 0},
        {SYS_openat, "openat", kOpen, 1},
        {SYS_creat, "creat", kOpen, 0},
        {SYS_stat, "stat", kLook, 0},
        {SYS_lstat, "lstat", kLook, 0},
        {SYS_fstat, "fstat", kLook},
        {SYS_newfstatat, "newfstatat", kLook, 1},
        {SYS_statx, "statx", kLook, 1},
        {SYS_access, "access", kLook, 0},
        {SYS_faccessat, "faccessat", kLook, 1},
        {SYS_faccessat2, "faccessat2", kLook, 1},
        {SYS_readlink, "readlink", kLook, 0},
        {SYS_readlinkat, "readlinkat", kLook, 1},
        {SYS_getcwd, "getcwd", kLook, kNoFile},
        {SYS_getdents64, "getdents64", kLook},
        {SYS_statfs, "statfs", {EACCES, EIO, EINTR}, 0},
        {SYS_fstatfs, "fstatfs", {EIO, EINTR}},
        {SYS_quotactl, "quotactl", kLook, kNoFile},
        {SYS_quotactl_fd, "quotactl_fd", kLook},
        {SYS_read, "read", kRead, -1, true},
        {SYS_pread64, "pread64", kRead, -1, true},
        {SYS_write, "write", kWrite, -1, true},
        {SYS_pwrite64, "pwrite64", kWrite, -1, true},
        {SYS_fsync, "fsync", {EIO, ENOSPC, EDQUOT, EINTR}},
        {SYS_fdatasync, "fdatasync", {EIO, ENOSPC, EDQUOT, EINTR}},
        {SYS_ftruncate, "ftruncate", kChangeFile},
        {SYS_fallocate, "fallocate", kChangeFile},
        {SYS_lseek, "lseek", {EIO}},
        {SYS_rename, "rename", kChangeDirectory, 0},
        {SYS_renameat, "renameat", kChangeDirectory, 1},
        {SYS_renameat2, "renameat2", kChangeDirectory, 1},
        {SYS_unlink, "unlink", {EACCES, EROFS, EIO}, 0},
        {SYS_unlinkat, "unlinkat", {EACCES, EROFS, EIO}, 1},
        {SYS_mkdir, "mkdir", kChangeDirectory, 0},
        {SYS_mkdirat, "mkdirat", kChangeDirectory, 1},
        {SYS_chmod, "chmod", kChangeMode, 0},
        {SYS_fchmod, "fchmod", kChangeMode},
        {SYS_fchmodat, "fchmodat", kChangeMode, 1},
        {SYS_fchown, "fchown", kChangeMode},
        {SYS_flock, "flock", kLock},
        {SYS_fcntl, "fcntl", {EMFILE, EACCES}},
        {SYS_dup2, "dup2", {EMFILE, EINTR}},
        {SYS_dup3, "dup3", {EMFILE, EINTR}},
        // The descriptor is gone whatever the call says.
        {SYS_close, "close", {EIO, EINTR, ENOSPC, EDQUOT}, -1, false, true},
        {SYS_close_range, "close_range", {EMFILE}, kNoFile},
        {SYS_socket, "socket", kNewDescriptor, kNoFile},
        {SYS_connect, "connect", kTalk},
        {SYS_setsockopt, "setsockopt", {EACCES, EIO}},
        {SYS_sendto, "sendto", kTalk},
        {SYS_sendmsg, "sendmsg", kTalk},
        {SYS_recvfrom, "recvfrom", kRead},
        {SYS_pipe2, "pipe2", {EMFILE}, kNoFile},
        {SYS_fork, "fork", kNewProcess, kNoFile},
        {SYS_vfork, "vfork", kNewProcess, kNoFile},
        {SYS_clone, "clone", kNewProcess, kNoFile},
        {SYS_clone3, "clone3", kNewProcess, kNoFile},
        {SYS_execve, "execve", {EACCES, EIO, EMFILE}, 0},
        {SYS_wait4, "wait4", {EINTR}, kNoFile},
        {SYS_getrandom, "getrandom", {EINTR, EAGAIN}, kNoFile},
        {SYS_clock_nanosleep, "clock_nanosleep", {EINTR}, kNoFile},
        {SYS_nanosleep, "nanosleep", {EINTR}, kNoFile},
        {SYS_mmap, "mmap", kMemory, kNoFile},
        {SYS_mremap, "mremap", kMemory, kNoFile},
        {SYS_brk, "brk", kMemory, kNoFile},
        // Nothing that the machine could do makes these fail with the arguments they get.
        {SYS_munmap, "munmap", kNever, kNoFile},
        {SYS_mprotect, "mprotect", kNever, kNoFile},
        {SYS_madvise, "madvise", kNever, kNoFile},
        {SYS_futex, "futex", kNever, kNoFile},
        {SYS_rt_sigaction, "rt_sigaction", kNever, kNoFile},
        {SYS_rt_sigprocmask, "rt_sigprocmask", kNever, kNoFile},
        {SYS_rt_sigreturn, "rt_sigreturn", kNever, kNoFile},
        {SYS_restart_syscall, "restart_syscall", kNever, kNoFile},
        {SYS_getpid, "getpid", kNever, kNoFile},
        {SYS_gettid, "gettid", kNever, kNoFile},
        {SYS_getppid, "getppid", kNever, kNoFile},
        {SYS_getuid, "getuid", kNever, kNoFile},
        {SYS_geteuid, "geteuid", kNever, kNoFile},
        {SYS_time, "time", kNever, kNoFile},
        {SYS_clock_gettime, "clock_gettime", kNever, kNoFile},
        {SYS_set_robust_list, "set_robust_list", kNever, kNoFile},
        {SYS_rseq, "rseq", kNever, kNoFile},
        {SYS_exit, "exit", kNever, kNoFile},
        {SYS_exit_group, "exit_group", kNever, kNoFile},
    };
    return kinds;
}

// A call that nobody thought of can fail too, and does.
const CallKind &KindOf(const SystemCall &call) {
    static const CallKind unknown = {-1, nullptr, {EIO}, kNoFile};
    const auto &kinds = Kinds();
    const auto found = std::find_if(kinds.begin(), kinds.end(), [&](const CallKind &kind) {
        return kind.number == call.number;
    });
    return found == kinds.end() ? unknown : *found;
}

bool MakesFile(const SystemCall &call) {
    const std::uint64_t flags = call.number == SYS_openat ? call.arguments[2]
                                : call.number == SYS_open ? call.arguments[1]
                                                          : 0;
    return (flags & O_CREAT) != 0;
}

} // namespace

std::vector<CallFault> FaultsOf(const SystemCall &call) {
    const CallKind &kind = KindOf(call);
    std::vector<CallFault> faults;
    const Action action = kind.failsAfter ? Action::kFailAfter : Action::kFail;
    for (const int error : kind.errors) {
        faults.push_back({action, error});
    }
    if (MakesFile(call)) {
        for (const int error : kMake) {
            faults.push_back({action, error});
        }
    }
    if (kind.canBeShort && call.arguments[2] > 1) {
        faults.push_back({Action::kShorten, 0});
    }
    return faults;
}

bool IsOneOf(const SystemCall &call, std::initializer_list<long> numbers) {
    return std::find(numbers.begin(), numbers.end(), call.number) != numbers.end();
}

std::string NameOf(const SystemCall &call) {
    const char *name = KindOf(call).name;
    return name != nullptr ? name : "#" + std::to_string(call.number);
}

std::string NameOf(const CallFault &fault) {
    return fault.action == Action::kShorten ? "short" : ::strerrorname_np(fault.error);
}

std::string SubjectOf(const SystemCall &call) {
    const int argument = KindOf(call).pathArgument;
    if (argument == kNoFile) {
        return "";
    }
    return argument < 0 ? PathOfFd(call.pid, static_cast<int>(call.arguments[0]))
                        : ReadString(call.pid, call.arguments[static_cast<std::size_t>(argument)]);
}

} // namespace VANO::TORTURE
