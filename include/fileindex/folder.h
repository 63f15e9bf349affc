#ifndef FILEINDEX_FOLDER_H
#define FILEINDEX_FOLDER_H

#include <json/value.h>
#include <string>

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// One indexed-folder setting: which folder of a share is indexed, under which display name and for
/// which file types.
///
/// In JSON a folder is an object with the strings "path" and "name" and the booleans "document",
/// "audio", "video" and "photo".
class Folder {
  public:
    /// Merges `obj` into this record: the path becomes `path`, and "name" and the four file types
    /// are taken from `obj` where it has them with the right JSON type. Other members keep their
    /// values. "path" in `obj` is never read.
    ///
    /// @param path share path ("/share/dir").
    /// @param obj  object in the form that asJson() gives; anything else counts as empty.
    /// @return false when `path` cannot be resolved, as GetFullPath() of share_path.h says; the
    ///         record is loaded all the same, with an empty `full_path`.
    FILEINDEX_API bool Load(const std::string &path, const Json::Value &obj);

    /// Load() into a record whose name and file types were first set to empty and false.
    FILEINDEX_API bool Reload(const std::string &path, const Json::Value &obj);

    /// Makes `path` the record's share path and resolves it.
    ///
    /// @return false when it cannot be resolved, as GetFullPath() of share_path.h says;
    ///         `full_path` is then empty.
    FILEINDEX_API bool SetPath(const std::string &path);

    /// @return the folder's absolute file-system path: the cached one, or `path` resolved now.
    ///         Empty when it cannot be resolved; then one line is logged. The cache is not filled.
    FILEINDEX_API std::string GetFullPath() const;

    /// @return the JSON object of this record.
    FILEINDEX_API Json::Value asJson() const;

    /// The JSON object of this record with a member "additional" that holds the facts named by
    /// `additional`, as GetAdditional() fills it; {} where it fails, with one line logged.
    FILEINDEX_API Json::Value asJson(const Json::Value &additional) const;

    /// Stores the JSON object of this record in `obj` under its path, replacing what was there.
    ///
    /// @return false, with `obj` untouched, when it is not an object.
    FILEINDEX_API bool AddToJson(Json::Value &obj) const;

    /// One additional fact about this folder.
    ///
    /// Costs what those operations cost: "status" scans the share's queue files.
    ///
    /// @param out  receives a string for the key "status" (StatusMgr::GetFolderStatus()), a boolean
    ///             for "is_valid" (CanPathBeIndexed()).
    /// @param key  which fact, compared byte for byte.
    /// @return false for any other key: `out` is untouched, the last error FILEINDEX_ERR_BAD_PARAM,
    ///         and one line is logged.
    FILEINDEX_API bool GetAdditional(Json::Value &out, const std::string &key) const;

    /// The additional facts named by the array of strings `keys`, as an object with a member each.
    /// An unknown key leaves a null member and a log line, and the next key follows.
    ///
    /// @return false when `keys` is not an array, or at its first element that is not a string: the
    ///         last error is FILEINDEX_ERR_BAD_PARAM and one line is logged. What was found before
    ///         stays in `out`.
    FILEINDEX_API bool GetAdditional(Json::Value &out, const Json::Value &keys) const;

    std::string full_path; ///< absolute path of the folder, empty until resolved; never in JSON
    std::string path;      ///< share path; the identity of the setting
    std::string name;      ///< display name
    bool document = false; ///< documents are indexed
    bool audio = false;    ///< audio files are indexed
    bool video = false;    ///< video files are indexed
    bool photo = false;    ///< photos are indexed
};

} // namespace VANO::FILEINDEX

#endif
