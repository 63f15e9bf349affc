#ifndef VANO_PLATFORM_PLACES_H
#define VANO_PLATFORM_PLACES_H

// Every fixed place that this library reads, writes or runs.

namespace VANO::PLATFORM {

constexpr char kShareTablePath[] = "/usr/vano/etc/shares.json";
constexpr char kMonitorDirectory[] = "/usr/vano/etc/vanotifyd";

constexpr char kMountInfoPath[] = "/proc/self/mountinfo";
constexpr char kBlockDeviceDirectory[] = "/sys/dev/block";
constexpr char kNullDevice[] = "/dev/null";

constexpr char kSystemdMarker[] = "/run/systemd/system"; // there while systemd is the init system
constexpr const char *kUnitDirectories[] = {
    "/etc/systemd/system",     "/run/systemd/system", "/usr/local/lib/systemd/system",
    "/usr/lib/systemd/system", "/lib/systemd/system",
};
constexpr char kScriptDirectory[] = "/etc/init.d";
constexpr char kSystemctl[] = "/usr/bin/systemctl";
constexpr char kService[] = "/usr/sbin/service";
constexpr char kUpdateRc[] = "/usr/sbin/update-rc.d";

constexpr char kTestparm[] = "/usr/bin/testparm";
constexpr char kSambaNet[] = "/usr/bin/net";

} // namespace VANO::PLATFORM

#endif
