#ifndef FILEINDEXCTL_TERMINAL_TERMINAL_H
#define FILEINDEXCTL_TERMINAL_TERMINAL_H

#include <cstddef>
#include <string>

// What stands behind a descriptor, and what it can show.

namespace CTL {

struct ScreenSize {
    std::size_t rows = 24;
    std::size_t columns = 80;
};

[[nodiscard]] bool IsTerminal(int fd);

// Where the terminal does not know it, the usual one.
[[nodiscard]] ScreenSize SizeOfTerminal(int fd);

// How long a line may become: a person gets lines that fit the terminal, a program lines of any
// length.
[[nodiscard]] std::size_t LineWidth(int fd);

// Whether terminals of this environment can do more than writing on.
[[nodiscard]] bool KnowsEscapeCodes();

// Whether standard output is a terminal that knows colours, and nobody has asked for none.
[[nodiscard]] bool MayUseColour();

// Whether the terminal behind `fd` is this program's to draw on. A shell that has put it into the
// background has the terminal for itself.
[[nodiscard]] bool IsInForeground(int fd);

// Few, and those that can be read on a dark and on a light background.
enum class Colour { kPlain, kBold, kGood, kBad };

// `text`, in colour where `hasColour` says so.
[[nodiscard]] std::string Coloured(const std::string &text, Colour colour, bool hasColour);

// What a terminal can show.
struct Style {
    bool isUtf8 = false; // beyond ASCII
    bool hasColour = false;
};

// What standard output can show, by the locale and the environment.
[[nodiscard]] Style StyleOfOutput();

} // namespace CTL

#endif
