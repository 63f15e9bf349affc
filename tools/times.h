#ifndef FILEINDEXCTL_TIMES_H
#define FILEINDEXCTL_TIMES_H

#include <ctime>
#include <string>

// Times that a user types; time_text.h has those that are shown.

namespace CTL {

// Reads "8h", "90m", "2d" or several of them, "1h30m", into seconds.
[[nodiscard]] bool ReadDuration(long long &seconds, const std::string &text);

// Reads "07:30", the next time that the clock shows it, or "2026-11-22 07:30", in local time.
[[nodiscard]] bool ReadMoment(std::time_t &moment, const std::string &text, std::time_t now);

} // namespace CTL

#endif
