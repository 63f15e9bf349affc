#ifndef FILEINDEX_BENCH_ALLOCATIONS_H
#define FILEINDEX_BENCH_ALLOCATIONS_H

#include <cstddef>

namespace VANO::BENCH {

// How often this thread has asked operator new for memory, the library's own requests included.
std::size_t AllocationsOfThread();

} // namespace VANO::BENCH

#endif
