#include "core/share_files.h"

#include <cerrno>
#include <fcntl.h>
#include <utility>

#include "core/paths.h"

namespace VANO::FILEINDEX {

namespace {

// Only the last component of a path is kept from being followed: the metadata directory.
constexpr int kDirectoryFlags = O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
constexpr int kEntryFlags = O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;

} // namespace

std::string MetadataDirIn(const std::string &directory) {
    return directory + "/" + kMetadataDirName;
}

std::string DatabaseIn(const std::string &directory) {
    return MetadataDirIn(directory) + "/" + kIndexDbName;
}

std::string QueueIn(const std::string &directory) {
    return MetadataDirIn(directory) + "/" + kEventQueueName;
}

ShareFile::ShareFile(const std::string &path) : path_(path) {
    UniqueFd fd(::open(path.substr(0, path.rfind('/')).c_str(), kDirectoryFlags));
    const int failure = fd ? 0 : errno;
    directory_ = std::make_shared<const Directory>(Directory{std::move(fd), failure});
}

ShareFile ShareFile::TakenOver() const {
    return {path_ + kTakenQueueSuffix, directory_};
}

bool ShareFile::IsReachable() const {
    errno = Failure();
    return Failure() == 0;
}

UniqueFd ShareFile::Open(int flags, mode_t mode) const {
    return UniqueFd(
        IsReachable() ? ::openat(directory_->fd.Get(), Name(), flags | kEntryFlags, mode) : -1);
}

bool ShareFile::Stat(struct stat &info) const {
    return IsReachable() &&
           ::fstatat(directory_->fd.Get(), Name(), &info, AT_SYMLINK_NOFOLLOW) == 0;
}

bool ShareFile::MakeDirectory(mode_t mode) const {
    return IsReachable() && ::mkdirat(directory_->fd.Get(), Name(), mode) == 0;
}

bool ShareFile::IsFile() const {
    struct stat info {};
    return Stat(info) && S_ISREG(info.st_mode);
}

} // namespace VANO::FILEINDEX
