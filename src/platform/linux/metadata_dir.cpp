#include <cerrno>
#include <cstring>
#include <sys/stat.h>

#include "error.h"

using namespace VANO::PLATFORM;

namespace {

constexpr char kMetadataDirectory[] = "@eaDir";
constexpr mode_t kDirectoryMode = 0777;

} // namespace

// "@eaDir", in that spelling, is the one hidden metadata directory of this platform.
int VANOEAIsHiddenDir(const char *name) {
    return name != nullptr && std::strcmp(name, kMetadataDirectory) == 0 ? 1 : 0;
}

// No flags are defined; they are not looked at. A symbolic link that stands in the directory's
// place is a failure: users can write to a share's top.
int VANOEAMKDir(int /*flags*/, const char *path) {
    if (path == nullptr || *path == '\0') {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    if (::mkdir(path, kDirectoryMode) == 0) {
        return 0;
    }
    if (errno != EEXIST) {
        return PLATFORM_FAIL(kErrMakeDir);
    }
    struct stat info {};
    if (::lstat(path, &info) != 0) {
        return PLATFORM_FAIL(kErrMakeDir);
    }
    return S_ISDIR(info.st_mode) ? 0 : PLATFORM_FAIL(kErrNotADirectory);
}
