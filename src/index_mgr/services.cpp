#include "core/paths.h"
#include "index_mgr/parts.h"
#include "platform/vano_platform.h"
#include "utils/platform_error.h"

namespace VANO::FILEINDEX {

bool StartIndexingService() {
    if (VLIBServiceStart(kIndexingService, kAlsoAtBoot) < 0) {
        LogPlatformFailure(kIndexMgrUnit, __LINE__, "VLIBServiceStart");
        return false;
    }
    return true;
}

void StopIndexing() {
    if (VLIBServiceStop(kIndexingService, kAlsoAtBoot) < 0) {
        LogPlatformFailure(kIndexMgrUnit, __LINE__, "VLIBServiceStop");
    }
    SwitchSpotlight(false);
}

void SwitchSpotlight(bool on) {
    if ((VANOSMBIsEnableSpotlight() != 0) == on) {
        return;
    }
    if (VANOSMBSetSpotlight(on) < 0) {
        LogPlatformFailure(kIndexMgrUnit, __LINE__, "VANOSMBSetSpotlight");
        return;
    }
    if (VLIBServiceRestart(kFileSharingService) < 0) {
        LogPlatformFailure(kIndexMgrUnit, __LINE__, "VLIBServiceRestart");
    }
}

} // namespace VANO::FILEINDEX
