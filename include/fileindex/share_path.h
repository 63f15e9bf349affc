#ifndef FILEINDEX_SHARE_PATH_H
#define FILEINDEX_SHARE_PATH_H

#include <json/value.h>
#include <string>

#include <fileindex/export.h>

// Two forms of a location: a share path is "/" + share name + optionally "/" + the path inside the
// share; a full path is the absolute file-system path of the same place. Strings are bytes and are
// compared byte for byte.

namespace VANO::FILEINDEX {

/// The share's name in a share path. The first character is dropped whatever it is.
///
/// @return false for an empty path; `name` is then untouched.
FILEINDEX_API bool GetShareNameByPath(std::string &name, const std::string &sharePath);

/// The full path of a share path: the directory that holds the share, and `sharePath` as given.
///
/// Costs one share lookup of the platform.
///
/// @return false, with `fullPath` empty, when the path is empty (one line is logged, no error set)
///         or the share is unknown (last error FILEINDEX_ERR_PATH, nothing logged).
FILEINDEX_API bool GetFullPath(std::string &fullPath, const std::string &sharePath);

/// The share that a full path lies in, and the path in the platform's form.
///
/// @return false, with the outputs untouched, when it lies in no share; the last error is then
///         FILEINDEX_ERR_PATH and one line is logged.
FILEINDEX_API bool GetShareNamePathByFullPath(std::string &name, std::string &path,
                                              const std::string &fullPath);

/// @return `sharePath` with its first component replaced; empty for an empty path.
FILEINDEX_API std::string ReplaceShareName(const std::string &sharePath,
                                           const std::string &newShareName);

/// @return whether `str` begins with `prefix`. The comparison ends at a zero byte in both.
FILEINDEX_API bool StringStartWith(const std::string &str, const std::string &prefix);

/// @return whether a regular file stands at the path; a symbolic link to one does not count.
FILEINDEX_API bool IsFileExist(const std::string &path);

/// @return whether a directory stands at the path; a symbolic link to one does not count.
FILEINDEX_API bool IsDirExist(const std::string &path);

/// Reads the boolean member `key` of a JSON object; numbers are not converted.
///
/// @return false, with `out` untouched, when `obj` is no object or has no such boolean.
FILEINDEX_API bool RetrieveBoolFromJsonObj(bool &out, const std::string &key,
                                           const Json::Value &obj);

/// Reads the string member `key` of a JSON object.
///
/// @return false, with `out` untouched, when `obj` is no object or has no such string.
FILEINDEX_API bool RetrieveStringFromJsonObj(std::string &out, const std::string &key,
                                             const Json::Value &obj);

} // namespace VANO::FILEINDEX

#endif
