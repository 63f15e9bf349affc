#ifndef FILEINDEXCTL_WATCH_FRAME_H
#define FILEINDEXCTL_WATCH_FRAME_H

#include <string>
#include <vector>

#include "terminal/fit.h"
#include "terminal/terminal.h"
#include "watch/watch_output.h"

namespace CTL {

// One picture of what is watched: at most so many lines, none wider than the screen.
[[nodiscard]] std::vector<std::string> FrameOf(const WatchedState &state, const ScreenSize &size,
                                               const Style &style);

} // namespace CTL

#endif
