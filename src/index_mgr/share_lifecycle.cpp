#include <cerrno>
#include <fileindex/daemon_socket.h>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>

#include "base/log.h"
#include "config/settings_lock.h"
#include "core/paths.h"
#include "core/share_files.h"
#include "index_mgr/parts.h"
#include "platform/vano_platform.h"
#include "utils/index_location.h"

namespace VANO::FILEINDEX {

namespace {

bool SendShareCommand(const char *command, const std::string &share) {
    Json::Value parameters(Json::objectValue);
    parameters["share_name"] = share;
    return SendCammandToDaemon(command, parameters);
}

// What cannot be removed stays; that is no failure. A metadata directory that is a symbolic link,
// or cannot be looked at, may lead to another share's data, or worse. One that is missing is no
// obstacle.
void RemoveRecursively(const std::string &path) {
    errno = ShareFile(path).Failure();
    if (errno != 0 && errno != ENOENT) {
        LogError(kIndexMgrUnit, __LINE__, "Refused to remove, path=%s, reason=%s", path.c_str(),
                 ErrnoText().c_str());
        return;
    }
    const char *const end = nullptr;
    (void)VLIBCExec(kRemoveToolPath, "-rf", path.c_str(), end, end);
}

} // namespace

bool IndexMgr::ShareRemove(const std::string &share) {
    Folders settings;
    const SettingsLock lock(settings);
    std::vector<Folder> folders;
    if (!lock.IsHeld() || !settings.Load() || !settings.List(folders, share)) {
        return false;
    }
    Json::Value result;
    for (const Folder &folder : folders) {
        if (!settings.Delete(result, folder.path)) {
            return false;
        }
    }
    if (!settings.Save()) {
        return false;
    }
    if (settings.folders.empty()) {
        StopIndexing();
    }
    return true;
}

bool IndexMgr::ShareRename(const std::string &oldName, const std::string &newName) {
    Folders settings;
    const SettingsLock lock(settings);
    std::vector<Folder> folders;
    if (!lock.IsHeld() || !settings.Load() || !settings.List(folders, oldName)) {
        return false;
    }
    Json::Value result;
    for (Folder &folder : folders) {
        if (!settings.Delete(result, folder.path)) {
            return false;
        }
        // A path that does not resolve is refused by the insert.
        (void)folder.SetPath(ReplaceShareName(folder.path, newName));
        if (!settings.Upsert(result, folder.asJson())) {
            return false;
        }
    }
    return settings.Save();
}

bool IndexMgr::SharePause(const std::string &share) {
    if (!SendShareCommand("delete_share_worker", share)) {
        return false;
    }
    if (!DeleteVANotifydCfg(share)) {
        LogError(kIndexMgrUnit, __LINE__, "DeleteVANotifydCfg failed, share=%s", share.c_str());
        return false;
    }
    return true;
}

bool IndexMgr::ShareResume(const std::string &share) {
    if (!UpsertVANotifydCfg(share)) {
        LogError(kIndexMgrUnit, __LINE__, "UpsertVANotifydCfg failed, share=%s", share.c_str());
        return false;
    }
    return SendShareCommand("revive_share_worker", share);
}

bool IndexMgr::CleanShareIndexData(const std::string &share) {
    std::string queue;
    if (!GetQueueLocation(queue, share, kIndexMgrUnit, __LINE__)) {
        return false;
    }
    RemoveRecursively(queue);
    RemoveRecursively(queue + kTakenQueueSuffix);
    std::string database;
    if (!GetDatabaseLocation(database, share, kIndexMgrUnit, __LINE__)) {
        return false;
    }
    RemoveRecursively(database);
    return true;
}

} // namespace VANO::FILEINDEX
