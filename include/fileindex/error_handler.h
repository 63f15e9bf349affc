#ifndef FILEINDEX_ERROR_HANDLER_H
#define FILEINDEX_ERROR_HANDLER_H

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// Why the last failing operation of this process failed.
enum _tag_fileindex_err_ : int {
    FILEINDEX_ERR_NONE = 0,           ///< nothing has failed yet
    FILEINDEX_ERR_BAD_PARAM = 1,      ///< a request parameter is missing, mistyped or unknown
    FILEINDEX_ERR_PATH = 2,           ///< a share or path cannot be resolved to a full path
    FILEINDEX_ERR_RESERVED = 3,       ///< not in use
    FILEINDEX_ERR_NO_SUCH_FOLDER = 4, ///< no folder setting has the path that was asked for
    FILEINDEX_ERR_FOLDER_LIMIT = 5,   ///< one more folder setting would exceed the limit of 1000
    FILEINDEX_ERR_LOAD = 6,           ///< a settings file exists but cannot be read as JSON
    FILEINDEX_ERR_SAVE = 7,           ///< a settings file cannot be written
    FILEINDEX_ERR_MALFORMED = 8,      ///< a settings file is JSON but not of the expected shape
    FILEINDEX_ERR_LOCK = 9            ///< a lock file cannot be opened or locked
};

/// The process-wide last error of the library.
///
/// Failing operations whose description names a code overwrite it, others leave it alone, and none
/// resets it to FILEINDEX_ERR_NONE: to tell whether a call set it, reset it before the call. It is
/// a plain variable: with several threads the last writer wins.
class ErrorHandler {
  public:
    /// Makes `code` the last error.
    FILEINDEX_API static void SetError(_tag_fileindex_err_ code);

    /// @return the last error; FILEINDEX_ERR_NONE when nothing has failed in this process.
    FILEINDEX_API static _tag_fileindex_err_ GetError();

    /// The last error itself.
    FILEINDEX_API static _tag_fileindex_err_ g_error_code;
};

} // namespace VANO::FILEINDEX

#endif
