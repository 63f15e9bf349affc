#include "base/file_io.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <fcntl.h>
#include <limits>
#include <sys/stat.h>
#include <unistd.h>

#include "base/unique_fd.h"

namespace VANO::FILEINDEX {

namespace {

constexpr mode_t kNewFileMode = 0644;
constexpr std::size_t kLeastGrowth = 4096; // of a file that has more than it says

bool WriteAll(int fd, std::string_view text) {
    while (!text.empty()) {
        const ssize_t written = ::write(fd, text.data(), text.size());
        if (written < 0 && errno == EINTR) {
            continue;
        }
        if (written <= 0) {
            return false;
        }
        text.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

// A file beside the target that goes away unless it was renamed over the target.
class TemporaryFile {
  public:
    explicit TemporaryFile(const std::string &target)
        : path_(target + ".XXXXXX"), fd_(::mkostemp(path_.data(), O_CLOEXEC)) {}
    TemporaryFile(const TemporaryFile &) = delete;
    TemporaryFile &operator=(const TemporaryFile &) = delete;
    ~TemporaryFile() {
        if (fd_ && !renamed_) {
            const int saved = errno;
            ::unlink(path_.c_str());
            errno = saved;
        }
    }

    [[nodiscard]] int Fd() const { return fd_.Get(); }
    [[nodiscard]] bool RenameOver(const std::string &target) {
        renamed_ = ::rename(path_.c_str(), target.c_str()) == 0;
        return renamed_;
    }

  private:
    std::string path_;
    UniqueFd fd_;
    bool renamed_ = false;
};

std::string DirectoryOf(const std::string &path) {
    const std::size_t slash = path.rfind('/');
    if (slash == std::string::npos) {
        return ".";
    }
    return slash == 0 ? "/" : path.substr(0, slash);
}

// The answers of a directory (or of a mount point) that lets its files be written, not replaced.
bool IsReplacementRefused(int error) {
    return error == EACCES || error == EPERM || error == EROFS || error == EBUSY;
}

// Gives `file` the owner and the mode of the file that it replaces.
bool TakeOver(int file, const struct stat &old) {
    struct stat fresh {};
    if (::fstat(file, &fresh) != 0) {
        return false;
    }
    if ((fresh.st_uid != old.st_uid || fresh.st_gid != old.st_gid) &&
        ::fchown(file, old.st_uid, old.st_gid) != 0) {
        // Written in place, the file keeps an owner that cannot be given away here.
        errno = errno == EIO || errno == ENOSPC || errno == EDQUOT ? errno : EPERM;
        return false;
    }
    // A mode that cannot be set does not keep the text from being saved.
    (void)::fchmod(file, old.st_mode & 07777);
    return true;
}

// `old` is the file being replaced, null when there is none.
bool ReplaceFile(const std::string &path, std::string_view text, const struct stat *old) {
    const UniqueFd directory(::open(DirectoryOf(path).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!directory) {
        return false;
    }
    TemporaryFile file(path);
    if (file.Fd() < 0 || !WriteAll(file.Fd(), text)) {
        return false;
    }
    if (old != nullptr) {
        if (!TakeOver(file.Fd(), *old)) {
            return false;
        }
    } else {
        (void)::fchmod(file.Fd(), kNewFileMode);
    }
    if (::fsync(file.Fd()) != 0 || !file.RenameOver(path)) {
        return false;
    }
    // The new text stands, whatever comes of this: a lost power line may bring the old one back.
    (void)::fsync(directory.Get());
    return true;
}

// Room is reserved before the old text is touched, so that a full disk leaves it whole. A file
// system that cannot reserve is written to all the same.
bool ReserveRoom(int file, off_t size) {
    int result = 0;
    do {
        result = size > 0 ? ::fallocate(file, FALLOC_FL_KEEP_SIZE, 0, size) : 0;
    } while (result != 0 && errno == EINTR);
    return result == 0 || errno == EOPNOTSUPP || errno == ENOSYS;
}

// Makes `text` the whole content of a file that is open at its beginning.
bool Overwrite(int file, std::string_view text) {
    return WriteAll(file, text) && ::ftruncate(file, static_cast<off_t>(text.size())) == 0 &&
           ::fsync(file) == 0;
}

// Removes a file that was made through `path`, which may be a symbolic link to it.
void RemoveMadeFile(const std::string &path) {
    std::array<char, PATH_MAX> target{};
    if (::realpath(path.c_str(), target.data()) != nullptr) {
        ::unlink(target.data());
    }
}

bool RewriteInPlace(const std::string &path, std::string_view text) {
    struct stat info {};
    const bool exists = ::stat(path.c_str(), &info) == 0;
    const UniqueFd file(
        ::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC | O_NONBLOCK | O_NOCTTY, kNewFileMode));
    if (!file || ::fstat(file.Get(), &info) != 0) {
        return false;
    }
    if (!S_ISREG(info.st_mode)) {
        return WriteAll(file.Get(), text);
    }
    std::string old;
    if (!ReadFile(old, path, std::numeric_limits<std::size_t>::max())) {
        return false;
    }
    if (ReserveRoom(file.Get(), static_cast<off_t>(text.size())) && Overwrite(file.Get(), text)) {
        return true;
    }
    const int failure = errno;
    if (!exists) {
        RemoveMadeFile(path);
    } else if (::lseek(file.Get(), 0, SEEK_SET) == 0) {
        (void)Overwrite(file.Get(), old); // its blocks are still there
    }
    errno = failure;
    return false;
}

} // namespace

bool ReadFile(std::string &text, const std::string &path, std::size_t maxBytes) {
    const UniqueFd file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    struct stat info {};
    if (!file || ::fstat(file.Get(), &info) != 0) {
        return false;
    }
    if (!S_ISREG(info.st_mode)) {
        errno = EINVAL;
        return false;
    }
    if (static_cast<std::size_t>(info.st_size) > maxBytes) {
        errno = EFBIG;
        return false;
    }
    // Room for a byte more than there seem to be: the second read finds the end.
    std::size_t length = 0;
    text.resize(static_cast<std::size_t>(info.st_size) + 1);
    for (;;) {
        const ssize_t got = ::read(file.Get(), text.data() + length, text.size() - length);
        if (got < 0 && errno == EINTR) {
            continue;
        }
        if (got <= 0) {
            text.resize(length);
            return got == 0;
        }
        length += static_cast<std::size_t>(got);
        if (length > maxBytes) {
            errno = EFBIG;
            return false;
        }
        if (length == text.size()) {
            text.resize(length + std::max(length, kLeastGrowth));
        }
    }
}

bool WriteFile(const std::string &path, std::string_view text) {
    struct stat old {};
    const bool exists = ::lstat(path.c_str(), &old) == 0;
    if (!exists && errno != ENOENT) {
        return false;
    }
    if (exists && !S_ISREG(old.st_mode)) {
        return RewriteInPlace(path, text);
    }
    return ReplaceFile(path, text, exists ? &old : nullptr) ||
           (IsReplacementRefused(errno) && RewriteInPlace(path, text));
}

} // namespace VANO::FILEINDEX
