#include "tracer.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstddef>
#include <map>
#include <sys/prctl.h>
#include <sys/ptrace.h>
#include <sys/syscall.h>
#include <sys/time.h>
#include <sys/uio.h>
#include <sys/user.h>
#include <sys/wait.h>
#include <system_error>
#include <unistd.h>

namespace VANO::TORTURE {

namespace {

// No system call has this number; the kernel refuses it and nobody minds.
constexpr long kMarker = 100000;
constexpr std::uint64_t kBegin = 1;
constexpr std::uint64_t kEnd = 2;

constexpr int kSyscallStop = SIGTRAP | 0x80;
constexpr long kOptions = PTRACE_O_TRACESYSGOOD | PTRACE_O_TRACEFORK | PTRACE_O_TRACEVFORK |
                          PTRACE_O_TRACECLONE | PTRACE_O_TRACEEXEC | PTRACE_O_EXITKILL;

[[noreturn]] void Fail(const char *what) {
    throw std::system_error(errno, std::generic_category(), what);
}

// Lets the kernel interrupt waitpid() at the limit.
class TimeLimit {
  public:
    explicit TimeLimit(std::chrono::milliseconds limit) {
        struct sigaction action {};
        action.sa_handler = [](int) {};
        ::sigaction(SIGALRM, &action, &old_);
        const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(limit);
        itimerval timer{};
        timer.it_value.tv_sec = seconds.count();
        timer.it_value.tv_usec = std::chrono::microseconds(limit - seconds).count();
        timer.it_interval.tv_usec = 100000; // in case that the first came between two waits
        ::setitimer(ITIMER_REAL, &timer, nullptr);
    }
    TimeLimit(const TimeLimit &) = delete;
    TimeLimit &operator=(const TimeLimit &) = delete;
    ~TimeLimit() {
        const itimerval none{};
        ::setitimer(ITIMER_REAL, &none, nullptr);
        ::sigaction(SIGALRM, &old_, nullptr);
    }

  private:
    struct sigaction old_ {};
};

pid_t Fork(const std::function<void()> &body, bool traced) {
    // What the caller leaves behind comes to this process, to be waited for.
    ::prctl(PR_SET_CHILD_SUBREAPER, 1);
    const pid_t pid = ::fork();
    if (pid < 0) {
        Fail("fork");
    }
    if (pid != 0) {
        (void)::setpgid(pid, pid);
        return pid;
    }
    (void)::setpgid(0, 0);
    ::prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (traced) {
        ::ptrace(PTRACE_TRACEME, 0, nullptr, nullptr);
        (void)::raise(SIGSTOP);
    }
    body();
    ::_exit(0);
}

struct Process {
    int ordinal = 0;
    int calls = 0;
    std::map<long, int> callsByNumber;
    bool watched = false; // between the two marks, or born there
    SystemCall current;
    Decision decision;
};

class Tracer {
  public:
    Tracer(pid_t caller, const Hooks &hooks) : caller_(caller), hooks_(hooks) {}

    Ending Run() {
        Ending ending;
        int status = 0;
        for (;;) {
            const pid_t pid = ::waitpid(-caller_, &status, __WALL);
            if (pid < 0 && errno == EINTR) {
                ending.hung = true;
                (void)::kill(-caller_, SIGKILL);
                continue;
            }
            if (pid < 0) {
                return ending; // nobody is left
            }
            if (WIFEXITED(status) || WIFSIGNALED(status)) {
                ending.status = pid == caller_ ? status : ending.status;
                processes_.erase(pid);
            } else if (WIFSTOPPED(status)) {
                OnStop(pid, status);
            }
        }
    }

  private:
    void OnStop(pid_t pid, int status) {
        const bool isNew = processes_.count(pid) == 0;
        if (isNew) {
            Process &process = processes_[pid];
            process.ordinal = static_cast<int>(seen_++);
            process.watched = pid != caller_;
            ::ptrace(PTRACE_SETOPTIONS, pid, nullptr, kOptions);
        }
        const int signal = WSTOPSIG(status);
        const int event = status >> 16;
        if (event == PTRACE_EVENT_EXEC || free_) {
            const bool isOwn = signal == kSyscallStop || event != 0 || isNew;
            if (signal == kSyscallStop) {
                OnSyscallStop(pid); // a result may still have to be put in place
            }
            LetGo(pid, isOwn ? 0 : signal);
            return;
        }
        if (signal == kSyscallStop) {
            OnSyscallStop(pid);
            if (processes_.count(pid) != 0) {
                Continue(pid, 0);
            }
            return;
        }
        Continue(pid, isNew || event != 0 ? 0 : signal);
    }

    static void Continue(pid_t pid, int signal) {
        ::ptrace(PTRACE_SYSCALL, pid, nullptr, static_cast<long>(signal));
    }

    void LetGo(pid_t pid, int signal) {
        ::ptrace(PTRACE_DETACH, pid, nullptr, static_cast<long>(signal));
        processes_.erase(pid);
    }

    void OnSyscallStop(pid_t pid) {
        __ptrace_syscall_info info{};
        if (::ptrace(PTRACE_GET_SYSCALL_INFO, pid, sizeof(info), &info) <= 0) {
            return; // killed meanwhile
        }
        Process &process = processes_[pid];
        if (info.op == PTRACE_SYSCALL_INFO_ENTRY) {
            OnEntry(pid, process, info);
        } else if (info.op == PTRACE_SYSCALL_INFO_EXIT) {
            OnExit(pid, process, info.exit.rval);
        }
    }

