#include "watch/live_output.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <poll.h>
#include <string>
#include <string_view>
#include <unistd.h>

namespace CTL {

namespace {

constexpr char kEnter[] = "\033[?1049h\033[?25l"; // the other screen, no cursor
constexpr char kLeave[] = "\033[?25h\033[?1049l";
constexpr char kHome[] = "\033[H";
constexpr char kClearLine[] = "\033[K";
constexpr char kClearBelow[] = "\033[J";
constexpr char kEnding[] = "Press q or Ctrl-C to end.";
constexpr char kCounting[] = "Counting pending events: ";

// Past the buffers of the standard streams, so that a picture is written whole.
bool Write(std::string_view text) {
    while (!text.empty()) {
        const ssize_t written = ::write(STDOUT_FILENO, text.data(), text.size());
        if (written < 0 && errno != EINTR) {
            return false;
        }
        text.remove_prefix(written > 0 ? static_cast<std::size_t>(written) : 0);
    }
    return true;
}

// Whether the keyboard can be set and read without being stopped for it.
bool HasKeyboard() {
    return ::tcgetpgrp(STDIN_FILENO) == ::getpgrp();
}

std::string FooterOf(const ServiceState &service) {
    return service.counted < 1
               ? kCounting + std::to_string(static_cast<int>(service.counted * 100)) + " %"
               : kEnding;
}

} // namespace

LiveOutput::~LiveOutput() {
    if (isEntered_ && Leave()) {
        ScreenSize size = SizeOfTerminal(STDOUT_FILENO);
        size.rows = std::string::npos / 2;
        for (const std::string &line : FrameOf(state_, size, style_)) {
            (void)Write(line + "\n"); // nobody is left to be told
        }
    }
}

std::vector<int> LiveOutput::Signals() const {
    return {SIGWINCH, SIGTSTP, SIGCONT};
}

bool LiveOutput::Show(const WatchedState &state) {
    state_ = state;
    return Draw();
}

bool LiveOutput::Handle(int signal) {
    // Whoever has the terminal until SIGCONT may change it.
    if (signal != SIGWINCH && isEntered_ && !Leave()) {
        return false;
    }
    if (signal == SIGTSTP) {
        (void)::raise(SIGSTOP); // goes on here when it is continued
    }
    return Draw();
}

bool LiveOutput::Attend() {
    return isEntered_ == IsInForeground(STDOUT_FILENO) || Draw();
}

int LiveOutput::Input() const {
    return isQuiet_ ? STDIN_FILENO : -1;
}

bool LiveOutput::ReadsTheEnd() {
    pollfd keyboard{Input(), POLLIN, 0};
    if (::poll(&keyboard, 1, 0) != 1) {
        return false;
    }
    std::array<char, 64> typed{};
    const ssize_t count = ::read(STDIN_FILENO, typed.data(), typed.size());
    if (count <= 0) {
        isQuiet_ = false; // the keyboard is gone
        return false;
    }
    return std::memchr(typed.data(), 'q', static_cast<std::size_t>(count)) != nullptr;
}

bool LiveOutput::Draw() {
    if (!IsInForeground(STDOUT_FILENO)) {
        return !isEntered_ || Leave();
    }
    return (isEntered_ || Enter()) && Write(Picture());
}

std::string LiveOutput::Picture() const {
    const ScreenSize size = SizeOfTerminal(STDOUT_FILENO);
    const std::size_t rows = size.rows > 2 ? size.rows - 2 : size.rows;
    std::vector<std::string> lines = FrameOf(state_, {rows, size.columns}, style_);
    if (rows < size.rows) {
        lines.emplace_back();
        lines.push_back(Fit(FooterOf(state_.service), size.columns, style_));
    }
    std::string picture = kHome;
    for (std::size_t i = 0; i < lines.size(); ++i) {
        // Cleared first: behind a full line the cursor still stands on its last character.
        picture += (i == 0 ? "" : "\r\n") + std::string(kClearLine) + lines[i];
    }
    if (lines.size() < size.rows) {
        picture += std::string("\r\n") + kClearBelow;
    }
    return picture;
}

bool LiveOutput::Enter() {
    isQuiet_ = HasKeyboard() && ::tcgetattr(STDIN_FILENO, &former_) == 0;
    if (isQuiet_) {
        termios quiet = former_;
        quiet.c_lflag &= ~static_cast<tcflag_t>(ECHO | ICANON);
        isQuiet_ = ::tcsetattr(STDIN_FILENO, TCSANOW, &quiet) == 0;
    }
    isEntered_ = true;
    return Write(kEnter);
}

bool LiveOutput::Leave() {
    if (isQuiet_ && HasKeyboard()) {
        (void)::tcsetattr(STDIN_FILENO, TCSAFLUSH,
                          &former_); // what was typed was not for the shell
    }
    isQuiet_ = false;
    isEntered_ = false;
    return Write(kLeave);
}

} // namespace CTL
