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
    if (::localtime_r(&now, &time) == nullptr || !ReadWhole(time, text, "%H:%M") ||
        !ToTime(moment, time)) {
        return false;
    }
    if (moment > now) {
        return true;
    }
    // That of tomorrow, which is 23 or 25 hours away where the clock is put back or forth.
    std::tm next{};
    const std::time_t noon = now + 24 * 3600LL;
    (void)::localtime_r(&noon, &next);
    next.tm_hour = time.tm_hour;
    next.tm_min = time.tm_min;
    return ToTime(moment, next);
}

std::string TimeText(std::time_t time) {
    std::tm local{};
    char text[64] = "";
    if (::localtime_r(&time, &local) != nullptr) {
        (void)std::strftime(text, sizeof(text), "%Y-%m-%d %H:%M", &local);
    }
    return text;
}

} // namespace CTL
