#ifndef VANO_PLATFORM_FS_TYPE_H
#define VANO_PLATFORM_FS_TYPE_H

namespace VANO::PLATFORM {

// The type codes of VANOGetFSType(). They are this library's own, but for 12, which callers know as
// the file systems of user-space programs: those have neither quota nor reliable change events.
enum FsType : int {
    kFsUnknown = -1, // the path cannot be reached, or its file system is of no kind listed here

    // Local. Their changes are all made through this system's kernel.
    kFsExt = 1, // ext2, ext3 and ext4 are one kind to statfs()
    kFsBtrfs = 2,
    kFsXfs = 3,
    kFsZfs = 4,
    kFsF2fs = 5,
    kFsJfs = 6,
    kFsReiserfs = 7,
    kFsBcachefs = 8,
    kFsTmpfs = 9,
    kFsRamfs = 10,
    kFsOverlay = 11,
    kFsFuse = 12, // any FUSE mount: ntfs-3g, sshfs, a disk behind "fuseblk", virtiofs, ...
    kFsVfat = 13,
    kFsExfat = 14,
    kFsNtfs = 15,
    kFsNtfs3 = 16,
    kFsHfs = 17,
    kFsHfsplus = 18,
    kFsNilfs = 19,
    kFsEcryptfs = 20,

    // Remote: others change them behind this system's back.
    kFsNfs = 32,
    kFsSmb1 = 33, // the cifs module, speaking the first version of the protocol
    kFsSmb2 = 34, // the cifs module, version 2 or 3
    kFsSmbfs = 35,
    kFsCeph = 36,
    kFs9p = 37,
    kFsAfs = 38,
    kFsCoda = 39,
    kFsGfs2 = 40,
    kFsOcfs2 = 41,
    kFsLustre = 42,
    kFsGpfs = 43,
    kFsBeegfs = 44,
    kFsOrangefs = 45,
    kFsVirtualHost = 46, // a folder of the host that this virtual machine runs on

    // Disk images.
    kFsLoopImage = 64, // any disk file system that is mounted from a file
    kFsIso9660 = 65,
    kFsUdf = 66,
    kFsSquashfs = 67,
    kFsErofs = 68,
    kFsCramfs = 69,
    kFsRomfs = 70,
};

// The type for the f_type value of statfs().
FsType FsTypeFromMagic(unsigned long magic);

} // namespace VANO::PLATFORM

#endif
