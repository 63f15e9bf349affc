#include <gtest/gtest.h>
#include <string>

#include "fuse_server.h"
#include "platform/linux/error_codes.h"
#include "platform/linux/fs_type.h"
#include "platform/vano_platform.h"
#include "support/mounts.h"

namespace {

using namespace VANO::TESTS;
using namespace VANO::PLATFORM;

constexpr char kPoint[] = "/tmp/fs/point";

class FileSystemTest : public ::testing::Test {
  protected:
    void SetUp() override { MakeDirs(kPoint); }
    void TearDown() override { RemoveTree("/tmp/fs"); }

    static std::string At(const char *name) { return std::string("/tmp/fs/") + name; }
};

TEST_F(FileSystemTest, Tmpfs) {
    const Mount mount("none", kPoint, "tmpfs");
    ASSERT_TRUE(mount);
    EXPECT_EQ(kFsTmpfs, VANOGetFSType(kPoint, 0));
}

TEST_F(FileSystemTest, Ramfs) {
    const Mount mount("none", kPoint, "ramfs");
    if (!mount) {
        GTEST_SKIP() << "no ramfs can be mounted here";
    }
    EXPECT_EQ(kFsRamfs, VANOGetFSType(kPoint, 0));
}

TEST_F(FileSystemTest, Overlay) {
    MakeDirs(At("upper"));
    MakeDirs(At("work"));
    MakeDirs(At("lower"));
    const Mount mount("none", kPoint, "overlay", 0,
                      "lowerdir=/tmp/fs/lower,upperdir=/tmp/fs/upper,workdir=/tmp/fs/work");
    if (!mount) {
        GTEST_SKIP() << "no overlay can be mounted here";
    }
    EXPECT_EQ(kFsOverlay, VANOGetFSType(kPoint, 0));
}

TEST_F(FileSystemTest, FuseIsTwelve) {
    const FuseServer server(kPoint);
    if (!server.IsMounted()) {
        GTEST_SKIP() << "no user-space file system can be mounted here";
    }
    EXPECT_EQ(12, VANOGetFSType(kPoint, 0));
}

// The machine's own disk is a device, but no image.
TEST_F(FileSystemTest, TheRootDiskIsNoImage) {
    const int type = VANOGetFSType("/usr/bin", 0);
    if (type != kFsExt && type != kFsXfs && type != kFsBtrfs) {
        GTEST_SKIP() << "the programs lie on no disk file system, but on type " << type;
    }
    EXPECT_EQ(0, VANOFSIsImageFS(type));
}

TEST_F(FileSystemTest, TheTypeOfAFileIsThatOfItsVolume) {
    const Mount mount("none", kPoint, "tmpfs");
    ASSERT_TRUE(mount);
    const std::string file = std::string(kPoint) + "/a/b.jpg";
    PutFile(file, "x");
    EXPECT_EQ(kFsTmpfs, VANOGetFSType(file.c_str(), 0));
}

TEST_F(FileSystemTest, AMissingPathIsUnknown) {
    EXPECT_EQ(-1, VANOGetFSType("/tmp/fs/none", 0));
    EXPECT_EQ(kErrFileSystem, VLIBCErrGet());
}

TEST_F(FileSystemTest, AnUnlistedKindIsUnknown) {
    EXPECT_EQ(-1, VANOGetFSType("/proc", 0));
    EXPECT_EQ(kErrFsTypeUnknown, VLIBCErrGet());
}

TEST_F(FileSystemTest, NullAndEmptyAreUnknown) {
    EXPECT_EQ(-1, VANOGetFSType(nullptr, 0));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_EQ(-1, VANOGetFSType("", 0));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
}

struct ImageRow {
    const char *name;
    const char *make; // makes /tmp/fs/image
    int type;
};

class ImageTest : public FileSystemTest, public ::testing::WithParamInterface<ImageRow> {};

TEST_P(ImageTest, IsRecognised) {
    PutFile("/tmp/fs/content/file", "x");
    if (!Shell(GetParam().make)) {
        GTEST_SKIP() << "no image can be made: " << ReadText("/tmp/shell.out");
    }
    const Mount mount(At("image"), kPoint);
    if (!mount) {
        GTEST_SKIP() << "the image cannot be mounted: " << ReadText("/tmp/shell.out");
    }
    const int type = VANOGetFSType(kPoint, 0);
    EXPECT_EQ(GetParam().type, type);
    EXPECT_NE(0, VANOFSIsImageFS(type));
}

INSTANTIATE_TEST_SUITE_P(
    Images, ImageTest,
    ::testing::Values(
        ImageRow{"Ext4", "truncate -s 8M /tmp/fs/image && mkfs.ext4 -q /tmp/fs/image",
                 kFsLoopImage},
        ImageRow{"Btrfs", "truncate -s 128M /tmp/fs/image && mkfs.btrfs -q /tmp/fs/image",
                 kFsLoopImage},
        ImageRow{"Xfs", "truncate -s 320M /tmp/fs/image && mkfs.xfs -q /tmp/fs/image",
                 kFsLoopImage},
        ImageRow{"Vfat", "truncate -s 8M /tmp/fs/image && mkfs.vfat /tmp/fs/image", kFsLoopImage},
        ImageRow{"Squashfs", "mksquashfs /tmp/fs/content /tmp/fs/image -quiet -no-progress",
                 kFsSquashfs},
        ImageRow{"Erofs", "mkfs.erofs /tmp/fs/image /tmp/fs/content", kFsErofs},
        ImageRow{"Iso9660", "genisoimage -quiet -o /tmp/fs/image /tmp/fs/content", kFsIso9660}),
    [](const auto &row) { return row.param.name; });

// A btrfs subvolume has a device number of its own, which no mount shows.
TEST_F(FileSystemTest, ASubvolumeOfAnImageIsAnImage) {
    if (!Shell("truncate -s 128M /tmp/fs/image && mkfs.btrfs -q /tmp/fs/image")) {
        GTEST_SKIP() << "no btrfs image can be made";
    }
    const Mount mount(At("image"), kPoint);
    const std::string volume = std::string(kPoint) + "/volume";
    if (!mount || !Shell("btrfs subvolume create " + volume)) {
        GTEST_SKIP() << "the image cannot be mounted: " << ReadText("/tmp/shell.out");
    }
    EXPECT_EQ(kFsLoopImage, VANOGetFSType(volume.c_str(), 0));
}

TEST_F(FileSystemTest, APartitionOfAnImageIsAnImage) {
    if (!Shell("truncate -s 64M /tmp/fs/image && losetup --show -f /tmp/fs/image")) {
        GTEST_SKIP() << "no loop device can be had: " << ReadText("/tmp/shell.out");
    }
    std::string loop = ReadText("/tmp/shell.out");
    loop.resize(loop.find('\n'));
    // Told to the kernel by hand, in sectors. The private /dev does not follow the kernel's, so the
    // node is made by hand too.
    const bool mounted =
        Shell("addpart " + loop + " 1 2048 100000 && IFS=: read -r major minor </sys/class/block/" +
              loop.substr(5) + "p1/dev && mknod /tmp/fs/node b $major $minor &&" +
              " mkfs.ext4 -q /tmp/fs/node && mount /tmp/fs/node " + kPoint);
    const std::string reason = ReadText("/tmp/shell.out");
    const int type = VANOGetFSType(kPoint, 0);
    if (mounted) {
        EXPECT_TRUE(Shell(std::string("umount ") + kPoint));
    }
    (void)Shell("delpart " + loop + " 1"); // fails when it was never added
    EXPECT_TRUE(Shell("losetup -d " + loop));
    if (!mounted) {
        GTEST_SKIP() << "the partition cannot be mounted: " << reason;
    }
    EXPECT_EQ(kFsLoopImage, type);
}

TEST_F(FileSystemTest, AMountedDirectoryIsAMountPoint) {
    EXPECT_EQ(0, VANOFSDirIsMntPoint(kPoint));
    {
        const Mount mount("none", kPoint, "tmpfs");
        ASSERT_TRUE(mount);
        EXPECT_EQ(1, VANOFSDirIsMntPoint(kPoint));
        MakeDirs(std::string(kPoint) + "/inside");
        EXPECT_EQ(0, VANOFSDirIsMntPoint((std::string(kPoint) + "/inside").c_str()));
    }
    EXPECT_EQ(0, VANOFSDirIsMntPoint(kPoint));
}

TEST_F(FileSystemTest, ABoundDirectoryIsAMountPoint) {
    MakeDirs(At("other"));
    const Mount mount(At("other"), kPoint, nullptr, MS_BIND);
    ASSERT_TRUE(mount);
    EXPECT_EQ(1, VANOFSDirIsMntPoint(kPoint));
    EXPECT_EQ(0, VANOFSDirIsMntPoint(At("other").c_str()));
}

TEST_F(FileSystemTest, ALinkToAMountPointIsNone) {
    const Mount mount("none", kPoint, "tmpfs");
    ASSERT_TRUE(mount);
    ASSERT_TRUE(Shell("ln -s /tmp/fs/point /tmp/fs/link"));
    EXPECT_EQ(0, VANOFSDirIsMntPoint("/tmp/fs/link"));
}

TEST_F(FileSystemTest, ABoundFileIsNoDirectory) {
    PutFile(At("file"), "a");
    PutFile(At("other"), "b");
    const Mount mount(At("other"), At("file"), nullptr, MS_BIND);
    ASSERT_TRUE(mount);
    EXPECT_EQ(0, VANOFSDirIsMntPoint(At("file").c_str()));
}

TEST_F(FileSystemTest, AMissingMountPointIsAFailure) {
    EXPECT_LT(VANOFSDirIsMntPoint("/tmp/fs/none"), 0);
    EXPECT_EQ(kErrFileSystem, VLIBCErrGet());
    EXPECT_LT(VANOFSDirIsMntPoint(nullptr), 0);
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
}

} // namespace
