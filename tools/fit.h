#ifndef FILEINDEXCTL_FIT_H
#define FILEINDEXCTL_FIT_H

#include <cstddef>
#include <string>

namespace CTL {

// What a terminal can show.
struct Style {
    bool isUtf8 = false; // beyond ASCII
    bool hasColour = false;
};

// What standard output can show, by the locale and the environment.
[[nodiscard]] Style StyleOfOutput();

// Text that Shown() has returned, shortened in its middle to at most so many columns.
[[nodiscard]] std::string Fit(const std::string &shown, std::size_t columns, const Style &style);

// A bar that is filled from the left, so many columns wide. Full at 1 only.
[[nodiscard]] std::string Bar(double fraction, std::size_t columns, const Style &style);

} // namespace CTL

#endif
