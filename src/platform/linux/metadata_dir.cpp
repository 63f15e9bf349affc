#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <string>
#include <sys/stat.h>
#include <utility>

#include "base/unique_fd.h"
#include "error.h"

using namespace VANO::PLATFORM;
using VANO::FILEINDEX::UniqueFd;

namespace {

constexpr char kMetadataDirectory[] = "@eaDir";
constexpr mode_t kDirectoryMode = 0777;

// The directory that is to hold the path's last component, and that component.
std::pair<std::string, std::string> Split(std::string path) {
    while (path.size() > 1 && path.back() == '/') {
        path.pop_back();
    }
    const std::size_t slash = path.rfind('/');
    if (slash == std::string::npos) {
        return {".", path};
    }
    return {slash == 0 ? "/" : path.substr(0, slash), path.substr(slash + 1)};
}

} // namespace

// "@eaDir", in that spelling, is the one hidden metadata directory of this platform.
int VANOEAIsHiddenDir(const char *name) {
    return name != nullptr && std::strcmp(name, kMetadataDirectory) == 0 ? 1 : 0;
}

// No flags are defined; they are not looked at. Users can write to a share's top: a symbolic link
// in place of the directory, or of the one that is to hold it, is a failure.
int VANOEAMKDir(int /*flags*/, const char *path) {
    if (path == nullptr || *path == '\0') {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    return NoThrow(-1, [path] {
        const auto [parentPath, name] = Split(path);
        const UniqueFd parent(
            ::open(parentPath.c_str(), O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
        if (!parent) {
            return PLATFORM_FAIL(kErrMakeDir);
        }
        if (::mkdirat(parent.Get(), name.c_str(), kDirectoryMode) == 0) {
            return 0;
        }
        struct stat info {};
        if (errno != EEXIST ||
            ::fstatat(parent.Get(), name.c_str(), &info, AT_SYMLINK_NOFOLLOW) != 0) {
            return PLATFORM_FAIL(kErrMakeDir);
        }
        return S_ISDIR(info.st_mode) ? 0 : PLATFORM_FAIL(kErrNotADirectory);
    });
}
