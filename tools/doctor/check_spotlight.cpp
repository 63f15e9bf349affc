// The file-sharing service's search switch.

#include <vano_platform.h>

#include "doctor/checks.h"

namespace CTL::DOCTOR {

Findings CheckSpotlight(const Evidence &evidence) {
    VLIBCErrSetEx(0, "", 0);
    const bool isOn = VANOSMBIsEnableSpotlight() != 0;
    const bool isKnown = isOn || VLIBCErrGet() == 0;
    if (evidence.areFoldersKnown && !evidence.HasFolders()) {
        return {Ok("spotlight-idle", "", "Spotlight is not needed: no folder is set")};
    }
    if (!isKnown) {
        return {Warning("spotlight-unknown", "", "Samba cannot be asked for Spotlight")
                    .Because("It is not installed, or rejects its configuration.")
                    .Fix("Install it, or fix what it complains about.", "testparm -s")};
    }
    if (!isOn) {
        return {Warning("spotlight-off", "", "Spotlight is off although folders are set")
                    .Because("The shares' users cannot search the index.")
                    .Fix("smb.conf needs \"include = registry\", and no \"spotlight\" of its own "
                         "after it.",
                         "net conf setparm global spotlight yes")};
    }
    return {Ok("spotlight-on", "", "Spotlight is on")};
}

} // namespace CTL::DOCTOR
