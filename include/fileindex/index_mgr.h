#ifndef FILEINDEX_INDEX_MGR_H
#define FILEINDEX_INDEX_MGR_H

#include <json/value.h>
#include <string>
#include <vector>

#include <fileindex/export.h>
#include <fileindex/folder.h>

namespace VANO::FILEINDEX {

/// The public operations of the indexing service.
///
/// Paths are share paths ("/share/dir") unless called full paths. A failure is logged unless said
/// otherwise. Nothing is rolled back: an operation that fails part-way leaves what it had done.
///
/// Operations that hold the folder-settings lock fail with FILEINDEX_ERR_LOCK when somebody else
/// holds it for longer than about 30 ms. Those that load folder.conf fail with FILEINDEX_ERR_LOAD
/// or FILEINDEX_ERR_MALFORMED, those that save it with FILEINDEX_ERR_SAVE. Commands to the daemon
/// and control of services wait for the other side, with the lock held. Threads may call any of
/// them at the same time.
class IndexMgr {
  public:
    // --- Is it indexed? -------------------------------------------------------------------------
    // Queries take no lock, write nothing and never throw; settings that cannot be loaded answer
    // false. A folder contains itself and what lies below it, by whole path components and byte for
    // byte; nothing is normalised, and a path with a trailing "/" matches only folders that are
    // stored with one. The forms without a list load folder.conf; for many queries call List()
    // once and pass the list.

    /// @return whether an indexed folder lies in the share. One line is logged for each setting
    ///         whose share cannot be told.
    FILEINDEX_API static bool IsShareIndexed(const std::string &share);

    /// @return whether `path` is an indexed folder or lies inside one.
    FILEINDEX_API static bool IsPathIndexed(const std::string &path);
    /// The same against a list from List().
    FILEINDEX_API static bool IsPathIndexed(const std::string &path,
                                            const std::vector<Folder> &folders);

    /// @return whether `path` is an indexed folder or contains one.
    FILEINDEX_API static bool IsPathContainIndexed(const std::string &path);
    /// The same against a list from List().
    FILEINDEX_API static bool IsPathContainIndexed(const std::string &path,
                                                   const std::vector<Folder> &folders);

    /// @param fullPath absolute file-system path.
    /// @return whether it is the full path of an indexed folder or lies inside one. A folder whose
    ///         path no longer resolves covers nothing.
    FILEINDEX_API static bool IsFullPathIndexed(const std::string &fullPath);
    /// The same against a list from List().
    FILEINDEX_API static bool IsFullPathIndexed(const std::string &fullPath,
                                                const std::vector<Folder> &folders);

    // --- Folder settings ------------------------------------------------------------------------

    /// Adds or changes folders, and updates every other party: folder.conf is saved, the
    /// monitor configuration of each touched share rewritten, the daemon's service started,
    /// Spotlight switched on if it was off, "upsert_folder_setting" sent for each folder and a
    /// settings-changed event queued for each.
    ///
    /// Holds the folder-settings lock for the whole call.
    ///
    /// @param request array of folder objects; see Folders::Upsert().
    /// @return false at the first failing step. A request that is no array or has a bad element is
    ///         FILEINDEX_ERR_BAD_PARAM and changes nothing. A failing Spotlight switch is logged
    ///         only.
    FILEINDEX_API static bool Upsert(const Json::Value &request);
    /// Upsert().
    FILEINDEX_API static bool Add(const Json::Value &request);
    /// Upsert().
    FILEINDEX_API static bool Set(const Json::Value &request);

    /// Removes folders and updates every other party. With the last folder the daemon's
    /// service is stopped and Spotlight switched off; otherwise "delete_folder_setting" is sent for
    /// each folder and a settings-changed event queued for the last one that could be resolved. A
    /// share without folders loses its index data and its monitor configuration.
    ///
    /// Holds the folder-settings lock for the whole call.
    ///
    /// @param request array of share paths as stored in folder.conf; one that is not set is no
    ///        error.
    /// @return false at the first failing step. A request that is no array, or an element that is
    ///         an array or an object, is FILEINDEX_ERR_BAD_PARAM and changes nothing.
    FILEINDEX_API static bool Delete(const Json::Value &request);

