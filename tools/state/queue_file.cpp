#include "state/queue_file.h"

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "core/share_files.h"

namespace CTL {

using VANO::FILEINDEX::UniqueFd;

QueueFile::QueueFile(const std::string &path)
    : fd_(VANO::FILEINDEX::ShareFile(path).Open(O_RDONLY)) {
    struct stat info {};
    if (!fd_ || ::fstat(fd_.Get(), &info) != 0) {
        error_ = errno == ENOENT ? 0 : errno;
        fd_ = UniqueFd();
    } else if (!S_ISREG(info.st_mode)) {
        error_ = EINVAL;
        fd_ = UniqueFd();
    } else {
        identity_ = {info.st_dev, info.st_ino};
        size_ = info.st_size;
    }
}

// A queue file is made with its first event.
long long QueueFile::Age() const {
    struct statx times {};
    if (::statx(fd_.Get(), "", AT_EMPTY_PATH, STATX_BTIME | STATX_MTIME, &times) != 0) {
        return 0;
    }
    long long first = times.stx_mtime.tv_sec;
    if ((times.stx_mask & STATX_BTIME) != 0) {
        first = std::min<long long>(first, times.stx_btime.tv_sec);
    }
    return std::max<long long>(0, std::time(nullptr) - first);
}

std::string QueueFile::ReadAt(off_t offset, std::size_t bytes) const {
    std::string text(bytes, '\0');
    std::size_t filled = 0;
    ssize_t got = 0;
    errno = 0;
    do {
        got =
            ::pread(fd_.Get(), &text[filled], bytes - filled, offset + static_cast<off_t>(filled));
        filled += got > 0 ? static_cast<std::size_t>(got) : 0;
    } while ((got > 0 && filled < bytes) || (got < 0 && errno == EINTR));
    errno = got < 0 ? errno : 0;
    text.resize(filled);
    return text;
}

} // namespace CTL
