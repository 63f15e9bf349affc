#include "state/index_refusal.h"

#include <array>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <sys/stat.h>
#include <system_error>
#include <vano_platform.h>

#include "state/share_record.h"
#include "terminal/text.h"

namespace CTL {

namespace {

constexpr int kUserSpaceFileSystem = 12;

std::optional<Refusal> ByPlace(const std::string &fullPath) {
    if (fullPath.find("#recycle") != std::string::npos &&
        VANOShareIsShareRecycle(fullPath.c_str()) != 0) {
        return Refusal{"recycle-bin", "it lies in the share's recycle bin",
                       "Choose a folder outside the bin."};
    }
    int flag = 0;
    if (fullPath.find("#snapshot") != std::string::npos &&
        VLIBFhsPathInSnapshot(fullPath.c_str(), &flag) == 0 && flag == 1) {
        return Refusal{"snapshot", "it lies in a snapshot",
                       "Choose the folder itself, not a snapshot of it."};
    }
    return std::nullopt;
}

std::optional<Refusal> ByFileSystem(const std::string &fullPath) {
    const char *const fix = "Move the folder to a local disk.";
    const int type = VANOGetFSType(fullPath.c_str(), 0);
    struct stat info {};
    if (type == -1 && ::stat(fullPath.c_str(), &info) != 0) {
        const bool isGone = errno == ENOENT || errno == ENOTDIR;
        return Refusal{isGone ? "missing" : "unreachable",
                       isGone ? "the directory does not exist: " + Shown(fullPath)
                              : "it cannot be reached: " + std::generic_category().message(errno),
                       isGone ? "Create it, mount its volume, or remove the folder's setting."
                              : "Check the permissions of the directories above it."};
    }
    if (type == -1) {
        return Refusal{"file-system-unknown", "the type of its file system is unknown", fix};
    }
    if (VANOFSIsRemoteFS(type) != 0) {
        return Refusal{"file-system-remote",
                       "it is on another machine, and changes there cannot be watched", fix};
    }
    if (VANOFSIsImageFS(type) != 0) {
        return Refusal{"file-system-image", "it is on a mounted disk image", fix};
    }
    if (type == kUserSpaceFileSystem) {
        return Refusal{"file-system-user-space", "its file system is a user-space one (FUSE)", fix};
    }
    return std::nullopt;
}

// The library's own answer covers all of a share's rules; the questions here tell which it was.
std::optional<Refusal> ByShare(_tag_VANOSHARE *share) {
    if (VANO::FILEINDEX::CanShareBeIndexed(share)) {
        return std::nullopt;
    }
    int encrypted = 0;
    int readOnly = 0;
    const bool isTold = VLIBShareIsEncryptedGet(share, &encrypted) >= 0 &&
                        VLIBShareIsReadOnlyGet(share, &readOnly) >= 0;
    if (encrypted != 0) {
        return Refusal{"share-encrypted", "its share is encrypted",
                       "Remove the folder's setting: encrypted shares are not indexed."};
    }
    if (readOnly != 0) {
        return Refusal{"share-read-only",
                       "its share is read-only, and the index is stored in the share",
                       "Make the share writable, or remove the folder's setting."};
    }
    if (!isTold) {
        return Refusal{"share-unreadable", "the properties of its share cannot be read",
                       "See the system log."};
    }
    return Refusal{"share-excluded", "shares named " + Shown(share->name) + " are never indexed",
                   "Remove the folder's setting."};
}

std::optional<Refusal> ByMount(_tag_VANOSHARE *share, const std::string &fullPath) {
    int encryption = 0;
    if (VANOFSDirIsMntPoint(fullPath.c_str()) == 1 &&
        VLIBShareIsEncryptionGet(share, &encryption) == 0 && encryption == 0) {
        return Refusal{"mount-point", "it is a mount point",
                       "Create a share for what is mounted there, or choose folders below it."};
    }
    return std::nullopt;
}

std::optional<Refusal> BySpelling(const std::string &fullPath) {
    std::array<char, PATH_MAX> canonical{};
    if (::realpath(fullPath.c_str(), canonical.data()) == nullptr) {
        return Refusal{"not-canonical",
                       "it cannot be resolved: " + std::generic_category().message(errno),
                       "Check the directories above it."};
    }
    if (fullPath != canonical.data()) {
        return Refusal{"not-canonical",
                       "its path has symbolic links or the like; the real path is " +
                           Shown(canonical.data()),
                       "Use the real path."};
    }
    return std::nullopt;
}

// In the order in which the library asks.
std::optional<Refusal> FirstRefusal(const std::string &sharePath) {
    std::string fullPath;
    if (!VANO::FILEINDEX::GetFullPath(fullPath, sharePath)) {
        return Refusal{"no-share", "there is no share of that name",
                       "Restore the share, or remove the folder's setting."};
    }
    std::optional<Refusal> refusal = ByPlace(fullPath);
    if (!refusal) {
        refusal = ByFileSystem(fullPath);
    }
    if (refusal) {
        return refusal;
    }
    std::string shareName;
    std::string inside;
    if (!VANO::FILEINDEX::GetShareNamePathByFullPath(shareName, inside, fullPath)) {
        return Refusal{"no-share", "its directory is not in a share",
                       "Check the share's name and directory."};
    }
    const ShareRecord share = FindShare(shareName);
    if (!share) {
        return Refusal{"no-share", "its share is unknown", "Check the share's name."};
    }
    refusal = ByShare(share.get());
    if (!refusal) {
        refusal = ByMount(share.get(), fullPath);
    }
    return refusal ? refusal : BySpelling(fullPath);
}

} // namespace

std::optional<Refusal> RefusalOf(const std::string &sharePath) {
    if (VANO::FILEINDEX::CanPathBeIndexed(sharePath)) {
        return std::nullopt;
    }
    std::optional<Refusal> refusal = FirstRefusal(sharePath);
    if (!refusal) {
        refusal = Refusal{"other", "the service refuses it", "See the system log."};
    }
    return refusal;
}

} // namespace CTL
