#include "support/log_tap.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <syslog.h>
#include <utility>

namespace VANO::FUZZ {

namespace {

std::vector<std::string> &Lines() {
    static std::vector<std::string> &lines = *new std::vector<std::string>;
    return lines;
}

void Keep(const char *format, va_list arguments) {
    char *text = nullptr;
    if (::vasprintf(&text, format, arguments) >= 0) {
        Lines().emplace_back(text);
        std::free(text);
    }
}

} // namespace

std::vector<std::string> LogTap::Take() {
    return std::exchange(Lines(), {});
}

std::size_t LogTap::Count(const std::vector<std::string> &lines, std::string_view text) {
    return static_cast<std::size_t>(
        std::count_if(lines.begin(), lines.end(), [&](const std::string &line) {
            return line.find(text) != std::string::npos;
        }));
}

} // namespace VANO::FUZZ

extern "C" {

__attribute__((visibility("default"))) void syslog(int /*priority*/, const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    VANO::FUZZ::Keep(format, arguments);
    va_end(arguments);
}

// What a fortified build calls instead.
__attribute__((visibility("default"))) void __syslog_chk(int /*priority*/, int /*flag*/,
                                                         const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    VANO::FUZZ::Keep(format, arguments);
    va_end(arguments);
}
}
