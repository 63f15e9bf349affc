#ifndef FILEINDEXCTL_COMMANDS_FOLDER_REQUEST_H
#define FILEINDEXCTL_COMMANDS_FOLDER_REQUEST_H

#include <json/value.h>
#include <string>
#include <vector>

#include "commands/change.h"
#include "commands/command.h"

// A request that adds or changes folders: an array of folder objects with the members to change.

namespace CTL {

// The same members for each of the folders.
[[nodiscard]] Json::Value RequestFor(const std::vector<std::string> &paths,
                                     const Json::Value &members);

struct Wording {
    const char *attempt; // "Cannot add"
    const char *done;    // "Added"
};

// Saves it and says so, and which of the folders cannot be indexed as they are. A dry run tells
// what that would change, and fails where it would fail for the request itself.
[[nodiscard]] ExitCode Apply(Change &change, const Json::Value &request, const Wording &wording);

} // namespace CTL

#endif
