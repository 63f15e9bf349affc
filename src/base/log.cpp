#include "base/log.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <syslog.h>
#include <system_error>

namespace VANO::FILEINDEX {

namespace {

// A longer datagram does not fit the log socket's buffer and would be lost whole.
constexpr int kMaxMessageBytes = 128 * 1024;

struct FreeText {
    void operator()(char *text) const { std::free(text); }
};

} // namespace

void LogError(const char *unit, int line, const char *format, ...) {
    const int saved = errno;
    char *formatted = nullptr;
    va_list arguments;
    va_start(arguments, format);
    const bool complete = ::vasprintf(&formatted, format, arguments) >= 0;
    va_end(arguments);
    const std::unique_ptr<char, FreeText> message(complete ? formatted : nullptr);
    // Without memory the bare format still says what happened.
    ::syslog(LOG_ERR, "%s:%d %.*s", unit, line, kMaxMessageBytes,
             complete ? message.get() : format);
    errno = saved;
}

std::string ErrnoText() {
    return std::generic_category().message(errno);
}

} // namespace VANO::FILEINDEX
