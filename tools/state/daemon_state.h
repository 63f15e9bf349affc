#ifndef FILEINDEXCTL_STATE_DAEMON_STATE_H
#define FILEINDEXCTL_STATE_DAEMON_STATE_H

#include "base/unique_fd.h"
#include "terminal/terminal.h"

// The indexing daemon, as far as its command socket tells.

namespace CTL {

// Connects a local socket to the daemon's: 0, or the errno.
[[nodiscard]] int ConnectToDaemon(const VANO::FILEINDEX::UniqueFd &socket);

enum class DaemonState { kRunning, kStopped, kUnknown };

// Whether a living process listens there. The daemon does not notice, so that this is not asked:
// does it answer? One that a signal has stopped still listens.
[[nodiscard]] DaemonState AskDaemonState();

// "running", "stopped", "unknown"
[[nodiscard]] const char *NameOf(DaemonState state);

[[nodiscard]] Colour ColourOf(DaemonState state);

} // namespace CTL

#endif
