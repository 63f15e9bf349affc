#ifndef FILEINDEXCTL_TERMINAL_MISTAKE_H
#define FILEINDEXCTL_TERMINAL_MISTAKE_H

#include <CLI/CLI.hpp>

#include "terminal/messages.h"

namespace CTL {

// Whether a word stands where a command was to stand; even with --help it is a mistake.
[[nodiscard]] bool IsCommandUnknown(const CLI::App &app);

// Says what is wrong with the call, what may have been meant, and where the help is.
ExitCode SayMistake(const CLI::App &app, const CLI::ParseError &mistake);

} // namespace CTL

#endif
