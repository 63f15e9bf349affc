#include "support/memory_fault.h"

#include <cerrno>
#include <cstddef>
#include <cstdlib>
#include <new>

namespace VANO::TESTS {

namespace {

// Looked at on every allocation, also before main(): nothing here has a constructor. Operations
// have one thread.
bool g_armed = false;
long g_requests = 0;
MemoryFault g_fault;

bool IsRefused() {
    if (!g_armed) {
        return false;
    }
    ++g_requests;
    return g_fault.first != 0 &&
           (g_fault.everAfter ? g_requests >= g_fault.first : g_requests == g_fault.first);
}

} // namespace

void ArmMemoryFault(const MemoryFault &fault) {
    g_fault = fault;
    g_requests = 0;
    g_armed = true;
}

long DisarmMemoryFault() {
    g_armed = false;
    return g_requests;
}

} // namespace VANO::TESTS

using VANO::TESTS::IsRefused;

#pragma GCC visibility push(default)

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define FILEINDEX_IS_SANITIZED 1
#elif defined(__has_feature)
#define FILEINDEX_IS_SANITIZED (__has_feature(address_sanitizer) || __has_feature(thread_sanitizer))
#else
#define FILEINDEX_IS_SANITIZED 0
#endif

// A sanitizer's own malloc() must stay; C++ is most of what can be refused then.
#if FILEINDEX_IS_SANITIZED

void *operator new(std::size_t size) {
    void *const memory = IsRefused() ? nullptr : std::malloc(size);
    if (memory == nullptr) {
        throw std::bad_alloc();
    }
    return memory;
}

void operator delete(void *memory) noexcept {
    std::free(memory);
}

void operator delete(void *memory, std::size_t) noexcept {
    std::free(memory);
}

#else

extern "C" {

void *__libc_malloc(std::size_t size);
void *__libc_calloc(std::size_t count, std::size_t size);
void *__libc_realloc(void *memory, std::size_t size);

void *malloc(std::size_t size) {
    if (IsRefused()) {
        errno = ENOMEM;
        return nullptr;
    }
    return __libc_malloc(size);
}

void *calloc(std::size_t count, std::size_t size) {
    if (IsRefused()) {
        errno = ENOMEM;
        return nullptr;
    }
    return __libc_calloc(count, size);
}

void *realloc(void *memory, std::size_t size) {
    if (IsRefused()) {
        errno = ENOMEM;
        return nullptr;
    }
    return __libc_realloc(memory, size);
}

} // extern "C"

#endif

#pragma GCC visibility pop
