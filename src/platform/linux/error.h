#ifndef VANO_PLATFORM_ERROR_H
#define VANO_PLATFORM_ERROR_H

#include <exception>
#include <utility>

#include "error_codes.h"
#include "vano_platform.h"

// Records the code for the calling thread, with the place it is written at. The value is -1, so
// that a failing function can return it.
#define PLATFORM_FAIL(code) (::VLIBCErrSetEx((code), __FILE_NAME__, __LINE__), -1)

namespace VANO::PLATFORM {

// Runs the body of a boundary function. Its callers may be C: an exception (there is no memory)
// becomes a recorded failure and the result `failed`.
template <typename Result, typename Body>
Result Guarded(Result failed, Body &&body) noexcept {
    try {
        return std::forward<Body>(body)();
    } catch (const std::exception &) {
        (void)PLATFORM_FAIL(kErrOutOfMemory);
        return failed;
    }
}

} // namespace VANO::PLATFORM

#endif
