#ifndef FILEINDEX_FOLDERS_H
#define FILEINDEX_FOLDERS_H

#include <json/value.h>
#include <map>
#include <string>
#include <vector>

#include <fileindex/config.h>
#include <fileindex/export.h>
#include <fileindex/folder.h>

namespace VANO::FILEINDEX {

/// The folder settings file: every indexed-folder setting, at most 1000, keyed by share path.
///
/// folder.conf is one JSON object with a member per setting, named by the folder's share path. All
/// operations but Load() and Save() work on the records in memory; none takes the lock.
class FILEINDEX_API Folders : public Config {
  public:
    ~Folders() override;

    /// Reads the file into `folders` of a fresh object. A missing file means no settings; a folder
    /// whose path no longer resolves is kept.
    ///
    /// @return false when the file cannot be read (FILEINDEX_ERR_LOAD) or is not an object
    ///         (FILEINDEX_ERR_MALFORMED); one line is logged.
    bool Load() override;

    /// Writes `folders` to the file, as Config::SaveJson() does.
    bool Save() override;

    /// @return "/tmp/fileidx_cfg_folder.lock"
    std::string GetLockPath() const override;

    /// @return "/usr/vano/etc/fileindex/folder.conf"
    std::string GetPath() const override;

    /// One setting as JSON.
    ///
    /// @param out  receives the object that Folder::asJson() gives.
    /// @param path share path, compared byte for byte.
    /// @return false when there is none: `out` is untouched, the last error
    ///         FILEINDEX_ERR_NO_SUCH_FOLDER, and one line is logged.
    bool Get(Json::Value &out, const std::string &path);

    /// The settings of one share, or all when `share` is empty, in byte order of their paths. A
    /// setting whose share cannot be told is left out.
    ///
    /// @param out   receives copies of the records; what it held is dropped.
    /// @param share share name, compared byte for byte.
    /// @return always true.
    bool List(std::vector<Folder> &out, const std::string &share);

    /// All settings in byte order of their paths. @return always true.
    bool List(std::vector<Folder> &out);

    /// One page of the settings as a settings page shows it.
    ///
    /// Sorts a copy of all settings; of records that compare equal the order is open.
    ///
    /// @param out            becomes an object with "total" (number of all settings), "offset" (as
    ///                       given) and "folder", an array of Folder::asJson(additional).
    /// @param offset         index of the first record. A descending page does not move with it: it
    ///                       only becomes shorter, by as many records, unless the offset is beyond
    ///                       the total.
    /// @param limit          the most records of the page.
    /// @param sort_by        "name", "document", "audio", "video" or "photo"; anything else sorts
    ///                       by path. Texts are compared without regard to case.
    /// @param sort_direction "DESC" gives the first records of the ascending order, reversed;
    ///                       anything else the ascending page from `offset`.
    /// @param additional     array of the additional facts wanted; see Folder::GetAdditional().
    /// @return always true.
    bool List(Json::Value &out, unsigned long offset, unsigned long limit,
              const std::string &sort_by, const std::string &sort_direction,
              const Json::Value &additional);

    /// Inserts or updates the setting that `param` describes.
    ///
    /// An update changes only what `param` holds; an insert starts from an empty name and no file
    /// types. Compares the folder with every setting; one whose path no longer resolves is logged.
    ///
    /// @param changes receives an object that says for each of "document", "audio", "video" and
    ///                "photo" whether the rule that governs the folder has changed. Untouched on
    ///                failure.
    /// @param param   object with the string "path" (share path) and optionally "name" and the
    ///                four booleans.
    /// @return false when "path" is missing or cannot be resolved (FILEINDEX_ERR_BAD_PARAM), or
    ///         when the insert makes more than 1000 settings (FILEINDEX_ERR_FOLDER_LIMIT; the
    ///         object then holds one too many and is not to be saved). One line is logged.
    bool Upsert(Json::Value &changes, const Json::Value &param);

    /// Removes the setting of `path`; a path that is not set is no error. Compares the path with
    /// every setting, twice; one whose path no longer resolves is logged each time.
    ///
    /// @param changes receives an object with one member named `path`, holding the report as
    ///                Upsert() gives it. Untouched when `path` cannot be resolved.
    /// @param path    share path, compared byte for byte.
    /// @return always true.
    bool Delete(Json::Value &changes, const std::string &path);

    std::map<std::string, Folder> folders; ///< all settings by share path
};

} // namespace VANO::FILEINDEX

#endif
