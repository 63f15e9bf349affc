#include "time_text.h"

#include <algorithm>

namespace CTL {

namespace {

constexpr long long kMinute = 60;
constexpr long long kHour = 60 * kMinute;
constexpr long long kDay = 24 * kHour;
// A weekday beyond these could be meant for this week or the next.
constexpr long long kPlainWeekdays = 6 * kDay;

std::string Format(const char *format, std::time_t time) {
    std::tm local{};
    char text[64] = "";
    if (::localtime_r(&time, &local) != nullptr) {
        (void)std::strftime(text, sizeof(text), format, &local);
    }
    return text;
}

std::string Rounded(long long seconds, long long unit, const char *name) {
    return std::to_string((seconds + unit / 2) / unit) + " " + name;
}

} // namespace

std::string DurationText(long long seconds) {
    seconds = std::max(seconds, 0LL);
    if (seconds < 100) {
        return Rounded(seconds, 1, "s");
    }
    if (seconds < 100 * kMinute) {
        return Rounded(seconds, kMinute, "min");
    }
    return seconds < 2 * kDay ? Rounded(seconds, kHour, "h") : Rounded(seconds, kDay, "days");
}

bool IsPaused(long long resumeTime, std::time_t now) {
    return resumeTime == kPausedWithoutEnd || resumeTime > static_cast<long long>(now);
}

std::string EndText(long long resumeTime, std::time_t now) {
    if (resumeTime == kPausedWithoutEnd) {
        return "resumed";
    }
    const long long left = resumeTime - static_cast<long long>(now);
    return Format(left < kPlainWeekdays ? "%a %H:%M" : "%F %H:%M", resumeTime);
}

std::string PauseText(long long resumeTime, std::time_t now) {
    if (!IsPaused(resumeTime, now)) {
        return "not paused";
    }
    const std::string text = "paused until " + EndText(resumeTime, now);
    return resumeTime == kPausedWithoutEnd
               ? text
               : text + ", " + DurationText(resumeTime - static_cast<long long>(now)) + " left";
}

std::string StampText(std::time_t time) {
    return Format("%FT%T%z", time);
}

} // namespace CTL
