#ifndef FILEINDEXCTL_SHARE_SHARES_H
#define FILEINDEXCTL_SHARE_SHARES_H

#include <fileindex/folder.h>
#include <string>
#include <vector>

namespace CTL {

struct ShareFacts {
    std::string name;
    std::string directory; // empty when no share has that name
    std::vector<VANO::FILEINDEX::Folder> folders;
    bool isOutOfSpace = false;
    bool needsReindex = false;
};

// Every share that has folder settings or marks, and those of the share table where the system has
// one, in byte order. False when the settings cannot be read.
[[nodiscard]] bool ListShares(std::vector<ShareFacts> &shares);

// Of a single share, whether there is one of that name or not.
[[nodiscard]] bool LookUpShare(ShareFacts &share, const std::string &name);

} // namespace CTL

#endif
