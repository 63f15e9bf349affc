#ifndef FILEINDEX_TORTURE_TALLY_H
#define FILEINDEX_TORTURE_TALLY_H

#include <cstdio>
#include <string>

#include "operations.h"
#include "parts.h"

namespace VANO::TORTURE {

// Counts cases and prints those that fail, the first twenty of a part.
class Tally {
  public:
    explicit Tally(const char *part) : part_(part) {}

    void Count(const std::string &description, const std::string &complaint) {
        ++cases_;
        if (complaint.empty()) {
            return;
        }
        if (++failures_ <= kShown) {
            std::printf("%s: FAILED %s: %s\n", part_, description.c_str(), complaint.c_str());
            (void)std::fflush(stdout);
        }
    }

    [[nodiscard]] long Cases() const { return cases_; }
    [[nodiscard]] long Failures() const { return failures_; }

    // "sweep: 45 operations, 3000 system calls, 21000 cases, failures 0"
    long SumUp(const std::string &facts) const {
        std::printf("%s: %s, %ld cases, failures %ld\n", part_, facts.c_str(), cases_, failures_);
        (void)std::fflush(stdout);
        return failures_;
    }

  private:
    static constexpr long kShown = 20;

    const char *part_;
    long cases_ = 0;
    long failures_ = 0;
};

// Calls `use` with every operation that the options ask for; returns how many there were.
template <typename Use>
int ForEachOperation(const Options &options, bool writersOnly, Use use) {
    int count = 0;
    for (const Operation &operation : AllOperations()) {
        const bool isWanted = options.operation.empty() || options.operation == operation.name;
        if (isWanted && (operation.writes || !writersOnly)) {
            use(operation);
            ++count;
        }
    }
    return count;
}

} // namespace VANO::TORTURE

#endif
