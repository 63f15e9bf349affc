#ifndef FILEINDEX_BENCH_WORKLOAD_H
#define FILEINDEX_BENCH_WORKLOAD_H

// What the benchmarks work on: a private appliance with 20 shares, made up but realistic, and the
// same in every run. The first share lies on /volume2, where scripts/bench puts a directory of the
// disk, the others on /volume1 in memory. Every failure throws.

#include <cstddef>
#include <limits>
#include <string>
#include <vector>

namespace VANO::BENCH {

constexpr std::size_t kMaxFolders = 1000;
constexpr std::size_t kNoLimit = std::numeric_limits<std::size_t>::max();

// Throws std::runtime_error with `what` unless the condition holds.
void Require(bool condition, const std::string &what);

// Empty shares and no settings, behind a platform that answers from memory.
void MakeAppliance();

// The share paths of `count` folders, evenly spread over all shares: the same list is the beginning
// of every longer one. 60 to 120 bytes each, some not ASCII; none lies below another.
std::vector<std::string> FolderPaths(std::size_t count);
std::string FullPathOf(const std::string &sharePath);
// The queue of the share that the folder lies in.
std::string QueueFileOf(const std::string &sharePath);

// folder.conf with the first `count` folders; with 0 there is none.
void SetFolders(std::size_t count);
void RemoveQueues();

// The first share's queue, filled with events below some of its folders.
struct FilledQueue {
    std::string file;
    std::size_t events = 0;
    std::size_t bytes = 0;
    std::vector<std::string> waiting; // share paths of the folders that have events
    std::vector<std::string> idle;    // and of those that have none
};

// With all 1,000 folders set. A queue that is there already is kept if it has as many events.
const FilledQueue &FillQueue(std::size_t events, std::size_t bytes = kNoLimit);

} // namespace VANO::BENCH

#endif
