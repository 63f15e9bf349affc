#include <cerrno>
#include <cstring>
#include <string>
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

// No flags are defined; they are not looked at. Users can write to a share's top: a symbolic link
// in place of the directory is a failure.
int VANOEAMKDir(int /*flags*/, const char *path) {
    if (path == nullptr || *path == '\0') {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    return Guarded(-1, [path] {
        std::string plain = path; // a trailing slash would have a link followed
        plain.resize(plain.find_last_not_of('/') + 1);
        struct stat info {};
        if (::mkdir(plain.c_str(), kDirectoryMode) == 0) {
            return 0;
        }
        if (errno != EEXIST || ::lstat(plain.c_str(), &info) != 0) {
            return PLATFORM_FAIL(kErrMakeDir);
        }
        return S_ISDIR(info.st_mode) ? 0 : PLATFORM_FAIL(kErrNotADirectory);
    });
}
