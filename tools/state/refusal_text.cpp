#include "state/refusal_text.h"

#include <cerrno>
#include <sys/stat.h>
#include <system_error>

#include "core/index_refusal.h"
#include "state/asked_path.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::IndexRefusal;
using VANO::FILEINDEX::IndexVerdict;

constexpr char kUseLocalDisk[] = "Move the folder to a local disk.";
constexpr char kRemoveSetting[] = "Remove the folder's setting.";

// A path that is not there has no file system that could be told.
Refusal OfUnknownFileSystem(const std::string &fullPath) {
    struct stat info {};
    if (::stat(fullPath.c_str(), &info) == 0) {
        return {"file-system-unknown", "the type of its file system is unknown", kUseLocalDisk};
    }
    if (errno == ENOENT || errno == ENOTDIR) {
        return {"missing", "the directory does not exist: " + Shown(fullPath),
                "Create it, mount its volume, or remove the folder's setting."};
    }
    return {"unreachable", "it cannot be reached: " + std::generic_category().message(errno),
            "Check the permissions of the directories above it."};
}

Refusal InWords(const IndexVerdict &verdict, const std::string &fullPath) {
    switch (verdict.refusal) {
    case IndexRefusal::kRecycleBin:
        return {"recycle-bin", "it lies in the share's recycle bin",
                "Choose a folder outside the bin."};
    case IndexRefusal::kSnapshot:
        return {"snapshot", "it lies in a snapshot",
                "Choose the folder itself, not a snapshot of it."};
    case IndexRefusal::kFileSystemUnknown:
        return OfUnknownFileSystem(fullPath);
    case IndexRefusal::kFileSystemRemote:
        return {"file-system-remote",
                "it is on another machine, and changes there cannot be watched", kUseLocalDisk};
    case IndexRefusal::kFileSystemImage:
        return {"file-system-image", "it is on a mounted disk image", kUseLocalDisk};
    case IndexRefusal::kFileSystemUserSpace:
        return {"file-system-user-space", "its file system is a user-space one (FUSE)",
                kUseLocalDisk};
    case IndexRefusal::kInNoShare:
        return {"no-share", "its directory is not in a share",
                "Check the share's name and directory."};
    case IndexRefusal::kShareUnknown:
        return {"no-share", "its share is unknown", "Check the share's name."};
    case IndexRefusal::kShareExcluded:
        return {"share-excluded", "shares named " + Shown(verdict.share) + " are never indexed",
                kRemoveSetting};
    case IndexRefusal::kShareUnreadable:
        return {"share-unreadable", "the properties of its share cannot be read",
                "See the system log."};
    case IndexRefusal::kShareEncrypted:
        return {"share-encrypted", "its share is encrypted",
                "Remove the folder's setting: encrypted shares are not indexed."};
    case IndexRefusal::kShareReadOnly:
        return {"share-read-only", "its share is read-only, and the index is stored in the share",
                "Make the share writable, or remove the folder's setting."};
    case IndexRefusal::kMountPoint:
        return {"mount-point", "it is a mount point",
                "Create a share for what is mounted there, or choose folders below it."};
    case IndexRefusal::kUnreachable:
        return {"not-canonical",
                "it cannot be resolved: " + std::generic_category().message(verdict.error),
                "Check the directories above it."};
    case IndexRefusal::kNotCanonical:
        return {"not-canonical",
                "its path has symbolic links or the like; the real path is " +
                    Shown(verdict.canonical),
                "Use the real path."};
    case IndexRefusal::kNone:
        break;
    }
    return {"other", "the service refuses it", "See the system log."};
}

} // namespace

std::optional<Refusal> RefusalOf(const std::string &sharePath) {
    const std::string fullPath = ToFullPath(sharePath);
    if (fullPath.empty()) {
        return Refusal{"no-share", "no share has that name",
                       "Restore the share, or remove the folder's setting."};
    }
    const IndexVerdict verdict = VANO::FILEINDEX::JudgeFullPath(fullPath);
    ForgetErrors();
    return verdict.refusal == IndexRefusal::kNone
               ? std::nullopt
               : std::optional<Refusal>(InWords(verdict, fullPath));
}

} // namespace CTL
