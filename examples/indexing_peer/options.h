#ifndef INDEXING_PEER_OPTIONS_H
#define INDEXING_PEER_OPTIONS_H

#include <chrono>
#include <optional>
#include <string>
#include <vector>

namespace peer {

struct Options {
    std::vector<std::string> queues; // empty: those of all shares
    std::chrono::milliseconds interval{200};
};

// Empty when there is nothing left to do: `status` is then what to exit with, and the help text or
// the mistake has been written.
[[nodiscard]] std::optional<Options> ParseOptions(int argc, char **argv, int &status);

} // namespace peer

#endif
