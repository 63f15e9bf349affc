#ifndef FILEINDEXCTL_TERMINAL_TIMES_H
#define FILEINDEXCTL_TERMINAL_TIMES_H

#include <ctime>
#include <string>

// Times as people type and read them.

namespace CTL {

// Reads "8h", "90m", "2d" or several of them, "1h30m", into seconds.
[[nodiscard]] bool ReadDuration(long long &seconds, const std::string &text);

// Reads "07:30", the next time that the clock shows it, or "2026-11-22 07:30", in local time.
[[nodiscard]] bool ReadMoment(std::time_t &moment, const std::string &text, std::time_t now);

// "45 s", "20 min", "6 h" or "3 days": one rounded number; what is negative counts as nothing.
[[nodiscard]] std::string DurationText(long long seconds);

// Until when a pause with this "resume_time" lasts: "Sat 07:30" in local time, with the date where
// the day is not one of the next six, or "resumed".
[[nodiscard]] std::string EndText(long long resumeTime, std::time_t now);

// "paused until Sat 07:30, 6 h left", "paused until resumed" or "not paused".
[[nodiscard]] std::string PauseText(long long resumeTime, std::time_t now);

// "2026-11-21T13:22:00+0100", for logs and scripts.
[[nodiscard]] std::string StampText(std::time_t time);

} // namespace CTL

#endif
