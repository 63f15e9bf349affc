// The input is two queue files of a share: what stands before a line "%%" is the queue that the
// daemon took over, the rest the queue itself.
//
// Progress and the test for a pending re-index agree with a plain reading of the files; an event
// that is appended, whatever it is appended to, is seen by both and reaches the indexing peer.

#include <fileindex/event_queue.h>
#include <fileindex/status_mgr.h>
#include <set>
#include <unistd.h>

#include "indexing_peer/queue_worker.h"
#include "support/check.h"
#include "support/log_tap.h"
#include "support/naive.h"
#include "support/world.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;

constexpr char kSeparator[] = "%%\n";
constexpr char kShare[] = "photos";
constexpr char kVolume[] = "/volume1";
constexpr unsigned kMoved = 256;
constexpr unsigned kReindex = 65536;

struct Queues {
    std::string taken;
    std::string waiting;
};

Queues Split(const std::string &text) {
    const std::size_t at = text.find(kSeparator);
    if (at == std::string::npos) {
        return {"", text};
    }
    return {text.substr(0, at), text.substr(at + sizeof(kSeparator) - 1)};
}

// An empty queue file is none: it then is not there.
void PutQueues(const Queues &queues) {
    const std::string path = QueueOf(kShare);
    (void)::unlink(path.c_str());
    (void)::unlink((path + ".tmp").c_str());
    if (!queues.waiting.empty()) {
        PutFile(path, queues.waiting);
    }
    if (!queues.taken.empty()) {
        PutFile(path + ".tmp", queues.taken);
    }
}

struct Scan {
    bool found = false;
    std::size_t malformed = 0;
};

Scan ScanFor(const std::string &folder, const std::string &text) {
    Scan scan;
    std::string former;
    for (const std::string &line : Lines(text)) {
        const auto event = ParseEvent(line);
        if (!event) {
            ++scan.malformed;
            continue;
        }
        former = event->code == kMoved ? event->formerPath : former;
        scan.found = scan.found || Lies(event->path, folder) || Lies(former, folder);
    }
    return scan;
}

bool IsReindexQueued(const std::string &folder, const std::string &text) {
    for (const std::string &line : Lines(text)) {
        const auto event = ParseEvent(line);
        if (event && event->code == kReindex && event->path == folder) {
            return true;
        }
    }
    return false;
}

void CheckProgress(const Queues &queues, const std::string &folder) {
    (void)LogTap::Take();
    const std::string status = StatusMgr::GetFolderStatus(folder);
    const Scan waiting = ScanFor(kVolume + folder, queues.waiting);
    const Scan taken = ScanFor(kVolume + folder, queues.taken);
    const bool found = waiting.found || taken.found;
    Check(status == (found ? "processing" : "finished"), "progress is what the queues say", folder);
    Check(LogTap::Count(LogTap::Take(), "status_mgr:47 Malformed command: ") ==
              waiting.malformed + (waiting.found ? 0 : taken.malformed),
          "each malformed line that is read is logged once", folder);
}

// Appends an event unless a re-index of the path waits. Whether it was written.
bool CheckAppending(Queues &queues, const std::string &fullPath, int code) {
    Json::Value data(Json::objectValue);
    data["photo"] = true;
    Check(AddCustomEvent(code, fullPath, data), "an event is taken", fullPath);
    const std::string now = Get(QueueOf(kShare));
    Check(Get(QueueOf(kShare) + ".tmp") == queues.taken, "the taken queue is the daemon's");
    if (IsReindexQueued(fullPath, queues.waiting) || IsReindexQueued(fullPath, queues.taken)) {
        Check(now == queues.waiting, "a pending re-index covers an event", fullPath);
        return false;
    }
    Check(now.size() > queues.waiting.size() && now.back() == '\n' &&
              now.compare(0, queues.waiting.size(), queues.waiting) == 0,
          "an event is a line at the end", fullPath);
    const auto line = Parse(now.substr(queues.waiting.size()));
    Check(line && (*line)["event"] == code && (*line)["path"] == fullPath &&
              (*line)["data"] == data,
          "the line is the event", now);
    queues.waiting = now;
    return true;
}

// What the indexing peer is handed, twice: first what was taken, then what waits.
std::multiset<std::string> WorkOff() {
    std::multiset<std::string> events;
    const peer::QueueHandlers handlers{
        [&](const std::string & /*queue*/, const peer::Event &event) {
            events.insert(std::to_string(event.code) + event.path);
            return true;
        },
        [](const std::string & /*queue*/, const std::string & /*line*/) { return true; }};
    for (int round = 0; round < 2; ++round) {
        std::string reason;
        const peer::QueueResult result = peer::WorkOffQueue(QueueOf(kShare), handlers, reason);
        Check(result == peer::QueueResult::kDone || result == peer::QueueResult::kIdle,
              "the peer works a queue off", reason);
    }
    Check(Get(QueueOf(kShare)).empty() && Get(QueueOf(kShare) + ".tmp").empty(),
          "nothing waits that the peer has done");
    return events;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    const Run run;
    Queues queues = Split(std::string(reinterpret_cast<const char *>(data), size));
    PutQueues(queues);
    for (const char *folder : {"/photos", "/photos/a", "/photos/2016"}) {
        CheckProgress(queues, folder);
    }
    std::multiset<std::string> written;
    const auto append = [&](const std::string &fullPath, int code) {
        if (CheckAppending(queues, fullPath, code)) {
            written.insert(std::to_string(code) + fullPath);
        }
    };
    append("/volume1/photos/a", 131072);
    append("/volume1/photos/2016", static_cast<int>(kReindex));
    append("/volume1/photos/2016", 131072); // covered by the one before
    append("/volume1/photos/2016/b \"\xff\n", 131072);
    CheckProgress(queues, "/photos/2016");
    const std::multiset<std::string> handled = WorkOff();
    Check(std::includes(handled.begin(), handled.end(), written.begin(), written.end()),
          "every event that was written reaches the peer", queues.waiting);
    return 0;
}
