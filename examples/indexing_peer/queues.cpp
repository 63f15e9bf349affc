#include "queues.h"

#include "json_text.h"

namespace peer {

namespace {

constexpr char kShareTablePath[] = "/usr/vano/etc/shares.json";
constexpr char kQueueInShare[] = "/@eaDir/VANO@file_index_queue";

} // namespace

std::vector<std::string> QueuesOfAllShares() {
    std::vector<std::string> queues;
    Json::Value table;
    if (!ParseJsonFile(table, kShareTablePath) || !table.isObject()) {
        return queues;
    }
    for (const Json::Value &share : table) {
        const Json::Value &path = share.isObject() ? share["path"] : share;
        if (path.isString()) {
            queues.push_back(path.asString() + kQueueInShare);
        }
    }
    return queues;
}

} // namespace peer
