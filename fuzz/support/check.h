#ifndef FILEINDEX_FUZZ_CHECK_H
#define FILEINDEX_FUZZ_CHECK_H

#include <cstdio>
#include <cstdlib>
#include <string_view>

namespace VANO::FUZZ {

// A property that holds for every input. Where it does not, says which and ends the process, which
// libFuzzer reports and keeps the input of.
inline void Check(bool holds, const char *property, std::string_view detail = {},
                  const char *file = __builtin_FILE(), int line = __builtin_LINE()) {
    if (holds) {
        return;
    }
    (void)std::fprintf(stderr, "%s:%d: broken property: %s\n  %.*s\n", file, line, property,
                       static_cast<int>(detail.size()), detail.data());
    std::abort();
}

} // namespace VANO::FUZZ

#endif
