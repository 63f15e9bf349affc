#ifndef FILEINDEXCTL_WATCH_FRAME_H
#define FILEINDEXCTL_WATCH_FRAME_H

#include <cstddef>
#include <string>
#include <vector>

#include "fit.h"
#include "watch/watch_output.h"

namespace CTL {

struct ScreenSize {
    std::size_t rows = 24;
    std::size_t columns = 80;
};

// One picture of what is watched: at most so many lines, none wider than the screen.
[[nodiscard]] std::vector<std::string> FrameOf(const WatchedState &state, const ScreenSize &size,
                                               const Style &style);

} // namespace CTL

#endif
