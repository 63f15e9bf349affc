#include "terminal.h"

#include <cstdlib>
#include <limits>
#include <string_view>
#include <sys/ioctl.h>
#include <unistd.h>

namespace CTL {

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

} // namespace CTL
