#include <fileindex/daemon_socket.h>
#include <fileindex/error_handler.h>
#include <fileindex/event_queue.h>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <fileindex/status_mgr.h>
#include <map>
#include <optional>
#include <set>

#include "base/json_io.h"
#include "base/log.h"
#include "config/settings_lock.h"
#include "core/event.h"
#include "index_mgr/parts.h"

namespace VANO::FILEINDEX {

namespace {

bool RefuseParameter(int line, const char *complaint, const std::string &text) {
    LogError(kIndexMgrUnit, line, "%s: %s", complaint, text.c_str());
    ErrorHandler::SetError(FILEINDEX_ERR_BAD_PARAM);
    return false;
}

// The path of a request's element that was accepted: there it is a string.
std::string PathOf(const Json::Value &element) {
    return element["path"].asString();
}

bool ResolvePath(std::string &fullPath, const std::string &path) {
    if (!GetFullPath(fullPath, path)) {
        LogError(kIndexMgrUnit, __LINE__, "GetFullPath failed, path=%s", path.c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_PATH);
        return false;
    }
    return true;
}

bool AddShareOf(std::set<std::string> &shares, const std::string &path) {
    std::string share;
    if (!GetShareNameByPath(share, path)) {
        LogError(kIndexMgrUnit, __LINE__, "GetShareNameByPath failed, path=%s", path.c_str());
        return false;
    }
    shares.insert(share);
    return true;
}

// Tells the daemon of each element's path, in the request's order.
template <typename PathOfElement>
bool SendFolderCommands(const char *command, const Json::Value &request, PathOfElement pathOf) {
    Json::Value parameters(Json::objectValue);
    for (const Json::Value &element : request) {
        parameters["folder_path"] = pathOf(element);
        if (!SendCammandToDaemon(command, parameters)) {
            LogError(kIndexMgrUnit, __LINE__, "SendCammandToDaemon failed");
            return false;
        }
    }
    return true;
}

// --- Upsert, step by step -----------------------------------------------------------------------

// What a request touched.
struct Touched {
    std::map<std::string, Json::Value> reports; // change report by path
    std::set<std::string> shares;
};

bool ApplyUpserts(Touched &touched, Folders &settings, const Json::Value &request) {
    Json::Value report;
    // NOLINTNEXTLINE(modernize-loop-convert): an iterator skips holes
    for (Json::ArrayIndex index = 0; index < request.size(); ++index) {
        const Json::Value &element = request[index];
        if (!settings.Upsert(report, element)) {
            LogError(kIndexMgrUnit, __LINE__, "Upsert failed, folder=%s",
                     JsonToString(element).c_str());
            return false;
        }
        const std::string path = PathOf(element);
        touched.reports[path] = report;
        if (!AddShareOf(touched.shares, path)) {
            return false;
        }
    }
    return true;
}

bool ConfigureMonitors(const std::set<std::string> &shares) {
    for (const std::string &share : shares) {
        if (!IndexMgr::UpsertVANotifydCfg(share)) {
            // The spelling is what support tools match on.
            LogError(kIndexMgrUnit, __LINE__, "UpsertVANtifydCfg failed, share=%s", share.c_str());
            return false;
        }
    }
    return true;
}

bool QueueChanges(const std::map<std::string, Json::Value> &reports) {
    for (const auto &[path, report] : reports) {
        std::string fullPath;
        if (!ResolvePath(fullPath, path)) {
            return false;
        }
        if (!AddCustomEvent(kEventSettingChanged, fullPath, report)) {
            LogError(kIndexMgrUnit, __LINE__, "AddCustomEvent failed");
            return false;
        }
    }
    return true;
}

// --- Delete, step by step -----------------------------------------------------------------------

// `lastReport` holds the report of the last path that could be resolved, under that path.
bool ApplyDeletes(std::set<std::string> &shares, Json::Value &lastReport, Folders &settings,
                  const Json::Value &request) {
    // NOLINTNEXTLINE(modernize-loop-convert): an iterator skips holes
    for (Json::ArrayIndex index = 0; index < request.size(); ++index) {
        const Json::Value &element = request[index];
        if (!element.isConvertibleTo(Json::stringValue)) {
            return RefuseParameter(__LINE__, "Bad param", JsonToMessageText(element));
        }
        const std::string path = element.asString();
        if (!settings.Delete(lastReport, path)) {
            LogError(kIndexMgrUnit, __LINE__, "Delete failed, path=%s", path.c_str());
            return false;
        }
        if (!AddShareOf(shares, path)) {
            return false;
        }
    }
    return true;
}

bool AnnounceDeletes(const Json::Value &request, const Json::Value &lastReport) {
    if (!SendFolderCommands("delete_folder_setting", request,
                            [](const Json::Value &element) { return element.asString(); })) {
        return false;
    }
    for (const std::string &path : lastReport.getMemberNames()) {
        if (!IndexMgr::Update(path, lastReport[path])) {
            LogError(kIndexMgrUnit, __LINE__, "Update failed");
            return false;
        }
    }
    return true;
}

bool DropShare(const std::string &share) {
    if (!IndexMgr::CleanShareIndexData(share)) {
        LogError(kIndexMgrUnit, __LINE__, "CleanShareIndexData failed, share=%s", share.c_str());
        return false;
    }
    if (!IndexMgr::DeleteVANotifydCfg(share)) {
        // The spelling is what support tools match on.
        LogError(kIndexMgrUnit, __LINE__, "DeleteVANtifydCfg failed, share=%s", share.c_str());
        return false;
    }
    return true;
}

// Rewrites the monitor configuration of the shares that still have folders and drops the others. A
// query would answer no for settings that cannot be read: nothing may be dropped on that word.
bool SettleShares(const std::set<std::string> &shares) {
    for (const std::string &share : shares) {
        std::vector<Folder> left;
        if (!IndexMgr::List(left)) {
            return false;
        }
        if (!HoldsFolderOfShare(left, share)) {
            if (!DropShare(share)) {
                return false;
            }
        } else if (!IndexMgr::UpsertVANotifydCfg(share)) {
            LogError(kIndexMgrUnit, __LINE__, "UpsertVANotifydCfg failed, share=%s", share.c_str());
            return false;
        }
    }
    return true;
}

// --- Reindex, step by step ----------------------------------------------------------------------

// Asks the settings, which are loaded once, for shares. The answers are those of IsShareIndexed().
class IndexedShares {
  public:
    [[nodiscard]] bool Hold(const std::string &share) {
        if (!loaded_) {
            loaded_ = IndexMgr::List(folders_);
        }
        return *loaded_ && HoldsFolderOfShare(folders_, share);
    }

