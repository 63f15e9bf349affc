#include "utils/metadata_entry.h"

#include <cerrno>
#include <fcntl.h>

namespace VANO::FILEINDEX {

namespace {

constexpr int kDirectoryFlags = O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
constexpr int kEntryFlags = O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;

// Takes the last component off an absolute path, with the slashes before it.
std::string TakeLastComponent(std::string &path) {
    const std::size_t begin = path.rfind('/') + 1;
    std::string name = path.substr(begin);
    path.resize(begin);
    while (path.size() > 1 && path.back() == '/') {
        path.pop_back();
    }
    return name;
}

} // namespace

MetadataEntry::MetadataEntry(const std::string &location) {
    std::string path = location;
    name_ = TakeLastComponent(path);
    const std::string metadataDirName = TakeLastComponent(path);
    const UniqueFd share(::open(path.c_str(), kDirectoryFlags));
    if (share) {
        directory_ = UniqueFd(::openat(share.Get(), metadataDirName.c_str(), kDirectoryFlags));
    }
    failure_ = directory_ ? 0 : errno;
}

UniqueFd MetadataEntry::Open(int flags, mode_t mode) const {
    if (!directory_) {
        errno = failure_;
        return UniqueFd();
    }
    return UniqueFd(::openat(directory_.Get(), name_.c_str(), flags | kEntryFlags, mode));
}

bool MetadataEntry::Stat(struct stat &info) const {
    if (!directory_) {
        errno = failure_;
        return false;
    }
    return ::fstatat(directory_.Get(), name_.c_str(), &info, AT_SYMLINK_NOFOLLOW) == 0;
}

bool MetadataEntry::MakeDirectory(mode_t mode) const {
    if (!directory_) {
        errno = failure_;
        return false;
    }
    return ::mkdirat(directory_.Get(), name_.c_str(), mode) == 0;
}

bool MetadataEntry::IsObstructed() const {
    return failure_ != 0 && failure_ != ENOENT;
}

} // namespace VANO::FILEINDEX
