#include "support/sandbox.h"

#include <array>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <unistd.h>

#include "support/check.h"

namespace VANO::FUZZ {

namespace {

constexpr char kMarker[] = "/.fileindex-sandbox";

} // namespace

void RequireSandbox() {
    if (::access(kMarker, F_OK) != 0) {
        (void)std::fprintf(stderr, "This program changes fixed places of the system: it runs in "
                                   "scripts/sandbox only, see scripts/fuzz --help.\n");
        std::_Exit(125);
    }
}

std::bitset<32> Descriptors::Open() {
    std::bitset<32> open;
    for (std::size_t fd = 0; fd < open.size(); ++fd) {
        open[fd] = ::fcntl(static_cast<int>(fd), F_GETFD) != -1;
    }
    return open;
}

// What the other ends of the first descriptors that came or went are.
std::string Descriptors::Names(const std::bitset<32> &changed) {
    std::string names;
    for (std::size_t fd = 0; fd < changed.size(); ++fd) {
        std::array<char, 256> target{};
        const std::string link = "/proc/self/fd/" + std::to_string(fd);
        if (changed[fd] && ::readlink(link.c_str(), target.data(), target.size() - 1) >= 0) {
            names += std::to_string(fd) + " is " + target.data() + "; ";
        }
    }
    return names;
}

void Descriptors::CheckNoneLeft() const {
    const std::bitset<32> now = Open();
    Check(now == open_, "no descriptor is left open, and none of others is closed",
          now == open_ ? "" : Names(now ^ open_));
}

} // namespace VANO::FUZZ
