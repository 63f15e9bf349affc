// Stands before the system's libraries, by LD_PRELOAD, and answers what no test can bring about for
// real: a file system of any type, a share whose properties cannot be read, a later time, a path
// that not even root reaches, a file that cannot be read.

#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include "platform/vano_platform.h"

namespace {

int Setting(const char *name, int otherwise) {
    const char *value = std::getenv(name);
    return value == nullptr ? otherwise : std::atoi(value);
}

} // namespace

int VANOGetFSType(const char * /*path*/, int /*flags*/) {
    return Setting("ODD_FS_TYPE", 1);
}

int VLIBShareIsEncryptedGet(struct _tag_VANOSHARE * /*share*/, int *flag) {
    *flag = 0;
    return Setting("ODD_SHARE", 0) == 0 ? 0 : -1;
}

extern "C" __attribute__((visibility("default"))) std::time_t time(std::time_t *out) noexcept {
    const std::time_t now = std::chrono::system_clock::to_time_t(std::chrono::system_clock::now()) +
                            Setting("ODD_SECONDS", 0);
    if (out != nullptr) {
        *out = now;
    }
    return now;
}

extern "C" __attribute__((visibility("default"))) int stat(const char *path,
                                                           struct stat *info) noexcept {
    const char *unreachable = std::getenv("ODD_UNREACHABLE");
    if (unreachable != nullptr && std::strcmp(path, unreachable) == 0) {
        errno = EACCES;
        return -1;
    }
    return ::fstatat(AT_FDCWD, path, info, 0);
}

extern "C" __attribute__((visibility("default"))) ssize_t pread(int file, void *out,
                                                                std::size_t bytes, off_t offset) {
    const int error = Setting("ODD_READ_ERROR", 0);
    if (error != 0) {
        errno = error;
        return -1;
    }
    return ::syscall(SYS_pread64, file, out, bytes, offset);
}
