#ifndef VANO_PLATFORM_PROGRAM_H
#define VANO_PLATFORM_PROGRAM_H

#include <initializer_list>
#include <string>

namespace VANO::PLATFORM {

// How the run of a program ended.
enum class RunResult {
    kSuccess, // exited with 0; when it was not waited for: started
    kFailure, // was killed or exited with another status
    kNoStart, // could not be started, or its end could not be learned
};

// Runs the program at `path` with a null-terminated argument vector, without a shell. It gets the
// caller's environment and working directory, no descriptor but standard input, output and error,
// all three on /dev/null, an empty signal mask and every signal's default disposition.
//
// The call does not depend on what the caller does with SIGCHLD: its children may be reaped by the
// kernel or by a wait loop of its own. A program that is not waited for becomes init's child and
// leaves no zombie.
RunResult Run(const char *path, const char *const *argv, bool wait);

// Runs a program and waits for it. `arguments` do not include the program's own name.
RunResult Run(const char *path, std::initializer_list<const char *> arguments);

// The same, with what it wrote to standard output, of which at most `kMaxOutputBytes` are kept.
constexpr std::size_t kMaxOutputBytes = std::size_t{64} * 1024;
RunResult RunForOutput(std::string &output, const char *path,
                       std::initializer_list<const char *> arguments);

// Whether there is a program to run at `path`.
bool IsProgram(const char *path);

} // namespace VANO::PLATFORM

#endif
