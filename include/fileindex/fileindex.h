#ifndef FILEINDEX_FILEINDEX_H
#define FILEINDEX_FILEINDEX_H

/* The entry points with unmangled names, for callers in C and for dlsym(). Valid C11 and C++. */

#include <fileindex/export.h>

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Is a share, a path or a full path indexed? See IndexMgr::IsShareIndexed(), IsPathIndexed() and
 * IsFullPathIndexed().
 *
 * Each call loads the folder settings, without a lock.
 *
 * @return 1 for yes; 0 for no, for settings that cannot be loaded and for a null pointer.
 */
FILEINDEX_API int FILEIDXIsShareIndexed(const char *szShare);
FILEINDEX_API int FILEIDXIsPathIndexed(const char *szPath);
FILEINDEX_API int FILEIDXIsFullPathIndexed(const char *szFullPath);

/**
 * The directory of a share's index database. It is created, and the metadata directory above it;
 * a failure of either is logged and does not change the result.
 *
 * @param szName      the share's name.
 * @param szOutDBPath receives the path, cut to `cbOutLen` bytes with its terminating zero.
 *                    A cut path is created all the same: pass 4096 bytes.
 * @param cbOutLen    size of the buffer in bytes.
 * @return the length of the path written, or -1, with one line logged, for a bad argument (platform
 *         error 0x0D00) or an unknown share.
 */
FILEINDEX_API int FILEIDXDBPathGet(const char *szName, char *szOutDBPath, int cbOutLen);

/**
 * The event queue file of a share. The metadata directory that holds it is created, the file is
 * not. Arguments and result as for FILEIDXDBPathGet().
 */
FILEINDEX_API int FILEIDXQueuePathGet(const char *szName, char *szOutQueuePath, int cbOutLen);

#ifdef __cplusplus
}
#endif

#endif
