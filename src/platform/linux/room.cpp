#include <cerrno>
#include <cstdint>
#include <ctime>
#include <fcntl.h>
#include <linux/quota.h>
#include <string>
#include <sys/statvfs.h>
#include <sys/syscall.h>
#include <unistd.h>

#include "base/unique_fd.h"
#include "error.h"
#include "mount_source.h"

namespace {

using namespace VANO::PLATFORM;
using VANO::FILEINDEX::UniqueFd;

enum class Answer { kYes, kNo, kUnknown };

// The effective user's quota on the file system that holds `fd`; as quotactl_fd().
long AskQuota(int fd, struct if_dqblk *quota) {
    const auto command = static_cast<unsigned>(QCMD(Q_GETQUOTA, USRQUOTA));
    const uid_t user = ::geteuid();
    const long result = ::syscall(SYS_quotactl_fd, fd, command, user, quota);
    if (result == 0 || errno != ENOSYS) {
        return result;
    }
    // Kernels before 5.14 are asked by block device; newer ones say the same again.
    const std::string device = MountSourceOf(fd);
    return ::syscall(SYS_quotactl, command, device.c_str(), user, quota);
}

// What the kernel answers where the user has no quota or the file system knows none.
bool MeansNoQuota(int error) {
    return error == ESRCH || error == ENOENT || error == ENOSYS || error == EOPNOTSUPP ||
           error == EINVAL || error == ENOTBLK || error == ENODEV;
}

// Whether `used` bytes and `more` stay within a limit given in quota blocks; 0 is no limit.
bool IsWithin(std::uint64_t used, std::uint64_t more, std::uint64_t limitBlocks) {
    if (limitBlocks == 0) {
        return true;
    }
    const std::uint64_t limit =
        limitBlocks > UINT64_MAX / QIF_DQBLKSIZE ? UINT64_MAX : limitBlocks * QIF_DQBLKSIZE;
    return used <= limit && more <= limit - used;
}

Answer QuotaAllows(int fd, std::uint64_t bytes) {
    struct if_dqblk quota {};
    if (AskQuota(fd, &quota) != 0) {
        return MeansNoQuota(errno) ? Answer::kYes : Answer::kUnknown;
    }
    if (!IsWithin(quota.dqb_curspace, bytes, quota.dqb_bhardlimit)) {
        return Answer::kNo;
    }
    // Beyond the soft limit writing goes on until the time of grace is over.
    const auto now = static_cast<std::uint64_t>(std::time(nullptr));
    const bool graceIsOver = quota.dqb_btime != 0 && quota.dqb_btime <= now;
    return !graceIsOver || IsWithin(quota.dqb_curspace, bytes, quota.dqb_bsoftlimit) ? Answer::kYes
                                                                                     : Answer::kNo;
}

Answer VolumeHolds(int fd, std::uint64_t bytes) {
    struct statvfs volume {};
    if (::fstatvfs(fd, &volume) != 0) {
        return Answer::kUnknown;
    }
    const std::uint64_t blockSize = volume.f_frsize != 0 ? volume.f_frsize : volume.f_bsize;
    if (volume.f_blocks == 0 || blockSize == 0) {
        return Answer::kYes; // a file system without a size, such as ramfs
    }
    const std::uint64_t needed = bytes / blockSize + (bytes % blockSize != 0 ? 1 : 0);
    // The blocks kept back for root are free to root only.
    const std::uint64_t available = ::geteuid() == 0 ? volume.f_bfree : volume.f_bavail;
    return needed <= available ? Answer::kYes : Answer::kNo;
}

} // namespace

int VANOQuotaIsEnough(int /*reserved*/, const char *dir, long long bytes) {
    if (dir == nullptr || *dir == '\0' || bytes < 0) {
        (void)PLATFORM_FAIL(kErrBadParameter);
        return 0;
    }
    return Guarded(0, [&] {
        const UniqueFd directory(::open(dir, O_PATH | O_DIRECTORY | O_CLOEXEC));
        if (!directory) {
            (void)PLATFORM_FAIL(kErrRoomCheck);
            return 0;
        }
        const auto wanted = static_cast<std::uint64_t>(bytes);
        const Answer quota = QuotaAllows(directory.Get(), wanted);
        if (quota == Answer::kNo) {
            (void)PLATFORM_FAIL(kErrQuotaExceeded);
            return 0;
        }
        const Answer volume = VolumeHolds(directory.Get(), wanted);
        if (volume == Answer::kNo) {
            (void)PLATFORM_FAIL(kErrVolumeFull);
            return 0;
        }
        if (quota == Answer::kUnknown || volume == Answer::kUnknown) {
            (void)PLATFORM_FAIL(kErrRoomCheck);
            return 0;
        }
        return 1;
    });
}
