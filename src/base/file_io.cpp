#include "base/file_io.h"

#include <array>
#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/unique_fd.h"

namespace VANO::FILEINDEX {

namespace {

constexpr mode_t kNewFileMode = 0644;

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

// Not every file system can flush a directory; on those the rename itself is all there is.
bool FlushDirectory(const UniqueFd &directory) {
    return ::fsync(directory.Get()) == 0 || errno == EINVAL;
}

// `old` is the file being replaced, null when there is none.
bool ReplaceFile(const std::string &path, std::string_view text, const struct stat *old) {
    // Opened before anything changes, so that only the flush itself can fail after the rename.
    const UniqueFd directory(::open(DirectoryOf(path).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!directory) {
        return false;
    }
    TemporaryFile file(path);
    if (file.Fd() < 0 || !WriteAll(file.Fd(), text)) {
        return false;
    }
    if (old != nullptr && (old->st_uid != ::geteuid() || old->st_gid != ::getegid()) &&
        ::fchown(file.Fd(), old->st_uid, old->st_gid) != 0) {
        return false;
    }
    // A mode that cannot be set does not keep the text from being saved.
    (void)::fchmod(file.Fd(), old != nullptr ? old->st_mode & 07777 : kNewFileMode);
    return ::fsync(file.Fd()) == 0 && file.RenameOver(path) && FlushDirectory(directory);
}

bool RewriteInPlace(const std::string &path, std::string_view text) {
    const UniqueFd file(
        ::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC | O_NONBLOCK | O_NOCTTY, kNewFileMode));
    struct stat info {};
    if (!file || ::fstat(file.Get(), &info) != 0) {
        return false;
    }
    if (!S_ISREG(info.st_mode)) {
        return WriteAll(file.Get(), text);
    }
    // Room is reserved before the old text is touched, so that a full disk leaves it whole. A file
    // system that cannot reserve is written to all the same.
    const auto size = static_cast<off_t>(text.size());
    if (size > 0 && ::fallocate(file.Get(), FALLOC_FL_KEEP_SIZE, 0, size) != 0 &&
        (errno == ENOSPC || errno == EDQUOT)) {
        return false;
    }
    return WriteAll(file.Get(), text) && ::ftruncate(file.Get(), size) == 0 &&
           ::fsync(file.Get()) == 0;
}

// The answers of a directory (or of a mount point) that lets its files be written, not replaced.
bool IsReplacementRefused(int error) {
    return error == EACCES || error == EPERM || error == EROFS || error == EBUSY;
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
    text.clear();
    std::array<char, std::size_t{64} * 1024> buffer;
    for (;;) {
        const ssize_t got = ::read(file.Get(), buffer.data(), buffer.size());
        if (got < 0 && errno == EINTR) {
            continue;
        }
        if (got <= 0) {
            return got == 0;
        }
        if (text.size() + static_cast<std::size_t>(got) > maxBytes) {
            errno = EFBIG;
            return false;
        }
        text.append(buffer.data(), static_cast<std::size_t>(got));
    }
}

bool WriteFile(const std::string &path, std::string_view text) {
    struct stat old {};
    const bool exists = ::lstat(path.c_str(), &old) == 0;
    if (exists && !S_ISREG(old.st_mode)) {
        return RewriteInPlace(path, text);
    }
    return ReplaceFile(path, text, exists ? &old : nullptr) ||
           (IsReplacementRefused(errno) && RewriteInPlace(path, text));
}

} // namespace VANO::FILEINDEX