    /// Queues folders for re-indexing and revives those of their shares that ran out of space.
    /// Takes no lock of its own. Reads folder.conf once for each share, and status.conf and the
    /// share's queue once for each path.
    ///
    /// @param jsArrPath array of share paths.
    /// @return false when it is no array of strings (FILEINDEX_ERR_BAD_PARAM), when a share has no
    ///         indexed folder (no line, no error code), or when a path cannot be resolved
    ///         (FILEINDEX_ERR_PATH) or queued.
    FILEINDEX_API static bool Reindex(const Json::Value &jsArrPath);

    /// Queues the event that the settings of a folder changed. Takes no lock.
    ///
    /// @param path share path of the folder.
    /// @param data the change report that goes with the event.
    /// @return false when the path cannot be resolved (FILEINDEX_ERR_PATH) or queued.
    FILEINDEX_API static bool Update(const std::string &path, const Json::Value &data);

    /// All folder settings in byte order of their paths. Takes no lock.
    ///
    /// @return false when folder.conf cannot be loaded.
    FILEINDEX_API static bool List(std::vector<Folder> &folders);

    /// One page of the folder settings; see Folders::List(). Takes no lock.
    ///
    /// @return false when folder.conf cannot be loaded.
    FILEINDEX_API static bool List(Json::Value &out, unsigned long offset, unsigned long limit,
                                   const std::string &sort_by, const std::string &sort_direction,
                                   const Json::Value &additional);

    /// One folder setting as JSON; see Folders::Get(). Holds the folder-settings lock.
    ///
    /// @param out  receives the object; untouched on failure.
    /// @param path share path as stored.
    /// @return false when there is none (FILEINDEX_ERR_NO_SUCH_FOLDER).
    FILEINDEX_API static bool Get(Json::Value &out, const std::string &path);

    // --- Share lifecycle ------------------------------------------------------------------------

    /// Drops the folder settings of a share that is being removed. With the last setting the
    /// daemon's service is stopped and Spotlight switched off. Nobody else is told, and the index
    /// data stays; see CleanShareIndexData(). Holds the folder-settings lock.
    ///
    /// @param share share name, compared byte for byte. An empty name stands for every share.
    /// @return false when the settings cannot be locked, loaded or saved. A failing service or
    ///         Spotlight is logged only.
    FILEINDEX_API static bool ShareRemove(const std::string &share);

    /// Moves the folder settings of a renamed share to its new name, which must already be known to
    /// the platform. Changes folder.conf only. Holds the folder-settings lock.
    ///
    /// @param oldName share name, compared byte for byte. An empty name stands for every share.
    /// @param newName share name.
    /// @return false when the settings cannot be locked, loaded or saved, or when the new name is
    ///         unknown (FILEINDEX_ERR_BAD_PARAM); folder.conf is then unchanged.
    FILEINDEX_API static bool ShareRename(const std::string &oldName, const std::string &newName);

    /// Stops the daemon's worker of the share ("delete_share_worker"), then removes its monitor
    /// configuration. Takes no lock and leaves the status file alone.
    ///
    /// @return false when the daemon cannot be reached (nothing is logged or done), or the
    ///         configuration cannot be removed.
    FILEINDEX_API static bool SharePause(const std::string &share);

    /// Rewrites the share's monitor configuration from the settings, then asks the daemon to start
    /// its worker ("revive_share_worker"). Takes no lock and leaves the status file alone.
    ///
    /// @return false when the configuration cannot be written, or the daemon cannot be
    ///         reached (nothing is logged).
    FILEINDEX_API static bool ShareResume(const std::string &share);

    /// Deletes the share's event queue, the queue that the daemon took over, and the index
    /// database. It is no failure when one of them is missing or cannot be removed.
    ///
    /// @return false when the share is unknown.
    FILEINDEX_API static bool CleanShareIndexData(const std::string &share);

    // --- Change monitor -------------------------------------------------------------------------

    /// Makes the change monitor watch exactly the indexed folders of the share and feed its event
    /// queue. Takes no lock.
    ///
    /// @return false when the share is unknown, the settings cannot be loaded, a folder cannot be
    ///         resolved (then the previous configuration stays) or the monitor refuses.
    FILEINDEX_API static bool UpsertVANotifydCfg(const std::string &share);

    /// Removes the monitor configuration that feeds the share's event queue. Takes no lock.
    ///
    /// @return false when the share is unknown or the monitor refuses.
    FILEINDEX_API static bool DeleteVANotifydCfg(const std::string &share);
};

} // namespace VANO::FILEINDEX

#endif
