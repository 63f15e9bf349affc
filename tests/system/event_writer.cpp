// Appends events without end through the library and prints what became of each: "done N" or
// "dropped N". SIGTERM ends it.

#include <csignal>
#include <cstdarg>
#include <cstring>
#include <fileindex/config.h>
#include <fileindex/event_queue.h>
#include <iostream>
#include <string>

namespace {

volatile std::sig_atomic_t stop = 0;
bool hasDropped = false;

void Note(const char *format, std::va_list arguments) {
    char text[1024];
    (void)std::vsnprintf(text, sizeof(text), format, arguments);
    if (std::strstr(text, "try lock too many times") != nullptr ||
        std::strstr(text, "write fail") != nullptr) {
        hasDropped = true;
    }
}

} // namespace

// An event that is dropped at a busy queue counts as a success too; only the log tells.
extern "C" __attribute__((visibility("default"))) void syslog(int, const char *format, ...) {
    std::va_list arguments;
    va_start(arguments, format);
    Note(format, arguments);
    va_end(arguments);
}

extern "C" __attribute__((visibility("default"))) void __syslog_chk(int, int, const char *format,
                                                                    ...) {
    std::va_list arguments;
    va_start(arguments, format);
    Note(format, arguments);
    va_end(arguments);
}

int main() {
    (void)std::signal(SIGTERM, [](int) { stop = 1; });
    LOG_LEVEL = 7;
    for (int number = 0; stop == 0; ++number) {
        hasDropped = false;
        const std::string path = "/volume1/photos/" + std::to_string(number);
        const bool done = VANO::FILEINDEX::AddCustomEvent(131072, path, Json::Value(number));
        std::cout << (done && !hasDropped ? "done " : "dropped ") << number << std::endl;
    }
}
