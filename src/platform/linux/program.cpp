#include "program.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdarg>
#include <fcntl.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

#include "base/unique_fd.h"
#include "error.h"
#include "places.h"

namespace VANO::PLATFORM {

namespace {

using FILEINDEX::UniqueFd;

constexpr int kFirstFreeFd = STDERR_FILENO + 1;

// How a program is to be started, laid out before the supervisor is forked off: between fork and
// exec nothing may be allocated.
class SpawnPlan {
  public:
    explicit SpawnPlan(int outputFd) {
        ready_ = ::posix_spawn_file_actions_init(&actions_) == 0;
        if (!ready_) {
            return;
        }
        if (::posix_spawnattr_init(&attributes_) != 0) {
            ::posix_spawn_file_actions_destroy(&actions_);
            ready_ = false;
            return;
        }
        complete_ = AddActions(outputFd) && SetSignals();
    }
    SpawnPlan(const SpawnPlan &) = delete;
    SpawnPlan &operator=(const SpawnPlan &) = delete;
    ~SpawnPlan() {
        if (ready_) {
            ::posix_spawnattr_destroy(&attributes_);
            ::posix_spawn_file_actions_destroy(&actions_);
        }
    }

    [[nodiscard]] bool IsComplete() const { return complete_; }
    [[nodiscard]] bool Spawn(pid_t *pid, const char *path, const char *const *argv) const {
        return ::posix_spawn(pid, path, &actions_, &attributes_, const_cast<char *const *>(argv),
                             ::environ) == 0;
    }

  private:
    bool AddActions(int outputFd) {
        const int outputResult =
            outputFd >= 0 ? ::posix_spawn_file_actions_adddup2(&actions_, outputFd, STDOUT_FILENO)
                          : ::posix_spawn_file_actions_addopen(&actions_, STDOUT_FILENO,
                                                               kNullDevice, O_WRONLY, 0);
        return outputResult == 0 &&
               ::posix_spawn_file_actions_addopen(&actions_, STDIN_FILENO, kNullDevice, O_RDONLY,
                                                  0) == 0 &&
               ::posix_spawn_file_actions_addopen(&actions_, STDERR_FILENO, kNullDevice, O_WRONLY,
                                                  0) == 0 &&
               ::posix_spawn_file_actions_addclosefrom_np(&actions_, kFirstFreeFd) == 0;
    }
    bool SetSignals() {
        sigset_t none;
        sigset_t all;
        ::sigemptyset(&none);
        ::sigfillset(&all);
        return ::posix_spawnattr_setsigmask(&attributes_, &none) == 0 &&
               ::posix_spawnattr_setsigdefault(&attributes_, &all) == 0 &&
               ::posix_spawnattr_setflags(&attributes_,
                                          POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF) == 0;
    }

    posix_spawn_file_actions_t actions_{};
    posix_spawnattr_t attributes_{};
    bool ready_ = false;
    bool complete_ = false;
};

// Keeps every signal from the calling thread while it forks, so that none of the caller's handlers
// runs in the supervisor.
class BlockedSignals {
  public:
    BlockedSignals() {
        sigset_t all;
        ::sigfillset(&all);
        ::pthread_sigmask(SIG_SETMASK, &all, &old_);
    }
    BlockedSignals(const BlockedSignals &) = delete;
    BlockedSignals &operator=(const BlockedSignals &) = delete;
    ~BlockedSignals() { ::pthread_sigmask(SIG_SETMASK, &old_, nullptr); }

  private:
    sigset_t old_{};
};

struct Pipe {
    UniqueFd reader;
    UniqueFd writer;

