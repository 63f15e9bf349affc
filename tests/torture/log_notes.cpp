#ifdef _FORTIFY_SOURCE
#undef _FORTIFY_SOURCE // whose inline versions stand in the way of definitions
#endif

#include "log_notes.h"

#include <array>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <syslog.h>

namespace VANO::TORTURE {

namespace {

bool Holds(const char *text, const char *part) {
    return std::strstr(text, part) != nullptr;
}

void LogText(int priority, const char *format, ...) {
    std::va_list arguments;
    va_start(arguments, format);
    ::vsyslog(priority, format, arguments);
    va_end(arguments);
}

void Note(const char *text) {
    LogNotes &notes = Notes();
    ++notes.lines;
    notes.lockFailed = notes.lockFailed || Holds(text, "Failed to lock folder");
    notes.loadFailed = notes.loadFailed || Holds(text, "Failed to load json");
    notes.eventDropped =
        notes.eventDropped || Holds(text, "try lock too many times") || Holds(text, "write fail");
}

// Hands on to the system log as well: that it is there is part of the load.
void NoteAndLog(int priority, const char *format, std::va_list arguments) {
    std::array<char, 1024> text{};
    (void)std::vsnprintf(text.data(), text.size(), format, arguments);
    Note(text.data());
    LogText(priority, "%s", text.data());
}

} // namespace

LogNotes &Notes() {
    thread_local LogNotes notes;
    return notes;
}

void ForgetNotes() {
    Notes() = LogNotes();
}

} // namespace VANO::TORTURE

// In place of the C library's, also the one that a fortified build calls.
#pragma GCC visibility push(default)
extern "C" {

void syslog(int priority, const char *format, ...) {
    std::va_list arguments;
    va_start(arguments, format);
    VANO::TORTURE::NoteAndLog(priority, format, arguments);
    va_end(arguments);
}

void __syslog_chk(int priority, int flag, const char *format, ...);
void __syslog_chk(int priority, int, const char *format, ...) {
    std::va_list arguments;
    va_start(arguments, format);
    VANO::TORTURE::NoteAndLog(priority, format, arguments);
    va_end(arguments);
}

} // extern "C"
#pragma GCC visibility pop
