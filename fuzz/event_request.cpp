// The input is {"folders": FOLDER.CONF, "steps": [{"reindex": REQUEST}, {"update": PATH, "data":
// X},
// {"event": CODE, "path": FULL PATH, "data": X}, {"command": NAME, "data": X}, ...]}.
//
// What a step that succeeded queued or sent comes back as it was; one that is refused queues
// nothing; a queued re-index is seen as progress and is not queued twice.

#include <fileindex/daemon_socket.h>
#include <fileindex/error_handler.h>
#include <fileindex/event_queue.h>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <fileindex/status_mgr.h>
#include <set>

#include "support/check.h"
#include "support/naive.h"
#include "support/world.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;

constexpr Json::ArrayIndex kMostSteps = 8;
constexpr int kReindex = 65536;
constexpr int kChanged = 131072;

// All queues, one after another.
std::string AllQueues() {
    std::string text;
    for (const std::string &share : ShareNames()) {
        text += Get(QueueOf(share));
    }
    return text;
}

bool IsTooDeep(const Json::Value &value, int left = 900) {
    for (const Json::Value &member : value) {
        if (left == 0 || IsTooDeep(member, left - 1)) {
            return true;
        }
    }
    return false;
}

bool IsQueued(int code, const std::string &fullPath, const Json::Value &data) {
    for (const std::string &line : Lines(AllQueues())) {
        const auto event = Parse(line);
        if (event && (*event)["event"] == code && (*event)["path"] == fullPath &&
            (*event)["data"] == data) {
            return true;
        }
    }
    return false;
}

bool IsReindexQueued(const std::string &fullPath) {
    for (const std::string &line : Lines(AllQueues())) {
        const auto event = ParseEvent(line);
        if (event && event->code == static_cast<unsigned>(kReindex) && event->path == fullPath) {
            return true;
        }
    }
    return false;
}

void CheckQueued(bool isDone, int code, const std::string &fullPath, const Json::Value &data,
                 const std::string &before) {
    if (!isDone) {
        Check(AllQueues() == before, "an event that is refused is not queued", fullPath);
    } else if (!IsTooDeep(data)) {
        Check(IsReindexQueued(fullPath) || IsQueued(code, fullPath, data),
              "an event that is taken is queued as it was, or covered", fullPath);
    }
}

void CheckNotTwice() {
    std::set<std::string> paths;
    for (const std::string &line : Lines(AllQueues())) {
        const auto event = ParseEvent(line);
        if (event && event->code == static_cast<unsigned>(kReindex)) {
            Check(paths.insert(event->path).second, "a re-index is queued once", line);
        }
    }
}

void CheckReindex(Run &run, const Json::Value &request) {
    const std::string before = AllQueues();
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
    const bool isDone = IndexMgr::Reindex(request);
    if (!isDone) {
        Check(request.isArray() || ErrorHandler::GetError() == FILEINDEX_ERR_BAD_PARAM,
              "what is no list is a bad parameter");
        Check(request.isArray() || AllQueues() == before, "and queues nothing");
        return;
    }
    for (const Json::Value &path : request) {
        std::string fullPath;
        Check(GetFullPath(fullPath, path.asString()) && IsReindexQueued(fullPath),
              "each folder waits for its re-index", fullPath);
        const std::string status = StatusMgr::GetFolderStatus(path.asString());
        Check(status == "processing" || !CanPathBeIndexed(path.asString()), "and shows it", status);
    }
    (void)run.Commands();
}

void CheckUpdate(const std::string &path, const Json::Value &data) {
    const std::string before = AllQueues();
    const bool isDone = IndexMgr::Update(path, data);
    std::string fullPath;
    const bool isResolvable = GetFullPath(fullPath, path);
    Check(!isDone || isResolvable, "only folders of a share are updated", path);
    CheckQueued(isDone, kChanged, fullPath, data, before);
}

void CheckEvent(int code, const std::string &fullPath, const Json::Value &data) {
    const std::string before = AllQueues();
    CheckQueued(AddCustomEvent(code, fullPath, data), code, fullPath, data, before);
}

void CheckCommand(Run &run, const std::string &name, const Json::Value &data) {
    Check(SendCammandToDaemon(name, data), "a command is sent", name);
    const auto commands = run.Commands();
    Check(commands.size() == 1, "it is one message");
    if (!IsTooDeep(data)) {
        Check(commands[0]["type"] == name && commands[0]["data"] == data, "as it was", name);
    }
}

void CheckStep(Run &run, const Json::Value &step) {
    if (step.isMember("reindex")) {
        CheckReindex(run, step["reindex"]);
    } else if (step["update"].isString()) {
        CheckUpdate(step["update"].asString(), step["data"]);
    } else if (step["event"].isInt()) {
        CheckEvent(step["event"].asInt(), StringOf(step["path"]), step["data"]);
    } else if (step["command"].isString()) {
        CheckCommand(run, step["command"].asString(), step["data"]);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    const auto input = Parse({reinterpret_cast<const char *>(data), size});
    if (!input || !input->isObject() || !(*input)["steps"].isArray()) {
        return 0; // no request
    }
    Run run;
    PutFile(kFolderFile, Text((*input)["folders"]));
    const Json::Value &steps = (*input)["steps"];
    for (Json::ArrayIndex i = 0; i < std::min(steps.size(), kMostSteps); ++i) {
        if (steps[i].isObject()) {
            CheckStep(run, steps[i]);
        }
        CheckNotTwice();
    }
    return 0;
}
