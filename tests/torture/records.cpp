#include "records.h"

#include <atomic>
#include <dlfcn.h>

#include "platform/vano_platform.h"

namespace VANO::TORTURE {

namespace {

std::atomic<long> g_open{0};

// The platform's own, behind the definitions below.
template <typename Function>
Function Real(const char *name) {
    return reinterpret_cast<Function>(::dlsym(RTLD_NEXT, name));
}

// Looked up before anything is tortured.
const auto g_get = Real<int (*)(const char *, _tag_VANOSHARE **)>("VANOShareGet");
const auto g_free = Real<void (*)(_tag_VANOSHARE *)>("VANOShareFree");

} // namespace

long OpenRecords() {
    return g_open.load();
}

} // namespace VANO::TORTURE

#pragma GCC visibility push(default)

int VANOShareGet(const char *name, struct _tag_VANOSHARE **share) {
    const int result = VANO::TORTURE::g_get(name, share);
    VANO::TORTURE::g_open += result >= 0 ? 1 : 0;
    return result;
}

void VANOShareFree(struct _tag_VANOSHARE *share) {
    VANO::TORTURE::g_open -= share != nullptr ? 1 : 0;
    VANO::TORTURE::g_free(share);
}

#pragma GCC visibility pop
