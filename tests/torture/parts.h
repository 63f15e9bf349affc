#ifndef FILEINDEX_TORTURE_PARTS_H
#define FILEINDEX_TORTURE_PARTS_H

// The parts of the torture. Each writes a line for every operation with --verbose, one for every
// case that fails, and one that sums up; it returns how many cases failed.

#include <cstdint>
#include <string>

namespace VANO::TORTURE {

struct Options {
    bool isShort = false; // a sample: one fault for each call and kind of sweep
    bool verbose = false;
    std::uint32_t seed = 1;
    int seconds = 60; // of stress
    int processes = 8;
    int threads = 4;
    std::string operation; // only this one
};

long SweepCalls(const Options &options);       // every system call fails
long SweepAllocations(const Options &options); // every allocation fails
long SweepKills(const Options &options);       // a kill at every system call
long SweepPeerKills(const Options &options);   // the same for who reads the queue
long SweepPowerLoss(const Options &options);   // every state that a lost power line may leave
long Stress(const Options &options);           // many at once

} // namespace VANO::TORTURE

#endif
