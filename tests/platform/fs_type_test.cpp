#include "platform/linux/fs_type.h"

#include <gtest/gtest.h>
#include <linux/magic.h>

#include "platform/vano_platform.h"

namespace {

using namespace VANO::PLATFORM;

enum class Kind { kLocal, kRemote, kImage };

struct Row {
    const char *name;
    unsigned long magic;
    int type;
    Kind kind;
};

// The numbers are the kernel's own wherever its headers have them.
class FsTypeTest : public ::testing::TestWithParam<Row> {};

TEST_P(FsTypeTest, IsClassified) {
    const Row &row = GetParam();
    const int type = FsTypeFromMagic(row.magic);
    EXPECT_EQ(row.type, type);
    EXPECT_EQ(row.kind == Kind::kRemote, VANOFSIsRemoteFS(type) != 0);
    EXPECT_EQ(row.kind == Kind::kImage, VANOFSIsImageFS(type) != 0);
}

INSTANTIATE_TEST_SUITE_P(
    Magics, FsTypeTest,
    ::testing::Values(
        Row{"Ext2", EXT2_SUPER_MAGIC, 1, Kind::kLocal},
        Row{"Ext4", EXT4_SUPER_MAGIC, 1, Kind::kLocal},
        Row{"Btrfs", BTRFS_SUPER_MAGIC, 2, Kind::kLocal},
        Row{"Xfs", XFS_SUPER_MAGIC, 3, Kind::kLocal}, Row{"Zfs", 0x2FC12FC1, 4, Kind::kLocal},
        Row{"F2fs", F2FS_SUPER_MAGIC, 5, Kind::kLocal},
        Row{"Reiserfs", REISERFS_SUPER_MAGIC, 7, Kind::kLocal},
        Row{"Tmpfs", TMPFS_MAGIC, 9, Kind::kLocal}, Row{"Ramfs", RAMFS_MAGIC, 10, Kind::kLocal},
        Row{"Overlay", OVERLAYFS_SUPER_MAGIC, 11, Kind::kLocal},
        Row{"Fuse", FUSE_SUPER_MAGIC, 12, Kind::kLocal},
        Row{"Vfat", MSDOS_SUPER_MAGIC, 13, Kind::kLocal},
        Row{"Exfat", EXFAT_SUPER_MAGIC, 14, Kind::kLocal},
        Row{"Ntfs3", 0x7366746E, 16, Kind::kLocal},
        Row{"Ecryptfs", ECRYPTFS_SUPER_MAGIC, 20, Kind::kLocal},
        Row{"Nfs", NFS_SUPER_MAGIC, 32, Kind::kRemote},
        Row{"Smb1", CIFS_SUPER_MAGIC, 33, Kind::kRemote},
        Row{"Smb2", SMB2_SUPER_MAGIC, 34, Kind::kRemote},
        Row{"Smbfs", SMB_SUPER_MAGIC, 35, Kind::kRemote},
        Row{"Ceph", CEPH_SUPER_MAGIC, 36, Kind::kRemote},
        Row{"NineP", V9FS_MAGIC, 37, Kind::kRemote}, Row{"Afs", AFS_SUPER_MAGIC, 38, Kind::kRemote},
        Row{"KernelAfs", AFS_FS_MAGIC, 38, Kind::kRemote},
        Row{"Coda", CODA_SUPER_MAGIC, 39, Kind::kRemote},
        Row{"Gfs2", 0x01161970, 40, Kind::kRemote},
        Row{"Ocfs2", OCFS2_SUPER_MAGIC, 41, Kind::kRemote},
        Row{"Iso9660", ISOFS_SUPER_MAGIC, 65, Kind::kImage},
        Row{"Udf", UDF_SUPER_MAGIC, 66, Kind::kImage},
        Row{"Squashfs", SQUASHFS_MAGIC, 67, Kind::kImage},
        Row{"Erofs", EROFS_SUPER_MAGIC_V1, 68, Kind::kImage},
        Row{"Cramfs", CRAMFS_MAGIC, 69, Kind::kImage},
        Row{"CramfsOtherEndian", CRAMFS_MAGIC_WEND, 69, Kind::kImage},
        // As a signed 32-bit f_type reads after widening.
        Row{"Widened", 0xFFFFFFFFFF534D42, 33, Kind::kRemote},
        Row{"Proc", PROC_SUPER_MAGIC, -1, Kind::kLocal}, Row{"Zero", 0, -1, Kind::kLocal}),
    [](const auto &row) { return row.param.name; });

TEST(FsTypeTest, TheLoopImageIsAnImageAndNotRemote) {
    EXPECT_NE(0, VANOFSIsImageFS(kFsLoopImage));
    EXPECT_EQ(0, VANOFSIsRemoteFS(kFsLoopImage));
}

} // namespace
