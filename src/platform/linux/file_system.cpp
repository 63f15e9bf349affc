#include <cerrno>
#include <fcntl.h>
#include <string>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/vfs.h>
#include <unistd.h>

#include "base/unique_fd.h"
#include "error.h"
#include "fs_type.h"
#include "mount_source.h"
#include "places.h"

namespace {

using namespace VANO::PLATFORM;
using VANO::FILEINDEX::UniqueFd;

constexpr unsigned kLoopMajor = 7;

bool Exists(const std::string &path) {
    return ::access(path.c_str(), F_OK) == 0;
}

// A loop device, or a partition on one: its directory lies inside the whole device's.
bool IsLoopDevice(dev_t device) {
    if (::major(device) == kLoopMajor) {
        return true;
    }
    const std::string entry = std::string(kBlockDeviceDirectory) + "/" +
                              std::to_string(::major(device)) + ":" +
                              std::to_string(::minor(device));
    return Exists(entry + "/loop") || Exists(entry + "/../loop");
}

// The block device below a file; 0 when there is none. Some disk file systems answer stat() with a
// device number of no device: there the mount table tells the device.
dev_t DeviceBelow(int fd, FsType type) {
    struct stat info {};
    if (::fstat(fd, &info) != 0) {
        return 0;
    }
    if (::major(info.st_dev) != 0) {
        return info.st_dev;
    }
    if (type != kFsBtrfs && type != kFsBcachefs) {
        return 0;
    }
    const std::string source = MountSourceOf(fd);
    return ::stat(source.c_str(), &info) == 0 && S_ISBLK(info.st_mode) ? info.st_rdev : 0;
}

int FsTypeOf(const char *path) {
    const UniqueFd file(::open(path, O_PATH | O_CLOEXEC));
    struct statfs info {};
    if (!file || ::fstatfs(file.Get(), &info) != 0) {
        (void)PLATFORM_FAIL(kErrFileSystem);
        return kFsUnknown;
    }
    const FsType type = FsTypeFromMagic(static_cast<unsigned long>(info.f_type));
    if (type == kFsUnknown) {
        (void)PLATFORM_FAIL(kErrFsTypeUnknown);
        return kFsUnknown;
    }
    // FUSE keeps its own answer: callers treat a user-space mount alike whatever lies below.
    if (type == kFsFuse || VANOFSIsImageFS(type) != 0) {
        return type;
    }
    const dev_t device = DeviceBelow(file.Get(), type);
    return device != 0 && IsLoopDevice(device) ? kFsLoopImage : type;
}

} // namespace

// A path that does not exist lies on no known volume. A file system of a kind that is not listed is
// unknown too, although it is there: it may well be remote.
int VANOGetFSType(const char *path, int /*flags*/) {
    if (path == nullptr || *path == '\0') {
        (void)PLATFORM_FAIL(kErrBadParameter);
        return kFsUnknown;
    }
    return Guarded<int>(kFsUnknown, [&] { return FsTypeOf(path); });
}

// A symbolic link to a mount point is none. What is bound from elsewhere in the same file system is
// one.
int VANOFSDirIsMntPoint(const char *fullPath) {
    if (fullPath == nullptr || *fullPath == '\0') {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    struct statx info {};
    if (::statx(AT_FDCWD, fullPath, AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT, STATX_TYPE, &info) !=
            0 ||
        (info.stx_attributes_mask & STATX_ATTR_MOUNT_ROOT) == 0) {
        return PLATFORM_FAIL(kErrFileSystem);
    }
    const bool isRoot = (info.stx_attributes & STATX_ATTR_MOUNT_ROOT) != 0;
    return isRoot && S_ISDIR(info.stx_mode) ? 1 : 0;
}
