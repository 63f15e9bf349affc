#ifndef FILEINDEX_INDEX_RULES_H
#define FILEINDEX_INDEX_RULES_H

#include <json/value.h>
#include <string>
#include <vector>

#include <fileindex/export.h>
#include <fileindex/folder.h>

struct _tag_VANOSHARE;

// What may be indexed at all, and which folder setting governs a path. Pure decisions over the file
// system and the platform's share properties: they change nothing and take no lock.

namespace VANO::FILEINDEX {

/// @param share the platform's share record; null is refused.
/// @return false for the shares "surveillance" and "NetBackup", for encrypted and read-only shares,
///         and when a property cannot be read. Nothing is logged.
FILEINDEX_API bool CanShareBeIndexed(_tag_VANOSHARE *share);

/// @param fileName a single name, not a path.
/// @return whether the name is reserved by the system: a hidden metadata directory of the platform,
///         the library's own per-share names, or a file that desktops leave behind.
FILEINDEX_API bool IsSystemPreservedFileName(const std::string &fileName);

/// Whether a file must be left out of the index: because of a reserved name, because it lies in a
/// recycle bin or a snapshot, or on a remote, image or user-space file system. A file system of an
/// unknown type is no reason.
///
/// @param fullPath absolute file-system path.
/// @return true to leave it out.
FILEINDEX_API bool IsSkipIndex(const std::string &fullPath);

/// @return whether 10 MiB can still be written to the share. False for an unknown share, with one
///         line logged; a check that fails for another reason than a full quota or volume counts as
///         enough.
FILEINDEX_API bool IsShareSpaceEnough(const std::string &shareName);

/// Whether a folder may be indexed: it lies on a local file system of a known type, in a share that
/// may be indexed, outside recycle bins and snapshots; it is no mount point of its own; its path is
/// canonical.
///
/// A path in no share is logged twice and sets FILEINDEX_ERR_PATH; an unknown share, a mount point
/// and a path that is not canonical are logged once; every other refusal is silent.
///
/// @param fullPath absolute file-system path.
FILEINDEX_API bool CanFullPathBeIndexed(const std::string &fullPath);

/// CanFullPathBeIndexed() of a share path.
///
/// @param sharePath share path.
/// @return false when that says so, and when the path cannot be resolved: the last error is then
///         FILEINDEX_ERR_PATH and a line is logged.
FILEINDEX_API bool CanPathBeIndexed(const std::string &sharePath);

/// The setting that governs a path: the last of `folders` that is the path or contains it. In the
/// order of the settings file that is the deepest one. A setting whose path no longer resolves is
/// logged and governs nothing.
///
/// @param folders  in the order of the settings file.
/// @param fullPath absolute file-system path.
/// @return the setting as JSON, or an empty object.
FILEINDEX_API Json::Value GetMostSuitableCfg(std::vector<Folder> folders,
                                             const std::string &fullPath);

} // namespace VANO::FILEINDEX

#endif
