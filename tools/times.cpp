#include "times.h"

#include <cctype>

namespace CTL {

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

} // namespace CTL
