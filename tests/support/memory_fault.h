#ifndef FILEINDEX_TESTS_MEMORY_FAULT_H
#define FILEINDEX_TESTS_MEMORY_FAULT_H

// Memory that is refused on demand, to everybody in this process: malloc() and its relatives answer
// null, and so `new` throws. Under a sanitizer, which has an allocator of its own, only `new`
// fails.

namespace VANO::TESTS {

struct MemoryFault {
    long first = 0;         // which request fails, counted from 1; 0: none does
    bool everAfter = false; // and all that follow
};

void ArmMemoryFault(const MemoryFault &fault);

// How many requests there were since then.
long DisarmMemoryFault();

} // namespace VANO::TESTS

#endif