    bool Open() {
        std::array<int, 2> ends{};
        if (::pipe2(ends.data(), O_CLOEXEC) != 0) {
            return false;
        }
        reader = UniqueFd(ends[0]);
        writer = UniqueFd(ends[1]);
        return true;
    }
};

pid_t WaitFor(pid_t pid, int *status) {
    pid_t waited = 0;
    do {
        waited = ::waitpid(pid, status, 0);
    } while (waited < 0 && errno == EINTR);
    return waited;
}

RunResult SpawnAndWait(const SpawnPlan &plan, const char *path, const char *const *argv,
                       bool wait) {
    pid_t pid = 0;
    if (!plan.Spawn(&pid, path, argv)) {
        return RunResult::kNoStart;
    }
    if (!wait) {
        return RunResult::kSuccess;
    }
    int status = 0;
    if (WaitFor(pid, &status) != pid) {
        return RunResult::kNoStart;
    }
    return WIFEXITED(status) && WEXITSTATUS(status) == 0 ? RunResult::kSuccess
                                                         : RunResult::kFailure;
}

// Closes all descriptors but the standard ones and `kept`, in which -1 stands for none.
void CloseAllBut(std::array<int, 2> kept) {
    std::sort(kept.begin(), kept.end());
    int next = kFirstFreeFd;
    for (const int fd : kept) {
        if (fd > next) {
            (void)::close_range(static_cast<unsigned>(next), static_cast<unsigned>(fd) - 1, 0);
        }
        next = std::max(next, fd + 1);
    }
    (void)::close_range(static_cast<unsigned>(next), ~0U, 0);
}

// The life of the process between the caller and the program: it alone is the program's parent, so
// the caller's SIGCHLD settings and wait loops cannot take the exit status away. Calls nothing that
// is unsafe after the fork of a process with threads.
[[noreturn]] void Supervise(const SpawnPlan &plan, const char *path, const char *const *argv,
                            bool wait, int resultFd, int outputFd) {
    (void)::signal(SIGCHLD, SIG_DFL);
    CloseAllBut({resultFd, outputFd}); // the caller's locks hang on its descriptors
    const RunResult result = SpawnAndWait(plan, path, argv, wait);
    const ssize_t written = ::write(resultFd, &result, sizeof result);
    ::_exit(written == sizeof result ? 0 : 1);
}

ssize_t ReadSome(int fd, void *buffer, std::size_t size) {
    ssize_t got = 0;
    do {
        got = ::read(fd, buffer, size);
    } while (got < 0 && errno == EINTR);
    return got;
}

// Reads to the end of file, so that the writer is never stopped by a full pipe.
void ReadOutput(std::string &output, int fd) {
    std::array<char, 4096> buffer;
    for (;;) {
        const ssize_t got = ReadSome(fd, buffer.data(), buffer.size());
        if (got <= 0) {
            return;
        }
        const std::size_t room = kMaxOutputBytes - output.size();
        output.append(buffer.data(), std::min(room, static_cast<std::size_t>(got)));
    }
}

RunResult RunSupervised(const char *path, const char *const *argv, bool wait, std::string *output) {
    Pipe resultPipe;
    Pipe outputPipe;
    if (!resultPipe.Open() || (output != nullptr && !outputPipe.Open())) {
        return RunResult::kNoStart;
    }
    const SpawnPlan plan(outputPipe.writer.Get());
    if (!plan.IsComplete()) {
        return RunResult::kNoStart;
    }
    pid_t supervisor = -1;
    {
        const BlockedSignals blocked;
        supervisor = ::fork();
        if (supervisor == 0) {
            Supervise(plan, path, argv, wait, resultPipe.writer.Get(), outputPipe.writer.Get());
        }
    }
    if (supervisor < 0) {
        return RunResult::kNoStart;
    }
    resultPipe.writer = UniqueFd();
    outputPipe.writer = UniqueFd();
    if (output != nullptr) {
        ReadOutput(*output, outputPipe.reader.Get());
    }
    RunResult result = RunResult::kNoStart;
    if (ReadSome(resultPipe.reader.Get(), &result, sizeof result) != sizeof result) {
        result = RunResult::kNoStart; // the supervisor was killed
    }
    (void)WaitFor(supervisor, nullptr); // somebody else may have reaped it
    return result;
}

std::vector<const char *> MakeVector(const char *path,
                                     std::initializer_list<const char *> arguments) {
    std::vector<const char *> argv{path};
    argv.insert(argv.end(), arguments);
    argv.push_back(nullptr);
    return argv;
}

int RecordResult(RunResult result) {
    switch (result) {
    case RunResult::kSuccess:
        return 0;
    case RunResult::kFailure:
        return PLATFORM_FAIL(kErrProgramFailed);
    case RunResult::kNoStart:
        break;
    }
    return PLATFORM_FAIL(kErrProgramStart);
}

} // namespace

RunResult Run(const char *path, const char *const *argv, bool wait) {
    return RunSupervised(path, argv, wait, nullptr);
}

RunResult Run(const char *path, std::initializer_list<const char *> arguments) {
    return Run(path, MakeVector(path, arguments).data(), true);
}

RunResult RunForOutput(std::string &output, const char *path,
                       std::initializer_list<const char *> arguments) {
    output.clear();
    return RunSupervised(path, MakeVector(path, arguments).data(), true, &output);
}

bool IsProgram(const char *path) {
    struct stat info {};
    return ::stat(path, &info) == 0 && S_ISREG(info.st_mode) && ::access(path, X_OK) == 0;
}

} // namespace VANO::PLATFORM

using namespace VANO::PLATFORM;

// The result is 0 or -1: without waiting 0 says that the program was started.
int VLIBCExecv(const char *path, const char *const *argv, int wait) {
    if (path == nullptr || *path == '\0' || argv == nullptr || argv[0] == nullptr) {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    return Guarded(-1, [&] { return RecordResult(Run(path, argv, wait != 0)); });
}

int VLIBCExec(const char *path, ...) {
    if (path == nullptr || *path == '\0') {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    va_list arguments;
    va_start(arguments, path);
    const int result = Guarded(-1, [&] {
        std::vector<const char *> argv{path};
        do {
            // NOLINTNEXTLINE(clang-analyzer-valist.Uninitialized): started before the lambda
            argv.push_back(va_arg(arguments, const char *));
        } while (argv.back() != nullptr);
        return RecordResult(Run(path, argv.data(), true));
    });
    va_end(arguments);
    return result;
}
