#include "platform/linux/mount_source.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <string>

#include "base/unique_fd.h"
#include "support/mounts.h"

namespace {

using namespace VANO::TESTS;
using VANO::FILEINDEX::UniqueFd;

constexpr char kPoint[] = "/tmp/source/point - x"; // looks like the table's own separator

TEST(MountSourceTest, IsTheSourceAsItWasGiven) {
    MakeDirs(kPoint);
    for (const char *source : {"plain", "with space", "back\\slash", "a\tb\nc", "a - b", "\\040"}) {
        const Mount mount(source, kPoint, "tmpfs");
        ASSERT_TRUE(mount);
        const UniqueFd file(::open(kPoint, O_PATH | O_CLOEXEC));
        ASSERT_TRUE(file);
        EXPECT_EQ(source, VANO::PLATFORM::MountSourceOf(file.Get()));
    }
}

TEST(MountSourceTest, IsThatOfTheUppermostMount) {
    MakeDirs(kPoint);
    const Mount below("below", kPoint, "tmpfs");
    const Mount above("above", kPoint, "tmpfs");
    ASSERT_TRUE(below && above);
    const UniqueFd file(::open(kPoint, O_PATH | O_CLOEXEC));
    EXPECT_EQ("above", VANO::PLATFORM::MountSourceOf(file.Get()));
}

TEST(MountSourceTest, IsEmptyForABadDescriptor) {
    EXPECT_EQ("", VANO::PLATFORM::MountSourceOf(-1));
}

} // namespace
