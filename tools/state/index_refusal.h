#ifndef FILEINDEXCTL_STATE_INDEX_REFUSAL_H
#define FILEINDEXCTL_STATE_INDEX_REFUSAL_H

#include <optional>
#include <string>

namespace CTL {

// The rule by which the library refuses to index a folder.
struct Refusal {
    const char *rule; // its name, for scripts: "mount-point"
    std::string why;  // a clause, fit for a terminal: "it is a mount point of its own"
    const char *fix;  // what to do about it
};

// None when the folder may be indexed. Looks only.
[[nodiscard]] std::optional<Refusal> RefusalOf(const std::string &sharePath);

} // namespace CTL

#endif
