#ifndef FILEINDEX_CORE_SHARE_H
#define FILEINDEX_CORE_SHARE_H

#include <memory>
#include <optional>
#include <string>

#include "platform/vano_platform.h"

// Shares, as the platform knows them.

namespace VANO::FILEINDEX {

struct ReleaseShareRecord {
    void operator()(_tag_VANOSHARE *share) const { VANOShareFree(share); }
};

// Owns one share record of the platform.
using ShareRecord = std::unique_ptr<_tag_VANOSHARE, ReleaseShareRecord>;

// The record of a share; null when there is none. The platform is not asked for a name with a zero
// byte: it would take that for a shorter one.
[[nodiscard]] ShareRecord FindShare(const std::string &name);

struct ShareOfFullPath {
    std::string name;
    std::string path; // what it is, the platform defines
};

// What the platform says of a full path; nothing when it lies in no share.
[[nodiscard]] std::optional<ShareOfFullPath> FindShareOfFullPath(const std::string &fullPath);

} // namespace VANO::FILEINDEX

#endif
