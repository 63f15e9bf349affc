#ifdef _FORTIFY_SOURCE
#undef _FORTIFY_SOURCE // whose inline versions stand in the way of definitions
#endif

#include "support/system_log.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdarg>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <mutex>
#include <poll.h>
#include <sys/socket.h>
#include <syslog.h>
#include <thread>
#include <unistd.h>

#include "support/event_trace.h"
#include "support/sockets.h"

namespace VANO::TESTS {

namespace {

constexpr char kLogSocket[] = "/dev/log";
constexpr std::size_t kTimeStampLength = 16; // "Mmm dd hh:mm:ss "

struct Inbox {
    std::mutex mutex;
    int fd = -1;
    std::string buffer = std::string(std::size_t{1} << 20, '\0');
    std::vector<LogLine> lines;
};

Inbox &GetInbox() {
    static Inbox &inbox = *new Inbox;
    return inbox;
}

// "<11>Nov 21 10:00:00 program: text"
LogLine Parse(const std::string &datagram) {
    const std::size_t priorityEnd = datagram.find('>');
    const std::size_t program = priorityEnd + 1 + kTimeStampLength;
    const std::size_t colon = datagram.find(": ", program);
    if (datagram.empty() || datagram[0] != '<' || colon == std::string::npos) {
        return {-1, datagram};
    }
    return {std::atoi(datagram.c_str() + 1) & LOG_PRIMASK, datagram.substr(colon + 2)};
}

void Drain() {
    const KitScope kit;
    Inbox &inbox = GetInbox();
    const std::lock_guard<std::mutex> lock(inbox.mutex);
    for (;;) {
        const ssize_t got =
            ::recv(inbox.fd, inbox.buffer.data(), inbox.buffer.size(), MSG_DONTWAIT);
        if (got < 0) {
            return;
        }
        inbox.lines.push_back(Parse(inbox.buffer.substr(0, static_cast<std::size_t>(got))));
        EventTrace::Get().AddPolled("log: " + inbox.lines.back().text);
    }
}

void Listen() {
    const int fd = ListenAt(kLogSocket, SOCK_DGRAM);
    const int size = 16 << 20;
    (void)::setsockopt(fd, SOL_SOCKET, SO_RCVBUFFORCE, &size, sizeof(size));
    GetInbox().fd = fd;
}

} // namespace

SystemLog::SystemLog() {
    const KitScope kit;
    Listen();
    // Connected now, so that the connection never counts as a descriptor that a test leaked.
    ::openlog(nullptr, LOG_NDELAY, LOG_USER);
    EventTrace::Get().AddSource(Drain);
    std::thread([] {
        pollfd wait{GetInbox().fd, POLLIN, 0};
        for (;;) {
            (void)::poll(&wait, 1, -1);
            Drain();
        }
    }).detach();
}

SystemLog &SystemLog::Get() {
    static SystemLog &log = *new SystemLog;
    return log;
}

std::vector<LogLine> SystemLog::Lines() {
    Drain();
    Inbox &inbox = GetInbox();
    const std::lock_guard<std::mutex> lock(inbox.mutex);
    return std::exchange(inbox.lines, {});
}

bool IsLogText(const std::string &text, const std::string &expected) {
    const std::size_t star = expected.find(":* ");
    if (star == std::string::npos) {
        return text == expected;
    }
    const std::size_t digits = star + 1;
    std::size_t end = digits;
    while (end < text.size() && std::isdigit(static_cast<unsigned char>(text[end])) != 0) {
        ++end;
    }
    return end > digits && text.compare(0, digits, expected, 0, digits) == 0 &&
           text.substr(end) == expected.substr(star + 2);
}

void SystemLog::Expect(const std::vector<std::string> &texts, const char *file, int line) {
    const std::vector<LogLine> lines = Lines();
    const bool same =
        std::equal(lines.begin(), lines.end(), texts.begin(), texts.end(),
                   [](const LogLine &got, const std::string &expected) {
                       return got.priority == LOG_ERR && IsLogText(got.text, expected);
                   });
    if (same) {
        return;
    }
    std::string message = "expected log lines, at priority " + std::to_string(LOG_ERR) + ":\n";
    for (const std::string &text : texts) {
        message += "  " + text + "\n";
    }
    message += "the log holds:\n";
    for (const LogLine &got : lines) {
        message += "  " + std::to_string(got.priority) + " " + got.text + "\n";
    }
    ADD_FAILURE_AT(file, line) << message;
}

} // namespace VANO::TESTS

// The library's log calls come by here on their way, so that what happened before them is in the
// trace before them.

namespace {

using VSysLog = void (*)(int, const char *, va_list);

void PassOn(int priority, const char *format, va_list arguments) {
    static const auto next = reinterpret_cast<VSysLog>(::dlsym(RTLD_NEXT, "vsyslog"));
    const int reason = errno; // for "%m"
    VANO::TESTS::EventTrace::Get().Poll();
    errno = reason;
    next(priority, format, arguments);
    VANO::TESTS::EventTrace::Get().Poll();
}

} // namespace

#pragma GCC visibility push(default)
extern "C" {

void vsyslog(int priority, const char *format, va_list arguments) {
    PassOn(priority, format, arguments);
}

void syslog(int priority, const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    PassOn(priority, format, arguments);
    va_end(arguments);
}

// What a fortified build calls instead.
void __vsyslog_chk(int priority, int, const char *format, va_list arguments);
void __vsyslog_chk(int priority, int, const char *format, va_list arguments) {
    PassOn(priority, format, arguments);
}

void __syslog_chk(int priority, int, const char *format, ...);
void __syslog_chk(int priority, int, const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    PassOn(priority, format, arguments);
    va_end(arguments);
}

} // extern "C"
#pragma GCC visibility pop
