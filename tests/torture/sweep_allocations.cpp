#include <random>

#include "parts.h"
#include "tally.h"
#include "trial.h"

namespace VANO::TORTURE {

long SweepAllocations(const Options &options) {
    Tally tally("allocations");
    std::mt19937 random(options.seed);
    long allocations = 0;
    const int operations = ForEachOperation(options, false, [&](const Operation &operation) {
        const Trial trial(operation);
        const long step = options.isShort ? 37 : 1;
        for (const bool everAfter : {false, true}) {
            long requests = 0;
            long first = options.isShort ? 1 + static_cast<long>(random() % 37) : 1;
            do { // until a run meets no more
                const std::string complaint = trial.Run({first, everAfter}, requests);
                tally.Count(std::string(operation.name) + ", allocation " + std::to_string(first) +
                                (everAfter ? ", ever after" : ", once"),
                            complaint);
                first += step;
            } while (first - step <= requests);
            allocations += everAfter ? 0 : requests;
            if (options.verbose && !everAfter) {
                std::printf("  %s: %ld allocations\n", operation.name, requests);
            }
        }
    });
    return tally.SumUp(std::to_string(operations) + " operations, " + std::to_string(allocations) +
                       " allocations");
}

} // namespace VANO::TORTURE
