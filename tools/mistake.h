#ifndef FILEINDEXCTL_MISTAKE_H
#define FILEINDEXCTL_MISTAKE_H

#include <CLI/CLI.hpp>

#include "command.h"

namespace CTL {

// Says what is wrong with the call, what may have been meant, and where the help is.
ExitCode SayMistake(const CLI::App &app, const CLI::ParseError &mistake);

} // namespace CTL

#endif
