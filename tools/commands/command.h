#ifndef FILEINDEXCTL_COMMANDS_COMMAND_H
#define FILEINDEXCTL_COMMANDS_COMMAND_H

#include <CLI/CLI.hpp>
#include <functional>
#include <vector>

#include "terminal/messages.h"

namespace CTL {

using Action = std::function<ExitCode()>;

// A subcommand: `declare` adds its arguments to `app` and returns what it does once they are read.
struct Command {
    const char *name;
    const char *summary;
    Action (*declare)(CLI::App &app);
};

// Makes the table's commands subcommands of `app`, one of which must be chosen; the result runs it.
Action DeclareCommands(CLI::App &app, const std::vector<Command> &table);

// One file each, cmd_<name>.cpp.
Action DeclareAdd(CLI::App &app);
Action DeclareDoctor(CLI::App &app);
Action DeclareList(CLI::App &app);
Action DeclareMarks(CLI::App &app);
Action DeclareMigrate(CLI::App &app);
Action DeclarePause(CLI::App &app);
Action DeclareQuery(CLI::App &app);
Action DeclareReindex(CLI::App &app);
Action DeclareRemove(CLI::App &app);
Action DeclareResume(CLI::App &app);
Action DeclareSet(CLI::App &app);
Action DeclareShare(CLI::App &app);
Action DeclareShow(CLI::App &app);
Action DeclareStatus(CLI::App &app);
Action DeclareWatch(CLI::App &app);

} // namespace CTL

#endif
