#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/linux/error_codes.h"
#include "platform/vano_platform.h"
#include "support/files.h"

namespace {

using namespace VANO::TESTS;
using namespace VANO::PLATFORM;

constexpr char kDirectory[] = "/volume1/photos/@eaDir";

class MetadataDirTest : public ::testing::Test {
  protected:
    void SetUp() override { MakeDirs("/volume1/photos"); }
    void TearDown() override { RemoveTree("/volume1/photos"); }
};

TEST_F(MetadataDirTest, CreatesTheDirectoryLessTheUmask) {
    const mode_t old = ::umask(027);
    EXPECT_EQ(0, VANOEAMKDir(0, kDirectory));
    ::umask(old);
    EXPECT_EQ(mode_t{0750}, ModeOf(kDirectory));
}

TEST_F(MetadataDirTest, SucceedsWhenItExists) {
    ASSERT_EQ(0, VANOEAMKDir(0, kDirectory));
    EXPECT_EQ(0, VANOEAMKDir(0, kDirectory));
}

TEST_F(MetadataDirTest, RefusesALinkToADirectory) {
    MakeDirs("/volume1/photos/elsewhere");
    ASSERT_EQ(0, ::symlink("elsewhere", kDirectory));
    EXPECT_LT(VANOEAMKDir(0, kDirectory), 0);
    EXPECT_EQ(kErrNotADirectory, VLIBCErrGet());
}

// With a slash behind it the link would be followed.
TEST_F(MetadataDirTest, RefusesADanglingLink) {
    ASSERT_EQ(0, ::symlink("elsewhere", kDirectory));
    for (const char *path : {kDirectory, "/volume1/photos/@eaDir/"}) {
        EXPECT_LT(VANOEAMKDir(0, path), 0);
        EXPECT_EQ(kErrNotADirectory, VLIBCErrGet());
        EXPECT_FALSE(Exists("/volume1/photos/elsewhere"));
    }
}

// The way to a share is the administrator's.
TEST_F(MetadataDirTest, FollowsALinkToTheShare) {
    MakeDirs("/volume1/photos/elsewhere");
    ASSERT_EQ(0, ::symlink("elsewhere", "/volume1/photos/share"));
    EXPECT_EQ(0, VANOEAMKDir(0, "/volume1/photos/share/@eaDir"));
    EXPECT_TRUE(Exists("/volume1/photos/elsewhere/@eaDir"));
}

TEST_F(MetadataDirTest, TakesAPathAsItIsWritten) {
    EXPECT_EQ(0, VANOEAMKDir(0, "/volume1/photos//@eaDir/"));
    EXPECT_TRUE(Exists(kDirectory));
    EXPECT_EQ(0, VANOEAMKDir(0, "/volume1")) << "at the top";
}

TEST_F(MetadataDirTest, RefusesAFile) {
    PutFile(kDirectory, "");
    EXPECT_LT(VANOEAMKDir(0, kDirectory), 0);
    EXPECT_EQ(kErrNotADirectory, VLIBCErrGet());
}

TEST_F(MetadataDirTest, FailsWithoutAParent) {
    EXPECT_LT(VANOEAMKDir(0, "/volume1/none/@eaDir"), 0);
    EXPECT_EQ(kErrMakeDir, VLIBCErrGet());
}

TEST_F(MetadataDirTest, FailsOnNullAndEmpty) {
    EXPECT_LT(VANOEAMKDir(0, nullptr), 0);
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_LT(VANOEAMKDir(0, ""), 0);
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
}

TEST(HiddenDirTest, OnlyTheMetadataDirectoryIsHidden) {
    EXPECT_EQ(1, VANOEAIsHiddenDir("@eaDir"));
    for (const char *name : {"@EADIR", "@eaDir ", "@eaDi", "@eaDir/", "#recycle", ""}) {
        EXPECT_EQ(0, VANOEAIsHiddenDir(name)) << name;
    }
    EXPECT_EQ(0, VANOEAIsHiddenDir(nullptr));
}

} // namespace
