#include "peer.h"

#include <algorithm>

#include "queue_worker.h"
#include "support/files.h"
#include "testbed.h"

namespace VANO::TORTURE {

namespace {

std::string LineOf(const peer::Event &event) {
    Json::Value line(Json::objectValue);
    line["event"] = event.code;
    line["path"] = event.path;
    line["data"] = event.data;
    return CompactText(line);
}

} // namespace

std::string WorkOffQueues(std::vector<QueuedEvent> &handled) {
    const peer::QueueHandlers handlers{
        [&](const std::string &queue, const peer::Event &event) {
            handled.push_back({queue, LineOf(event)});
            return true;
        },
        [](const std::string &, const std::string &) { return true; }};
    for (const std::string &share : kShares) {
        const std::string queue = QueueOf(share);
        std::string reason;
        while (peer::WorkOffQueue(queue, handlers, reason) == peer::QueueResult::kDone) {
        }
        if (!reason.empty()) {
            return "the peer says: " + reason;
        }
        if (Exists(queue) || Exists(TakenOf(share))) {
            return "the peer leaves " + queue;
        }
    }
    return "";
}

std::string CheckPeer(const std::vector<QueuedEvent> &expected) {
    std::vector<QueuedEvent> handled;
    const std::string complaint = WorkOffQueues(handled);
    if (!complaint.empty()) {
        return complaint;
    }
    for (const QueuedEvent &event : expected) {
        if (std::find(handled.begin(), handled.end(), event) == handled.end()) {
            return "the peer never met " + event.line;
        }
    }
    return "";
}

} // namespace VANO::TORTURE
