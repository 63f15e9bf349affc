#ifndef VANO_PLATFORM_ERROR_CODES_H
#define VANO_PLATFORM_ERROR_CODES_H

namespace VANO::PLATFORM {

// What VLIBCErrGet() answers after a failure of this library. Callers know 0x0D00, 0x2400 and
// 0x2900; the others are told apart in messages only.
enum ErrorCode : int {
    kErrNone = 0,
    kErrOutOfMemory = 0x0200,  // no memory for the answer
    kErrBadParameter = 0x0D00, // a null, empty or malformed argument

    kErrNoSuchShare = 0x1400,    // no share of that name
    kErrShareTable = 0x1500,     // the share table is missing, unreadable or malformed
    kErrNotInShare = 0x1600,     // the full path lies in no share
    kErrBufferTooSmall = 0x1700, // the answer does not fit the caller's buffer

    kErrQuotaExceeded = 0x2400, // the user's quota does not allow that many bytes
    kErrVolumeFull = 0x2900,    // the volume has no room for that many bytes
    kErrRoomCheck = 0x2A00,     // quota or free space could not be asked for

    kErrMakeDir = 0x3100,       // a directory could not be created
    kErrNotADirectory = 0x3200, // something else than a directory stands in its place
    kErrFileSystem = 0x3300,    // the file system of a path could not be asked
    kErrFsTypeUnknown = 0x3400, // the file system is of a kind that this library does not know

    kErrProgramStart = 0x4100,  // a program could not be started
    kErrProgramFailed = 0x4200, // a program ran, but was killed or exited with a failure

    kErrNoServiceControl = 0x5100, // neither systemd nor the SysV service program is present
    kErrNoSuchService = 0x5200,    // no unit or script of that name
    kErrServiceAction = 0x5300,    // the service could not be started, stopped or restarted
    kErrServiceBoot = 0x5400,      // the service could not be enabled or disabled at boot

    kErrNoSamba = 0x6100,          // Samba's tools or its configuration are missing or unusable
    kErrSambaWrite = 0x6200,       // Samba's registry configuration could not be written
    kErrRegistryNotInUse = 0x6300, // written, but smb.conf does not include the registry, or
                                   // sets the parameter again after including it

    kErrMonitorDescription = 0x7100, // a queue's description is malformed
    kErrMonitorStore = 0x7200,       // a queue's description could not be stored or removed
};

} // namespace VANO::PLATFORM

#endif
