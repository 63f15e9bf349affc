#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>

#include "base/log.h"
#include "core/paths.h"
#include "index_mgr/parts.h"
#include "platform/monitor_queue.h"
#include "utils/index_location.h"

namespace VANO::FILEINDEX {

namespace {

constexpr auto kQueueType = static_cast<VANOTIFYD::_tag_monitor_queue_type_>(1);
// inotify's event bits from 0x2 to 0x8000 without "closed unwritten" (0x10) and "opened" (0x20).
constexpr int kWatchedEvents = 0xffce;

} // namespace

bool IndexMgr::UpsertVANotifydCfg(const std::string &share) {
    std::string queue;
    if (!GetQueueLocation(queue, share, kIndexMgrUnit, __LINE__)) {
        return false;
    }
    Folders settings;
    std::vector<Folder> folders;
    if (!settings.Load() || !settings.List(folders, share)) {
        return false;
    }
    Json::Value ignore(Json::arrayValue);
    ignore.append(kMetadataDirName);
    Json::Value description(Json::objectValue);
    description["queue"] = queue;
    Json::Value &config = description["config"] = Json::Value(Json::arrayValue);
    for (const Folder &folder : folders) {
        std::string fullPath;
        if (!GetFullPath(fullPath, folder.path)) {
            LogError(kIndexMgrUnit, __LINE__, "GetFullPath failed, path=%s", folder.path.c_str());
            return false;
        }
        Json::Value &entry = config.append(Json::Value(Json::objectValue));
        entry["path"] = fullPath;
        entry["mask"] = kWatchedEvents;
        entry["ignore"] = ignore;
    }
    if (!VANOTIFYD::MonitorQueue::Upsert(VANOTIFYD::MonitorQueue(description), kMonitorConsumer,
                                         kQueueType)) {
        LogError(kIndexMgrUnit, __LINE__, "MonitorQueue::Add failed");
        return false;
    }
    return true;
}

bool IndexMgr::DeleteVANotifydCfg(const std::string &share) {
    std::string queue;
    if (!GetQueueLocation(queue, share, kIndexMgrUnit, __LINE__)) {
        return false;
    }
    if (!VANOTIFYD::MonitorQueue::Delete(queue, kMonitorConsumer, kQueueType)) {
        LogError(kIndexMgrUnit, __LINE__, "MonitorQueue::Delete failed");
        return false;
    }
    return true;
}

} // namespace VANO::FILEINDEX
