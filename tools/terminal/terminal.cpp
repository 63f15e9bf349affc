#include "terminal/terminal.h"

#include <clocale>
#include <cstdlib>
#include <cstring>
#include <langinfo.h>
#include <limits>
#include <string_view>
#include <sys/ioctl.h>
#include <unistd.h>

namespace CTL {

namespace {

const char *CodeOf(Colour colour) {
    switch (colour) {
    case Colour::kBold:
        return "\033[1m";
    case Colour::kGood:
        return "\033[32m";
    case Colour::kBad:
        return "\033[31m";
    case Colour::kPlain:
        break;
    }
    return "";
}

} // namespace

bool IsTerminal(int fd) {
    return ::isatty(fd) == 1;
}

ScreenSize SizeOfTerminal(int fd) {
    ScreenSize size;
    winsize window{};
    (void)::ioctl(fd, TIOCGWINSZ, &window);
    size.rows = window.ws_row > 0 ? window.ws_row : size.rows;
    size.columns = window.ws_col > 0 ? window.ws_col : size.columns;
    return size;
}

std::size_t LineWidth(int fd) {
    return IsTerminal(fd) ? SizeOfTerminal(fd).columns : std::numeric_limits<std::size_t>::max();
}

bool KnowsEscapeCodes() {
    const char *terminal = std::getenv("TERM");
    return terminal != nullptr && std::string_view(terminal) != "dumb";
}

bool MayUseColour() {
    const char *none = std::getenv("NO_COLOR");
    return IsTerminal(STDOUT_FILENO) && KnowsEscapeCodes() && (none == nullptr || *none == '\0');
}

bool IsInForeground(int fd) {
    const pid_t group = ::tcgetpgrp(fd);
    return group < 0 || group == ::getpgrp(); // below 0 no shell shares it out
}

std::string Coloured(const std::string &text, Colour colour, bool hasColour) {
    return !hasColour || colour == Colour::kPlain ? text : CodeOf(colour) + text + "\033[0m";
}

Style StyleOfOutput() {
    // The tool's own texts stay as they are: nothing but the character set is asked for.
    (void)std::setlocale(LC_CTYPE, "");
    return {std::strcmp(::nl_langinfo(CODESET), "UTF-8") == 0, MayUseColour()};
}

} // namespace CTL
