#ifndef FILEINDEXCTL_COMMANDS_SHARE_COMMANDS_H
#define FILEINDEXCTL_COMMANDS_SHARE_COMMANDS_H

#include <string>

#include "commands/command.h"

// The commands beneath `fileindexctl share`, one file a subject.

namespace CTL {

Action DeclareShareList(CLI::App &app);
Action DeclareSharePause(CLI::App &app);
Action DeclareShareResume(CLI::App &app);
Action DeclareShareRemove(CLI::App &app);
Action DeclareShareRename(CLI::App &app);
Action DeclareShareClean(CLI::App &app);
Action DeclareShareNoSpace(CLI::App &app);
Action DeclareShareNeedReindex(CLI::App &app);

// A required positional argument that names a share, as names stand in paths.
void AddShareTo(CLI::App &app, const char *label, std::string &share, const char *description);

// Answers that there is no such share.
ExitCode SayNoShare(const std::string &share);

} // namespace CTL

#endif
