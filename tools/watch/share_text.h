#ifndef FILEINDEXCTL_WATCH_SHARE_TEXT_H
#define FILEINDEXCTL_WATCH_SHARE_TEXT_H

#include <string>

#include "status/progress.h"
#include "status/service.h"

namespace CTL {

// "45 %"; never 100 as long as something waits.
[[nodiscard]] std::string PercentText(const Progress &progress);

// In a few words how the work on a share goes: "finished", "2 min left", "paused" ...; empty when
// there is nothing to say yet.
[[nodiscard]] std::string OutlookText(const ServiceState &service, const ShareState &share,
                                      const Progress &progress);

} // namespace CTL

#endif
