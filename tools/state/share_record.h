#ifndef FILEINDEXCTL_STATE_SHARE_RECORD_H
#define FILEINDEXCTL_STATE_SHARE_RECORD_H

#include <memory>
#include <string>

struct _tag_VANOSHARE;

namespace CTL {

struct FreeShareRecord {
    void operator()(_tag_VANOSHARE *record) const;
};
using ShareRecord = std::unique_ptr<_tag_VANOSHARE, FreeShareRecord>;

// The platform's record of a share; null when none has that name in whatever case. The last errors
// are cleared.
[[nodiscard]] ShareRecord FindShare(const std::string &name);

// Where a share lies; empty when no share has that name. The last errors are cleared.
[[nodiscard]] std::string DirectoryOfShare(const std::string &name);

// The one spelling of a share's name with which its paths lead to its directory: the platform takes
// any case, everybody else compares byte for byte. Empty when no share has that name. The last
// errors are cleared.
[[nodiscard]] std::string OwnNameOf(const std::string &name);

} // namespace CTL

#endif
