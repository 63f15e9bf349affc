#ifndef FILEINDEX_BENCH_BENCHMARKS_H
#define FILEINDEX_BENCH_BENCHMARKS_H

// The benchmarks by subject. Each registers its own.

#include <string>

namespace VANO::BENCH {

void AddMembershipBenchmarks();
void AddQueueBenchmarks();
void AddSettingsBenchmarks();
void AddMemoryBenchmarks();

// The child process of peak_memory: asks for the status of the folder, prints how many bytes the
// process grew by, and returns the exit status.
int PrintPeakOfScan(const std::string &folder);

} // namespace VANO::BENCH

#endif
