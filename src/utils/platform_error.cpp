#include "utils/platform_error.h"

#include "base/log.h"
#include "platform/vano_platform.h"

namespace VANO::FILEINDEX {

void LogPlatformFailure(const char *unit, int line, const char *operation) {
    const int code = VLIBCErrGet();
    const char *const file = VLIBCErrorGetFile();
    LogError(unit, line, "%s failed: err=[0x%04X %s:%d]", operation, static_cast<unsigned>(code),
             file != nullptr ? file : "", VLIBCErrorGetLine());
}

} // namespace VANO::FILEINDEX
