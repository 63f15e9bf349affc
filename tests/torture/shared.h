#ifndef FILEINDEX_TORTURE_SHARED_H
#define FILEINDEX_TORTURE_SHARED_H

#include <new>
#include <sys/mman.h>
#include <type_traits>

namespace VANO::TORTURE {

// A value in memory that this process shares with those it forks.
template <typename Value>
class Shared {
  public:
    static_assert(std::is_trivially_destructible_v<Value>);

    Shared() {
        void *const memory = ::mmap(nullptr, sizeof(Value), PROT_READ | PROT_WRITE,
                                    MAP_SHARED | MAP_ANONYMOUS, -1, 0);
        if (memory == MAP_FAILED) {
            throw std::bad_alloc();
        }
        value_ = new (memory) Value{};
    }
    Shared(const Shared &) = delete;
    Shared &operator=(const Shared &) = delete;
    ~Shared() { ::munmap(value_, sizeof(Value)); }

    Value *operator->() const { return value_; }
    Value &operator*() const { return *value_; }

  private:
    Value *value_;
};

} // namespace VANO::TORTURE

#endif
