#include "bench/allocations.h"

#include <cstdlib>
#include <new>

namespace {

thread_local std::size_t g_allocations = 0;

} // namespace

namespace VANO::BENCH {

std::size_t AllocationsOfThread() {
    return g_allocations;
}

} // namespace VANO::BENCH

// Stand before the C++ library's in every shared library too. The other forms of operator new end
// in this one.
void *operator new(std::size_t size) {
    ++g_allocations;
    if (void *memory = std::malloc(size != 0 ? size : 1)) {
        return memory;
    }
    throw std::bad_alloc();
}

void operator delete(void *memory) noexcept {
    std::free(memory);
}

void operator delete(void *memory, std::size_t /*size*/) noexcept {
    std::free(memory);
}
