#ifndef VANO_PLATFORM_H
#define VANO_PLATFORM_H

/*
 * The operations that libfileindex asks of the system it runs on. Another library provides them:
 * libvanoplatform on plain Linux, the appliance's own libraries there, a fake in tests.
 *
 * A negative result is a failure unless said otherwise; the reason is then the thread's last
 * platform error.
 */

#pragma GCC visibility push(default)
#ifdef __cplusplus
extern "C" {
#endif

/* A share record. The provider may append members of its own. */
struct _tag_VANOSHARE {
    char *name; /* as the platform spells it */
    char *path; /* absolute directory: the volume's directory, "/" and the share's name */
};

/* Finds a share by name. On success *share is a new record, to be released with VANOShareFree(). */
int VANOShareGet(const char *name, struct _tag_VANOSHARE **share);
void VANOShareFree(struct _tag_VANOSHARE *share);
/* The share that holds a full path, and the path inside that share; negative when none does. */
int VANOShareNamePathGet(const char *fullPath, char *name, int nameSize, char *path, int pathSize);

/* Share properties. */
int VLIBShareIsEncryptedGet(struct _tag_VANOSHARE *share, int *flag);
int VLIBShareIsReadOnlyGet(struct _tag_VANOSHARE *share, int *flag);
int VLIBShareIsEncryptionGet(struct _tag_VANOSHARE *share, int *flag); /* 0 on success */

/* 1 when the name is one of the platform's hidden metadata directories. */
int VANOEAIsHiddenDir(const char *name);
/* Creates a metadata directory; succeeds when it exists. */
int VANOEAMKDir(int flags, const char *path);

/* The type code of the file system that holds the path; -1 when unknown. */
int VANOGetFSType(const char *path, int flags);
/* Non-zero for the class of file systems. */
int VANOFSIsRemoteFS(int type);
int VANOFSIsImageFS(int type);

/* Non-zero when the full path lies in a share's recycle bin. */
int VANOShareIsShareRecycle(const char *fullPath);
/* 0 on success, with the flag 1 when the full path lies inside a snapshot. */
int VLIBFhsPathInSnapshot(const char *fullPath, int *flag);
/* 1 when the directory is a mount point. */
int VANOFSDirIsMntPoint(const char *fullPath);
/* Non-zero when that many bytes can still be written to the directory. 0 otherwise, with the last
 * error 0x2900 (volume full) or 0x2400 (quota exceeded), or another when the check failed. */
int VANOQuotaIsEnough(int reserved, const char *dir, long long bytes);

/* The last platform error of this thread: its code and where it was recorded. */
int VLIBCErrGet(void);
void VLIBCErrSetEx(int code, const char *file, int line);
const char *VLIBCErrorGetFile(void);
int VLIBCErrorGetLine(void);

/* Compares two UTF-8 strings without regard to case; sign as strcmp(). */
int VLIBCUnicodeUTF8StrCaseCmp(const char *a, const char *b);

/* Runs a program with a null-terminated argument vector. With wait 1: waits for it, and 0 means
 * that it ran and exited successfully. */
int VLIBCExecv(const char *path, const char *const *argv, int wait);
/* Runs a program and waits for it. The arguments follow, without the program's own name, and end
 * with two null pointers. */
int VLIBCExec(const char *path, ...);

/* Service control. The flag 1 also enables or disables the service at boot. */
int VLIBServiceStart(const char *name, int flag);
int VLIBServiceStop(const char *name, int flag);
int VLIBServiceRestart(const char *name);

/* The file-sharing service's Spotlight search. */
int VANOSMBIsEnableSpotlight(void);
#ifdef __cplusplus
int VANOSMBSetSpotlight(bool enable);
#else
int VANOSMBSetSpotlight(_Bool enable);
#endif

#ifdef __cplusplus
}
#endif
#pragma GCC visibility pop

#endif