  private:
    std::optional<bool> loaded_; // whether that went well; nothing before the first question
    std::vector<Folder> folders_;
};

// Checks every path before anything is done. `fullShares` receives the shares out of space.
bool CheckReindex(std::set<std::string> &fullShares, const Json::Value &paths) {
    IndexedShares indexed;
    // NOLINTNEXTLINE(modernize-loop-convert): an iterator skips holes
    for (Json::ArrayIndex index = 0; index < paths.size(); ++index) {
        const Json::Value &element = paths[index];
        if (!element.isString()) {
            return RefuseParameter(__LINE__, "Malformed jsArrPath", JsonToMessageText(element));
        }
        const std::string path = element.asString();
        std::string share;
        if (!GetShareNameByPath(share, path)) {
            LogError(kIndexMgrUnit, __LINE__, "Failed to get share name from path: %s",
                     path.c_str());
            return false;
        }
        if (!indexed.Hold(share)) {
            return false;
        }
        if (StatusMgr::ShareIsNoSpace(share)) {
            fullShares.insert(share);
        }
    }
    return true;
}

bool QueueReindex(const Json::Value &paths) {
    for (const Json::Value &element : paths) {
        const std::string path = element.asString();
        std::string fullPath;
        if (!ResolvePath(fullPath, path)) {
            return false;
        }
        if (!AddCustomEvent(kEventReindexFolder, fullPath, Json::Value())) {
            LogError(kIndexMgrUnit, __LINE__, "AddCustomEvent failed, path=%s", path.c_str());
            return false;
        }
    }
    return true;
}

} // namespace

bool IndexMgr::Upsert(const Json::Value &request) {
    if (!request.isArray()) {
        return RefuseParameter(__LINE__, "Bad param", JsonToString(request));
    }
    Folders settings;
    const SettingsLock lock(settings);
    Touched touched;
    if (!lock.IsHeld() || !settings.Load() || !ApplyUpserts(touched, settings, request) ||
        !settings.Save() || !ConfigureMonitors(touched.shares) || !StartIndexingService()) {
        return false;
    }
    SwitchSpotlight(true);
    return SendFolderCommands("upsert_folder_setting", request, PathOf) &&
           QueueChanges(touched.reports);
}

bool IndexMgr::Add(const Json::Value &request) {
    return Upsert(request);
}

bool IndexMgr::Set(const Json::Value &request) {
    return Upsert(request);
}

bool IndexMgr::Delete(const Json::Value &request) {
    if (!request.isArray()) {
        return RefuseParameter(__LINE__, "Bad param", JsonToString(request));
    }
    Folders settings;
    const SettingsLock lock(settings);
    std::set<std::string> shares;
    Json::Value lastReport;
    if (!lock.IsHeld() || !settings.Load() ||
        !ApplyDeletes(shares, lastReport, settings, request) || !settings.Save()) {
        return false;
    }
    if (settings.folders.empty()) {
        StopIndexing();
    } else if (!AnnounceDeletes(request, lastReport)) {
        return false;
    }
    return SettleShares(shares);
}

bool IndexMgr::Reindex(const Json::Value &jsArrPath) {
    if (!jsArrPath.isArray()) {
        return RefuseParameter(__LINE__, "Malformed jsArrPath", JsonToString(jsArrPath));
    }
    std::set<std::string> fullShares;
    if (!CheckReindex(fullShares, jsArrPath)) {
        return false;
    }
    for (const std::string &share : fullShares) {
        if (!StatusMgr::ShareRevive(share)) {
            // The spelling is what support tools match on.
            LogError(kIndexMgrUnit, __LINE__, "ShareRevice failed, share=%s", share.c_str());
        }
    }
    return QueueReindex(jsArrPath);
}

bool IndexMgr::Update(const std::string &path, const Json::Value &data) {
    std::string fullPath;
    if (!ResolvePath(fullPath, path)) {
        return false;
    }
    if (!AddCustomEvent(kEventSettingChanged, fullPath, data)) {
        LogError(kIndexMgrUnit, __LINE__, "AddCustomEvent failed");
        return false;
    }
    return true;
}

bool IndexMgr::List(Json::Value &out, unsigned long offset, unsigned long limit,
                    const std::string &sort_by, const std::string &sort_direction,
                    const Json::Value &additional) {
    Folders settings;
    return settings.Load() &&
           settings.List(out, offset, limit, sort_by, sort_direction, additional);
}

bool IndexMgr::Get(Json::Value &out, const std::string &path) {
    Folders settings;
    const SettingsLock lock(settings);
    return lock.IsHeld() && settings.Load() && settings.Get(out, path);
}

} // namespace VANO::FILEINDEX
