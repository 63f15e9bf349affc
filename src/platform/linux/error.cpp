#include "error.h"

#include <cstdio>

namespace {

// The file name is copied: its owner may be a library that is unloaded before it is asked for.
struct LastError {
    int code = VANO::PLATFORM::kErrNone;
    int line = 0;
    char file[128] = "";
};

thread_local LastError lastError;

} // namespace

int VLIBCErrGet(void) {
    return lastError.code;
}

void VLIBCErrSetEx(int code, const char *file, int line) {
    lastError.code = code;
    lastError.line = line;
    (void)std::snprintf(lastError.file, sizeof lastError.file, "%s", file != nullptr ? file : "");
}

const char *VLIBCErrorGetFile(void) {
    return lastError.file;
}

int VLIBCErrorGetLine(void) {
    return lastError.line;
}
