#ifndef FILEINDEX_BASE_NO_THROW_H
#define FILEINDEX_BASE_NO_THROW_H

#include <exception>
#include <utility>

namespace VANO::FILEINDEX {

// The body's result, or `failed` when it throws: for what is called from C, and for queries.
template <typename Result, typename Body>
[[nodiscard]] Result NoThrow(Result failed, Body &&body) noexcept {
    try {
        return std::forward<Body>(body)();
    } catch (const std::exception &) {
        return failed;
    }
}

} // namespace VANO::FILEINDEX

#endif
