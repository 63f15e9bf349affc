#ifndef FILEINDEX_BENCH_APPLIANCE_H
#define FILEINDEX_BENCH_APPLIANCE_H

// The private appliance that the benchmarks run on (scripts/sandbox): 20 shares, of which the first
// lies on /volume2, where scripts/bench puts a directory of the disk, and the others on /volume1 in
// memory. Every failure throws.

#include <cstddef>
#include <functional>
#include <map>
#include <string>
#include <vector>

namespace VANO::BENCH {

// The directory of each share by the share's name.
const std::map<std::string, std::string, std::less<>> &ShareDirectories();

std::string FullPathOf(const std::string &sharePath);
std::string QueueFileOf(const std::string &share);

// Empty shares and no settings. Anything but a private namespace is refused.
void MakeAppliance();

void RemoveSettings();
void RemoveQueues();

// folder.conf with the first `count` of FolderPaths(), as the library writes it.
void SetFolders(std::size_t count);

// A queue of one share that was filled with events below some of its folders.
struct FilledQueue {
    std::string share;
    std::string file;
    std::size_t events = 0;
    std::size_t bytes = 0;
    std::vector<std::string> waiting; // share paths of the folders that have events
    std::vector<std::string> idle;    // and of those that have none
};

// Fills the queue of the first share, whose folders' directories are made; the settings hold all
// 1,000 folders. A queue that is there already is kept when it has as many events.
const FilledQueue &FillQueue(std::size_t events);
// The same for a queue of about that many bytes.
const FilledQueue &FillQueueTo(std::size_t bytes);

// A file's whole content.
std::string ContentOf(const std::string &path);

} // namespace VANO::BENCH

#endif
