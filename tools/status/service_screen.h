#ifndef FILEINDEXCTL_STATUS_SERVICE_SCREEN_H
#define FILEINDEXCTL_STATUS_SERVICE_SCREEN_H

#include <cstddef>
#include <string>
#include <vector>

#include "colour.h"
#include "grid.h"
#include "status/service.h"

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

} // namespace CTL

#endif
