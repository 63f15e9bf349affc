#include <fileindex/migration.h>

#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <set>

#include "base/log.h"
#include "core/paths.h"
#include "platform/vano_platform.h"
#include "utils/platform_error.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";

bool StopService() {
    if (VLIBServiceStop(kIndexingService, kAlsoAtBoot) < 0) {
        // Named after the start on purpose: support tools match on it.
        LogPlatformFailure(kUnit, 641, "VLIBServiceStart");
        return false;
    }
    return true;
}

bool StartServices() {
    if (VLIBServiceStart(kIndexingService, kAlsoAtBoot) < 0) {
        LogPlatformFailure(kUnit, 650, "VLIBServiceStart");
        return false;
    }
    if (VANOSMBSetSpotlight(true) < 0) {
        LogPlatformFailure(kUnit, 654, "VANOSMBSetSpotlight");
        return false;
    }
    return true;
}

bool WatchAndReindex(const std::vector<Folder> &folders) {
    std::set<std::string> shares;
    Json::Value paths(Json::arrayValue);
    for (const Folder &folder : folders) {
        std::string share;
        if (!GetShareNameByPath(share, folder.path)) {
            LogError(kUnit, 661, "GetShareNameByPath failed, path=%s", folder.path.c_str());
            return false;
        }
        shares.insert(share);
        paths.append(folder.path);
    }
    for (const std::string &share : shares) {
        if (!IndexMgr::UpsertVANotifydCfg(share)) {
            LogError(kUnit, 671, "UpsertVANotifydCfg failed, share=%s", share.c_str());
            return false;
        }
    }
    if (!IndexMgr::Reindex(paths)) {
        LogError(kUnit, 678, "Reindex failed");
        return false;
    }
    return true;
}

} // namespace

bool Updater_zem60_beta2() {
    Folders settings;
    std::vector<Folder> folders;
    if (!settings.Load() || !settings.List(folders)) {
        return false;
    }
    if (folders.empty()) {
        return StopService();
    }
    return StartServices() && WatchAndReindex(folders);
}

} // namespace VANO::FILEINDEX
