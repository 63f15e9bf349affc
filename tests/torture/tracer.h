#ifndef FILEINDEX_TORTURE_TRACER_H
#define FILEINDEX_TORTURE_TRACER_H

// Runs an operation in a process of its own and meets every system call that it makes, also those
// of the processes it forks, up to the point where they run another program.
//
//     RunTraced([] { WatchBegins(); operation(); WatchEnds(); aftermath(); }, hooks, limit);
//
// Only x86-64 is known; CanTrace() says whether it works here.

#include <array>
#include <chrono>
#include <cstdint>
#include <functional>
#include <string>
#include <sys/types.h>

namespace VANO::TORTURE {

struct SystemCall {
    pid_t pid = 0;
    int process = 0; // 0 is the caller, 1 the first process that it forked, ...
    int index = 0;   // in that process, from 0
    long number = 0;
    int nth = 0; // of that number in that process, from 0
    std::array<std::uint64_t, 6> arguments{};
};

enum class Action {
    kPass,
    kFail,      // does not happen; `error` is its result
    kFailAfter, // happens, and `error` is its result all the same
    kShorten,   // a read or write of half as many bytes
    kKill,      // SIGKILL in its place
};

struct Decision {
    Action action = Action::kPass;
    int error = 0;
    bool last = false; // watch no further, let everything run freely
};

struct Hooks {
    std::function<Decision(const SystemCall &)> onEntry;
    // Not called for calls that did not happen. May be empty.
    std::function<void(const SystemCall &, long result)> onExit;
};

struct Ending {
    int status = 0; // of the caller, as waitpid() gives it
    bool hung = false;
};

// Returns when the caller and all that came of it have ended. What is still there at the limit is
// killed.
Ending RunTraced(const std::function<void()> &body, const Hooks &hooks,
                 std::chrono::milliseconds limit);

// The same without watching.
Ending RunForked(const std::function<void()> &body, std::chrono::milliseconds limit);

// To be called by the body, around what is to be watched.
void WatchBegins();
void WatchEnds();

bool CanTrace();

// Of a process that is stopped in a call.
std::string ReadString(pid_t pid, std::uint64_t address);
std::string ReadBytes(pid_t pid, std::uint64_t address, std::size_t size);
std::string PathOfFd(pid_t pid, int fd);

} // namespace VANO::TORTURE

#endif
