// Changing the folder settings.

#include "bench/benchmarks.h"

#include <algorithm>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fstream>
#include <memory>

#include "bench/appliance.h"
#include "bench/input.h"
#include "bench/measure.h"
#include "bench/peer.h"

namespace VANO::BENCH {

namespace {

using FILEINDEX::Folder;
using FILEINDEX::IndexMgr;

std::size_t EventsOfAllQueues() {
    std::size_t lines = 0;
    for (const std::string &share : ShareNames()) {
        std::ifstream file(QueueFileOf(share));
        lines += static_cast<std::size_t>(std::count(std::istreambuf_iterator<char>(file),
                                                     std::istreambuf_iterator<char>(), '\n'));
    }
    return lines;
}

// One request for `count` folders on an appliance without settings and with empty queues; every
// folder is announced to the peer and in its share's queue.
Operation BulkUpsert(const std::shared_ptr<Peer> &peer, std::size_t count) {
    Json::Value request(Json::arrayValue);
    for (const std::string &path : FolderPaths(count)) {
        Json::Value &folder = request.append(Json::Value(Json::objectValue));
        folder["path"] = path;
        folder["name"] = path.substr(path.rfind('/') + 1);
        folder["photo"] = true;
    }
    return {[=] { return IndexMgr::Upsert(request) && peer->Received(count); },
            [] {
                RemoveSettings();
                RemoveQueues();
            },
            [=] {
                std::vector<Folder> folders;
                return IndexMgr::List(folders) && folders.size() == count &&
                       EventsOfAllQueues() == count;
            }};
}

} // namespace

void AddSettingsBenchmarks() {
    AddComparison(
        {"bulk_upsert_growth", "Upsert of 1,000 folders in one request / of 100", Target::kAtMost,
         12, 1, [] {
             const auto peer = std::make_shared<Peer>();
             return Pair{BulkUpsert(peer, kMaxFolders), BulkUpsert(peer, kMaxFolders / 10)};
         }});
    AddSeries({"folders", "bulk_upsert", {10, 30, 100, 300, kMaxFolders}, [](std::size_t count) {
                   return BulkUpsert(std::make_shared<Peer>(), count);
               }});
}

} // namespace VANO::BENCH
