#ifndef FILEINDEXCTL_STATE_KNOWN_SHARES_H
#define FILEINDEXCTL_STATE_KNOWN_SHARES_H

#include <fileindex/folder.h>
#include <json/value.h>
#include <set>
#include <string>
#include <vector>

namespace CTL {

// Where a share lies; empty when no share has that name. The last errors are cleared.
[[nodiscard]] std::string DirectoryOfShare(const std::string &name);

// The one spelling of a share's name with which its paths lead to its directory: the platform takes
// any case, everybody else compares byte for byte. Empty when no share has that name. The last
// errors are cleared.
[[nodiscard]] std::string OwnNameOf(const std::string &name);

struct KnownShare {
    std::string name;
    std::string directory; // empty when no share has that name
    std::vector<VANO::FILEINDEX::Folder> folders;
};

// The shares of these names and those that the folders lie in, in byte order.
[[nodiscard]] std::vector<KnownShare> SharesOf(const std::set<std::string> &names,
                                               const std::vector<VANO::FILEINDEX::Folder> &folders);

struct MarkedShare : KnownShare {
    bool isOutOfSpace = false;
    bool needsReindex = false;
};

// Every share that has folder settings or marks, and those that the platform lists, where it does.
// False when the settings cannot be read.
[[nodiscard]] bool ListShares(std::vector<MarkedShare> &shares);

// The name under which a share is kept that a user names: as typed where the settings or the marks
// have it so, or where there is no such share; else its own name.
[[nodiscard]] std::string NameOfShare(const std::string &typed);

// Of a single share by NameOfShare(), whether there is one of that name or not.
[[nodiscard]] bool LookUpShare(MarkedShare &share, const std::string &typed);

// The status file's document, for what the library answers by name only. False, with the last error
// saying why, when it cannot be read or is no object.
[[nodiscard]] bool LoadStatus(Json::Value &status);

} // namespace CTL

#endif
