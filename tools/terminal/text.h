#ifndef FILEINDEXCTL_TERMINAL_TEXT_H
#define FILEINDEXCTL_TERMINAL_TEXT_H

#include <cstddef>
#include <string>

namespace CTL {

// Text from elsewhere, fit for one line of a terminal: control characters, line breaks of any kind,
// characters that change the writing direction, bytes that are not UTF-8, and the backslash itself
// are shown as escapes (\n, \x1b, \u202e, \\).
[[nodiscard]] std::string Shown(const std::string &text);

// The same JSON text with those characters escaped that a JSON writer leaves as they are though
// Shown() escapes them: \u007f, \u202e. Bytes that are not UTF-8 stay.
[[nodiscard]] std::string ShownJson(const std::string &json);

// How many columns a terminal needs for text that Shown() has returned.
[[nodiscard]] std::size_t Columns(const std::string &shown);

// `shown` with spaces after it, so that it takes at least that many columns.
[[nodiscard]] std::string Padded(const std::string &shown, std::size_t columns);

// Text that Shown() has returned, broken between words so that no line takes more columns, unless a
// word does. Lines after the first begin with `indent` spaces.
[[nodiscard]] std::string Wrapped(const std::string &shown, std::size_t columns,
                                  std::size_t indent);

// "1 folder", "2 folders".
[[nodiscard]] std::string Count(std::size_t number, const std::string &noun);

} // namespace CTL

#endif
