#ifndef FILEINDEXCTL_WATCH_SERVICE_TEXT_H
#define FILEINDEXCTL_WATCH_SERVICE_TEXT_H

#include <cstddef>
#include <string>
#include <vector>

#include "state/queue_pace.h"
#include "state/service_state.h"
#include "terminal/grid.h"

// How the service is, for people: what `status` shows once and `watch` again and again.

namespace CTL {

struct HeadLine {
    std::string label; // "Daemon:   "
    std::string text;
    Colour colour;
};

[[nodiscard]] std::vector<HeadLine> HeadOf(const ServiceState &service);

// The folders, without the columns that say least where a screen has no room for them.
[[nodiscard]] Grid FoldersOf(const ServiceState &service, std::size_t screen);

// "45 %"; never 100 as long as something waits.
[[nodiscard]] std::string PercentText(const QueuePace &progress);

// In a few words how the work on a share goes: "finished", "2 min left", "paused" ...; empty when
// there is nothing to say yet.
[[nodiscard]] std::string OutlookText(const ServiceState &service, const ShareState &share,
                                      const QueuePace &progress);

} // namespace CTL

#endif
