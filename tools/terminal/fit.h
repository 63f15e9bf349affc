#ifndef FILEINDEXCTL_TERMINAL_FIT_H
#define FILEINDEXCTL_TERMINAL_FIT_H

#include <cstddef>
#include <string>

#include "terminal/terminal.h"

namespace CTL {

// Text that Shown() has returned, shortened in its middle to at most so many columns.
[[nodiscard]] std::string Fit(const std::string &shown, std::size_t columns, const Style &style);

// A bar that is filled from the left, so many columns wide. Full at 1 only.
[[nodiscard]] std::string Bar(double fraction, std::size_t columns, const Style &style);

} // namespace CTL

#endif
