#ifndef FILEINDEXCTL_STATE_REFUSAL_TEXT_H
#define FILEINDEXCTL_STATE_REFUSAL_TEXT_H

#include <optional>
#include <string>

namespace CTL {

// The rule by which the library refuses to index a folder, in words.
struct Refusal {
    const char *rule; // its name, for scripts: "mount-point"
    std::string why;  // a clause, fit for a terminal: "it is a mount point"
    const char *fix;  // what to do about it
};

// None when the folder may be indexed. Looks only; the last errors are cleared.
[[nodiscard]] std::optional<Refusal> RefusalOf(const std::string &sharePath);

} // namespace CTL

#endif
