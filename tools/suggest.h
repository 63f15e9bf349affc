#ifndef FILEINDEXCTL_SUGGEST_H
#define FILEINDEXCTL_SUGGEST_H

#include <string>
#include <vector>

namespace CTL {

// The one of the words that was meant by one that is cut short or mistyped; empty when none is
// near. A letter that is missing, surplus, wrong, or has changed places with its neighbour is one
// step.
[[nodiscard]] std::string Nearest(const std::string &typed, const std::vector<std::string> &words);

} // namespace CTL

#endif