    void OnEntry(pid_t pid, Process &process, const __ptrace_syscall_info &info) {
        process.decision = Decision{};
        if (info.entry.nr == static_cast<std::uint64_t>(kMarker)) {
            process.watched = info.entry.args[0] == kBegin;
            free_ = info.entry.args[0] == kEnd;
            process.current.number = kMarker;
            return;
        }
        if (!process.watched || free_) {
            process.current.number = kMarker;
            return;
        }
        SystemCall &call = process.current;
        call.pid = pid;
        call.process = process.ordinal;
        call.index = process.calls++;
        call.number = static_cast<long>(info.entry.nr);
        call.nth = process.callsByNumber[call.number]++;
        std::copy(std::begin(info.entry.args), std::end(info.entry.args), call.arguments.begin());
        process.decision = hooks_.onEntry(call);
        Apply(pid, process);
    }

    void Apply(pid_t pid, const Process &process) {
        switch (process.decision.action) {
        case Action::kFail:
            if (process.current.number == SYS_brk) {
                Poke(pid, offsetof(user_regs_struct, rdi), 0); // refused: the break as it was
            } else {
                Poke(pid, offsetof(user_regs_struct, orig_rax), -1);
            }
            break;
        case Action::kShorten:
            Poke(pid, offsetof(user_regs_struct, rdx),
                 static_cast<long>((process.current.arguments[2] + 1) / 2));
            break;
        case Action::kKill:
            (void)::kill(pid, SIGKILL);
            break;
        default:
            break;
        }
        free_ = free_ || process.decision.last;
    }

    void OnExit(pid_t pid, Process &process, long result) {
        if (process.current.number == kMarker) {
            return;
        }
        const Action action = process.decision.action;
        const SystemCall &call = process.current;
        if (action != Action::kFail && hooks_.onExit) {
            hooks_.onExit(call, result);
        }
        if (action == Action::kShorten || (action == Action::kFail && call.number == SYS_brk)) {
            // A call leaves its arguments' registers alone.
            Poke(pid, offsetof(user_regs_struct, rdi), static_cast<long>(call.arguments[0]));
            Poke(pid, offsetof(user_regs_struct, rdx), static_cast<long>(call.arguments[2]));
        } else if (action == Action::kFail || action == Action::kFailAfter) {
            Poke(pid, offsetof(user_regs_struct, rax), -process.decision.error);
        }
        process.decision = Decision{};
    }

    static void Poke(pid_t pid, std::size_t where, long value) {
        ::ptrace(PTRACE_POKEUSER, pid, where, value);
    }

    pid_t caller_;
    const Hooks &hooks_;
    std::map<pid_t, Process> processes_;
    unsigned seen_ = 0;
    bool free_ = false;
};

} // namespace

Ending RunTraced(const std::function<void()> &body, const Hooks &hooks,
                 std::chrono::milliseconds limit) {
    const TimeLimit timeLimit(limit);
    return Tracer(Fork(body, true), hooks).Run();
}

Ending RunForked(const std::function<void()> &body, std::chrono::milliseconds limit) {
    const TimeLimit timeLimit(limit);
    const Hooks none;
    return Tracer(Fork(body, false), none).Run();
}

void WatchBegins() {
    (void)::syscall(kMarker, kBegin);
}

void WatchEnds() {
    (void)::syscall(kMarker, kEnd);
}

bool CanTrace() {
#ifdef __x86_64__
    int calls = 0;
    std::map<long, int> callsByNumber;
    Hooks hooks;
    hooks.onEntry = [&](const SystemCall &) {
        ++calls;
        return Decision{};
    };
    const auto body = [] {
        WatchBegins();
        (void)::syscall(SYS_getppid);
        WatchEnds();
    };
    return !RunTraced(body, hooks, std::chrono::seconds(5)).hung && calls == 1;
#else
    return false;
#endif
}

std::string ReadBytes(pid_t pid, std::uint64_t address, std::size_t size) {
    std::string bytes(size, '\0');
    const iovec here{bytes.data(), bytes.size()};
    const iovec there{reinterpret_cast<void *>(address), size};
    const ssize_t got = ::process_vm_readv(pid, &here, 1, &there, 1, 0);
    bytes.resize(got > 0 ? static_cast<std::size_t>(got) : 0);
    return bytes;
}

// A read must not reach into a page that is not there.
std::string ReadString(pid_t pid, std::uint64_t address) {
    constexpr std::uint64_t kPage = 4096;
    std::string text;
    while (text.size() < PATH_MAX) {
        const std::string piece = ReadBytes(pid, address, kPage - address % kPage);
        const std::size_t end = piece.find('\0');
        text.append(piece, 0, end);
        if (end != std::string::npos || piece.empty()) {
            break;
        }
        address += piece.size();
    }
    return text;
}

std::string PathOfFd(pid_t pid, int fd) {
    const std::string link = "/proc/" + std::to_string(pid) + "/fd/" + std::to_string(fd);
    std::array<char, PATH_MAX> target{};
    const ssize_t length = ::readlink(link.c_str(), target.data(), target.size());
    return length > 0 ? std::string(target.data(), static_cast<std::size_t>(length)) : "";
}

} // namespace VANO::TORTURE
