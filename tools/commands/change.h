#ifndef FILEINDEXCTL_COMMANDS_CHANGE_H
#define FILEINDEXCTL_COMMANDS_CHANGE_H

#include <json/value.h>
#include <string>

#include "commands/command.h"
#include "terminal/output.h"

namespace CTL {

// What the commands that change something have in common: --dry-run, and an answer in JSON.
struct Change {
    bool isDryRun = false;
    JsonMode json = JsonMode::kOff;
    Json::Value facts{Json::objectValue}; // of the answer: "paths", "shares", "resume_time"

    // Of a dry run: prints "Would " and what would be done, unless the answer is JSON.
    void Would(const std::string &what) const;
};

// Adds --dry-run, --json and -j, which write to `change`. The result does `act`, and then prints,
// if it was asked for, the facts with
//   "command"  the command's name, such as "share rename"
//   "done"     whether it was done, which a dry run never is
//   "dry_run"  whether it was one
// `change` must live as long as `act`.
[[nodiscard]] Action MakeChange(CLI::App &app, Change &change, Action act);

} // namespace CTL

#endif
