#ifndef FILEINDEXCTL_FOLDER_REQUEST_H
#define FILEINDEXCTL_FOLDER_REQUEST_H

#include <json/value.h>
#include <string>
#include <vector>

#include "command.h"

// A request that adds or changes folders: an array of folder objects with the members to change.

namespace CTL {

// The same members for each of the folders.
[[nodiscard]] Json::Value RequestFor(const std::vector<std::string> &paths,
                                     const Json::Value &members);

struct Wording {
    const char *attempt; // "Cannot add"
    const char *done;    // "Added"
};

// Saves it and says so, and which of the folders cannot be indexed as they are.
[[nodiscard]] ExitCode Save(const Json::Value &request, const Wording &wording);

// Prints what Save() would change; fails where that would fail for the request itself.
[[nodiscard]] ExitCode Preview(const Json::Value &request, const Wording &wording);

} // namespace CTL

#endif
