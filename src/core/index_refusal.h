#ifndef FILEINDEX_CORE_INDEX_REFUSAL_H
#define FILEINDEX_CORE_INDEX_REFUSAL_H

#include <string>

#include "platform/vano_platform.h"

// Why a share or a folder may not be indexed. These are decisions over the file system and the
// platform's properties of shares: nothing is changed, logged or recorded as an error.

namespace VANO::FILEINDEX {

enum class IndexRefusal {
    kNone, // it may be indexed
    kRecycleBin,
    kSnapshot,
    kFileSystemUnknown,
    kFileSystemRemote,
    kFileSystemImage,
    kFileSystemUserSpace,
    kInNoShare,
    kShareUnknown,
    kShareExcluded,
    kShareUnreadable, // its properties cannot be read
    kShareEncrypted,
    kShareReadOnly,
    kMountPoint,
    kUnreachable,  // its path cannot be resolved
    kNotCanonical, // its path has symbolic links or other detours
};

struct IndexVerdict {
    IndexRefusal refusal = IndexRefusal::kNone;
    std::string share;     // that the path lies in; empty when refused before that is known
    std::string canonical; // of kNotCanonical: where the path leads
    int error = 0;         // of kUnreachable: the errno
};

// The first reason, in the order in which they are looked for.
[[nodiscard]] IndexRefusal RefusalOfShare(_tag_VANOSHARE *share);
[[nodiscard]] IndexVerdict JudgeFullPath(const std::string &fullPath);

// The single questions that are asked of files too.
[[nodiscard]] bool IsInRecycleBin(const std::string &fullPath);
[[nodiscard]] bool IsInSnapshot(const std::string &fullPath);
[[nodiscard]] IndexRefusal RefusalOfFileSystem(int type);

} // namespace VANO::FILEINDEX

#endif
