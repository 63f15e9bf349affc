#ifndef FILEINDEXCTL_COMMANDS_QUERY_REASON_H
#define FILEINDEXCTL_COMMANDS_QUERY_REASON_H

#include <fileindex/folder.h>
#include <json/value.h>
#include <string>
#include <vector>

namespace CTL {

// Why something is indexed, or not.
struct Reason {
    std::vector<std::string> lines; // fit for a terminal
    Json::Value facts;              // the same for programs, an object
};

// A path in both forms; the one that is not known is empty.
struct PathForms {
    std::string sharePath;
    std::string fullPath;
};

// Of a path: the setting that governs it, and the rule that keeps it from being indexed.
[[nodiscard]] Reason ReasonOf(const PathForms &path, bool isIndexed,
                              const std::vector<VANO::FILEINDEX::Folder> &folders);

// Of a share: its folders.
[[nodiscard]] Reason ReasonOfShare(const std::string &share,
                                   const std::vector<VANO::FILEINDEX::Folder> &folders);

} // namespace CTL

#endif
