#include <optional>
#include <string>
#include <strings.h>

#include "error.h"
#include "places.h"
#include "program.h"

namespace {

using namespace VANO::PLATFORM;

// The switch in Samba's effective configuration: smb.conf and whatever it includes. None without
// Samba or with a configuration that Samba itself refuses.
std::optional<bool> EffectiveSpotlight() {
    std::string output;
    if (RunForOutput(output, kTestparm, {"-s", "--parameter-name=spotlight"}) !=
        RunResult::kSuccess) {
        return std::nullopt;
    }
    output.resize(output.find_last_not_of(" \t\r\n") + 1);
    if (::strcasecmp(output.c_str(), "yes") == 0) {
        return true;
    }
    if (::strcasecmp(output.c_str(), "no") == 0) {
        return false;
    }
    return std::nullopt;
}

int SetSpotlight(bool enable) {
    if (!IsProgram(kSambaNet)) {
        return PLATFORM_FAIL(kErrNoSamba);
    }
    const std::optional<bool> before = EffectiveSpotlight();
    if (!before) {
        return PLATFORM_FAIL(kErrNoSamba);
    }
    if (*before == enable) {
        return 0;
    }
    if (Run(kSambaNet, {"conf", "setparm", "global", "spotlight", enable ? "yes" : "no"}) !=
        RunResult::kSuccess) {
        return PLATFORM_FAIL(kErrSambaWrite);
    }
    // Samba's tool writes the registry also where smb.conf never reads it.
    return EffectiveSpotlight() == enable ? 0 : PLATFORM_FAIL(kErrRegistryNotInUse);
}

} // namespace

// 1 or 0. What cannot be asked is off, with the reason recorded.
int VANOSMBIsEnableSpotlight(void) {
    return Guarded(0, [] {
        const std::optional<bool> spotlight = EffectiveSpotlight();
        if (!spotlight) {
            (void)PLATFORM_FAIL(kErrNoSamba);
        }
        return spotlight.value_or(false) ? 1 : 0;
    });
}

int VANOSMBSetSpotlight(bool enable) {
    return Guarded(-1, [&] { return SetSpotlight(enable); });
}
