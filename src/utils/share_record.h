#ifndef FILEINDEX_UTILS_SHARE_RECORD_H
#define FILEINDEX_UTILS_SHARE_RECORD_H

#include <memory>
#include <string>

#include "platform/vano_platform.h"

namespace VANO::FILEINDEX {

struct ReleaseShareRecord {
    void operator()(_tag_VANOSHARE *share) const { VANOShareFree(share); }
};

// Owns one share record of the platform.
using ShareRecord = std::unique_ptr<_tag_VANOSHARE, ReleaseShareRecord>;

// The record of a share; null when there is none.
inline ShareRecord FindShare(const char *name) {
    _tag_VANOSHARE *share = nullptr;
    const int result = VANOShareGet(name, &share);
    return result < 0 ? nullptr : ShareRecord(share);
}

// A name with a zero byte is no share's: the platform would take it for a shorter one.
inline ShareRecord FindShare(const std::string &name) {
    return name.find('\0') == std::string::npos ? FindShare(name.c_str()) : nullptr;
}

} // namespace VANO::FILEINDEX

#endif
