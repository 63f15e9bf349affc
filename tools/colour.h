#ifndef FILEINDEXCTL_COLOUR_H
#define FILEINDEXCTL_COLOUR_H

#include <string>

namespace CTL {

// Few, and those that can be read on a dark and on a light background.
enum class Colour { kPlain, kBold, kGood, kBad };

// `text`, in colour where `hasColour` says so.
[[nodiscard]] std::string Coloured(const std::string &text, Colour colour, bool hasColour);

} // namespace CTL

#endif
