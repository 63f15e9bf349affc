#include "support/mounts.h"

#include <cerrno>
#include <cstring>
#include <gtest/gtest.h>
#include <sys/mount.h>

#include "support/files.h"

namespace VANO::TESTS {

TinyVolume::TinyVolume(std::string directory, std::size_t bytes)
    : directory_(std::move(directory)) {
    MakeDirs(directory_);
    const std::string size = "size=" + std::to_string(bytes);
    EXPECT_EQ(::mount("tiny", directory_.c_str(), "tmpfs", 0, size.c_str()), 0)
        << std::strerror(errno);
}

TinyVolume::~TinyVolume() {
    (void)::umount2(directory_.c_str(), MNT_DETACH);
}

BindMount::BindMount(const std::string &source, std::string target) : target_(std::move(target)) {
    EXPECT_EQ(::mount(source.c_str(), target_.c_str(), nullptr, MS_BIND, nullptr), 0)
        << std::strerror(errno);
}

BindMount::~BindMount() {
    (void)::umount2(target_.c_str(), MNT_DETACH);
}

} // namespace VANO::TESTS
