#ifndef FILEINDEXCTL_DAEMON_STATE_H
#define FILEINDEXCTL_DAEMON_STATE_H

#include "colour.h"

namespace CTL {

enum class DaemonState { kRunning, kStopped, kUnknown };

// Whether a living process listens on the daemon's command socket. The daemon does not notice.
[[nodiscard]] DaemonState AskDaemonState();

// "running", "stopped", "unknown"
[[nodiscard]] const char *NameOf(DaemonState state);

[[nodiscard]] Colour ColourOf(DaemonState state);

} // namespace CTL

#endif
