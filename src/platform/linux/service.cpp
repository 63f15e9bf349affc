#include <cstring>
#include <string>
#include <string_view>
#include <sys/stat.h>

#include "diagnosis.h"
#include "error.h"
#include "places.h"
#include "program.h"

namespace {

using namespace VANO::PLATFORM;

constexpr int kFlagBoot = 1;
constexpr std::string_view kSambaService = "samba";
// What distributions call Samba's file server.
constexpr const char *kSambaUnits[] = {"smbd", "smb", "samba"};

// Service names become arguments and parts of paths: nothing in them may be an option or a path.
bool IsServiceName(const char *name) {
    constexpr char kAllowed[] = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789"
                                "_.:@+-";
    return name != nullptr && *name != '\0' && *name != '-' && *name != '.' &&
           name[std::strspn(name, kAllowed)] == '\0';
}

// The first directory that has the unit decides. A masked unit, a link to the null device, counts
// as none and hides those behind it.
bool HasUnit(const std::string &name) {
    struct stat info {};
    for (const char *directory : kUnitDirectories) {
        const std::string path = std::string(directory) + "/" + name + ".service";
        if (::stat(path.c_str(), &info) == 0) {
            return S_ISREG(info.st_mode);
        }
    }
    return false;
}

std::string ScriptPath(const std::string &name) {
    return std::string(kScriptDirectory) + "/" + name;
}

bool IsSystemdRunning() {
    struct stat info {};
    return ::lstat(kSystemdMarker, &info) == 0 && S_ISDIR(info.st_mode);
}

bool IsKnown(const std::string &name, bool systemd) {
    return (systemd && HasUnit(name)) || IsProgram(ScriptPath(name).c_str());
}

std::string DistributionName(const char *name, bool systemd) {
    if (name == kSambaService) {
        for (const char *unit : kSambaUnits) {
            if (IsKnown(unit, systemd)) {
                return unit;
            }
        }
    }
    return name;
}

// One service and the service control that this system has for it.
class ServiceControl {
  public:
    explicit ServiceControl(const char *name)
        : systemd_(IsSystemdRunning()), name_(DistributionName(name, systemd_)) {}

    // kErrNone when there is something to control the service with.
    [[nodiscard]] ErrorCode Check() const {
        if (!IsProgram(systemd_ ? kSystemctl : kService)) {
            return kErrNoServiceControl;
        }
        // systemd finds units in more places than can be listed here; it says itself what is none.
        return systemd_ || IsKnown(name_, systemd_) ? kErrNone : kErrNoSuchService;
    }

    [[nodiscard]] bool Do(const char *action) const {
        const RunResult result = systemd_
                                     ? Run(kSystemctl, {"--no-ask-password", action, name_.c_str()})
                                     : Run(kService, {name_.c_str(), action});
        return result == RunResult::kSuccess;
    }

    [[nodiscard]] bool Enable() const { return systemd_ ? Do("enable") : UpdateRc("enable"); }
    [[nodiscard]] bool Disable() const { return systemd_ ? Do("disable") : UpdateRc("disable"); }

  private:
    // "defaults" makes the start links where there are none yet and keeps those that are there.
    // Without the program the system has no such links to be changed.
    [[nodiscard]] bool UpdateRc(const char *action) const {
        return !IsProgram(kUpdateRc) ||
               (Run(kUpdateRc, {name_.c_str(), "defaults"}) == RunResult::kSuccess &&
                Run(kUpdateRc, {name_.c_str(), action}) == RunResult::kSuccess);
    }

    bool systemd_;
    std::string name_;
};

// Runs `operation` on the service: its result is the error code, kErrNone for success.
template <typename Operation>
int WithService(const char *name, Operation &&operation) {
    if (!IsServiceName(name)) {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    return Guarded(-1, [&] {
        const ServiceControl service(name);
        ErrorCode code = service.Check();
        if (code == kErrNone) {
            code = operation(service);
        }
        return code == kErrNone ? 0 : PLATFORM_FAIL(code);
    });
}

} // namespace

// A service that cannot be enabled is started all the same; the call fails either way.
int VLIBServiceStart(const char *name, int flag) {
    return WithService(name, [&](const ServiceControl &service) {
        const bool enabled = flag != kFlagBoot || service.Enable();
        if (!service.Do("start")) {
            return kErrServiceAction;
        }
        return enabled ? kErrNone : kErrServiceBoot;
    });
}

// A service that cannot be stopped is disabled all the same; the call fails either way.
int VLIBServiceStop(const char *name, int flag) {
    return WithService(name, [&](const ServiceControl &service) {
        const bool stopped = service.Do("stop");
        const bool disabled = flag != kFlagBoot || service.Disable();
        if (!stopped) {
            return kErrServiceAction;
        }
        return disabled ? kErrNone : kErrServiceBoot;
    });
}

int VLIBServiceRestart(const char *name) {
    return WithService(name, [](const ServiceControl &service) {
        return service.Do("restart") ? kErrNone : kErrServiceAction;
    });
}

namespace VANO::PLATFORM {

std::string ServiceCommand(const std::string &action, const std::string &service) {
    const bool systemd = IsSystemdRunning();
    if (!IsServiceName(service.c_str()) || !IsProgram(systemd ? kSystemctl : kService)) {
        return {};
    }
    const std::string name = DistributionName(service.c_str(), systemd);
    return systemd ? "systemctl " + action + " " + name : "service " + name + " " + action;
}

} // namespace VANO::PLATFORM
