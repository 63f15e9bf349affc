#include "terminal/times.h"

#include <algorithm>

#include "core/progress_words.h"

namespace CTL {

using VANO::FILEINDEX::IsPaused;
using VANO::FILEINDEX::kPausedWithoutEnd;

namespace {

constexpr std::size_t kMostDigits = 9; // no sum of these overflows

long long SecondsOf(char unit) {
    switch (unit) {
    case 'm':
        return 60;
    case 'h':
        return 3600;
    case 'd':
        return 24 * 3600LL;
    default:
        return 0;
    }
}

bool ReadWhole(std::tm &time, const std::string &text, const char *format) {
    const char *end = ::strptime(text.c_str(), format, &time);
    return end != nullptr && *end == '\0';
}

// mktime() makes 1 March of 30 February.
bool ToTime(std::time_t &moment, std::tm time) {
    time.tm_sec = 0;
    time.tm_isdst = -1;
    const int day = time.tm_mday;
    moment = std::mktime(&time);
    return moment != -1 && time.tm_mday == day;
}

// The first time after `now` when the clock shows the hour and minute of `today`. Where it is put
// forth it may not show them on that day, where it is put back twice, in summer time and out of it:
// both are tried, on three days.
bool NextOnClock(std::time_t &moment, std::tm today, std::time_t now) {
    today.tm_sec = 0;
    moment = -1;
    for (int attempt = 0; attempt < 6; ++attempt) {
        std::tm time = today;
        time.tm_mday += attempt / 2;
        time.tm_isdst = attempt % 2;
        const std::time_t next = std::mktime(&time);
        const bool isShown = time.tm_hour == today.tm_hour && time.tm_min == today.tm_min;
        if (isShown && next > now && (moment == -1 || next < moment)) {
            moment = next;
        }
    }
    return moment != -1;
}

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

bool ReadDuration(long long &seconds, const std::string &text) {
    long long sum = 0;
    std::size_t position = 0;
    while (position < text.size()) {
        const std::size_t end = text.find_first_not_of("0123456789", position);
        if (end == std::string::npos || end == position || end - position > kMostDigits ||
            SecondsOf(text[end]) == 0) {
            return false;
        }
        sum += std::stoll(text.substr(position, end - position)) * SecondsOf(text[end]);
        position = end + 1;
    }
    seconds = sum;
    return !text.empty();
}

bool ReadMoment(std::time_t &moment, const std::string &text, std::time_t now) {
    std::tm time{};
    for (const char *format : {"%Y-%m-%d %H:%M", "%Y-%m-%dT%H:%M"}) {
        time = {};
        if (ReadWhole(time, text, format)) {
            return ToTime(moment, time);
        }
    }
    return ::localtime_r(&now, &time) != nullptr && ReadWhole(time, text, "%H:%M") &&
           NextOnClock(moment, time, now);
}

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
