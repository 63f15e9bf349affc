// Stands before the system's libraries, by LD_PRELOAD, and answers what no test can bring about for
// real: a file system of any type, a share whose properties cannot be read, a later time.

#include <chrono>
#include <cstdlib>
#include <ctime>

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
