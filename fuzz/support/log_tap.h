#ifndef FILEINDEX_FUZZ_LOG_TAP_H
#define FILEINDEX_FUZZ_LOG_TAP_H

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace VANO::FUZZ {

// The executable's own syslog() stands before the C library's: what is logged is formatted, so that
// the sanitizers see it, and kept; nothing leaves the process.
class LogTap {
  public:
    // The lines since the last look, "<unit>:<line> <message>".
    static std::vector<std::string> Take();

    // How many of the lines hold the text.
    static std::size_t Count(const std::vector<std::string> &lines, std::string_view text);
};

} // namespace VANO::FUZZ

#endif
