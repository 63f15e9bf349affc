// The input is the text of status.conf.
//
// The readers agree with a plain reading and never throw where they must not; every writer either
// changes what it is for, and nothing else, or fails with the file as it was and the lock free.

#include <ctime>
#include <fileindex/error_handler.h>
#include <fileindex/status_mgr.h>
#include <functional>

#include "support/check.h"
#include "support/naive.h"
#include "support/world.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;

constexpr char kShare[] = "photos";
const std::string kLongerName("photos\0x", 8); // no share's, and not to be taken for one's

bool IsMarked(const Json::Value &conf, const char *kind) {
    return conf.isObject() && conf[kind].isObject() && conf[kind].isMember(kShare);
}

// The pause time; none where the file does not hold one.
std::optional<long long> PauseTime(const Json::Value &conf) {
    try {
        return conf.get("resume_time", Json::Int64{-1}).asInt64();
    } catch (const Json::Exception &) {
        return std::nullopt;
    }
}

void CheckReaders(const Json::Value &conf) {
    const std::optional<long long> wanted = PauseTime(conf);
    long long time = 4711;
    Check(StatusMgr::GetPauseInfo(time) == wanted.has_value(), "the pause can be read");
    Check(time == wanted.value_or(4711), "the pause is what the file says, or untouched");
    Check(StatusMgr::ShareIsNoSpace(kShare) == IsMarked(conf, "no_space"), "out of space");
    Check(StatusMgr::ShareIsNeedReindex(kShare) == IsMarked(conf, "need_reindex"), "new index");
    Check(!StatusMgr::GetFolderStatus("/photos/a").empty(), "a folder has a status");
}

// A mark that is no boolean may make the JSON library throw.
void CheckMarks(const Json::Value &conf) {
    if (!conf.isObject()) {
        Check(!StatusMgr::IsUpdated("x"), "a step is not done where there are no marks");
        return;
    }
    for (const std::string &key : conf.getMemberNames()) {
        if (conf[key].isConvertibleTo(Json::booleanValue) && !conf[key].isNull()) {
            Check(StatusMgr::IsUpdated(key) == conf[key].asBool(), "a mark reads as it is", key);
        }
    }
}

// Runs a writer on the file `text`. What it left when it succeeded, none when it failed or the JSON
// library threw.
std::optional<Json::Value> Write(const std::string &text, const std::function<bool()> &writer) {
    PutFile(kStatusFile, text);
    bool written = false;
    try {
        written = writer();
    } catch (const Json::Exception &) {
        Check(Get(kStatusFile) == text, "a writer that throws leaves the file", text);
        return std::nullopt;
    }
    if (!written) {
        Check(Get(kStatusFile) == text, "a writer that fails leaves the file", text);
        return std::nullopt;
    }
    const std::string saved = Get(kStatusFile);
    const auto conf = Parse(saved);
    Check(conf.has_value(), "a saved file is JSON", saved);
    return conf;
}

// All members but one are what they were.
void CheckOthers(Json::Value before, Json::Value after, const char *changed) {
    before.removeMember(changed); // of null too: it stands for an empty object
    after.removeMember(changed);
    Check(before == after || (before.empty() && after.empty()),
          "the other members stay as they are", changed);
}

void CheckPause(const std::string &text, const Json::Value &conf) {
    const auto paused = Write(text, [] { return StatusMgr::Pause(1); });
    if (paused) {
        const long long time = (*paused)["resume_time"].asInt64();
        const long long now = std::time(nullptr);
        Check(time >= now + 3590 && time <= now + 3610, "a pause of an hour ends in an hour");
        CheckOthers(conf, *paused, "resume_time");
    }
    const auto resumed = Write(text, [] { return StatusMgr::Resume(); });
    Check(resumed.has_value() == paused.has_value(), "who can pause can resume", text);
    if (resumed) {
        Check((*resumed)["resume_time"].asInt64() == -1, "-1 means not paused");
        CheckOthers(conf, *resumed, "resume_time");
    }
}

using Set = bool (*)(const std::string &share, bool mark);
using Ask = bool (*)(const std::string &share);

void CheckMark(const std::string &text, const Json::Value &conf, const char *kind, Set set,
               Ask ask) {
    if (const auto marked = Write(text, [set] { return set(kShare, true); })) {
        Check(ask(kShare), "a marked share is marked", kind);
        CheckOthers(conf, *marked, kind);
        Check(set(kLongerName, false) && ask(kShare), "and stays so", kind);
    }
    if (const auto cleared = Write(text, [set] { return set(kShare, false); })) {
        Check(!ask(kShare), "a share whose mark is cleared is not marked", kind);
        CheckOthers(conf, *cleared, kind);
        Check(conf.isMember(kind) || !cleared->isMember(kind), "clearing adds no member", kind);
    }
}

void CheckRevive(Run &run, const std::string &text) {
    (void)run.Commands();
    if (Write(text, [] { return StatusMgr::ShareRevive(kShare); })) {
        const auto commands = run.Commands();
        Check(commands.size() == 1 && commands[0]["type"] == "revive_share_worker" &&
                  commands[0]["data"]["share_name"] == kShare,
              "the daemon is told of a share that is revived");
        Check(!StatusMgr::ShareIsNoSpace(kShare), "a revived share is not out of space");
    }
}

void CheckUpdated(const std::string &text, const Json::Value &conf) {
    if (const auto marked = Write(text, [] { return StatusMgr::SetUpdated("step 1"); })) {
        Check(StatusMgr::IsUpdated("step 1"), "a step that is done is done");
        CheckOthers(conf, *marked, "step 1");
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    Run run;
    const std::string text(reinterpret_cast<const char *>(data), size);
    PutFile(kStatusFile, text);
    const auto conf = Parse(text);
    if (!conf) {
        long long time = 4711;
        Check(!StatusMgr::GetPauseInfo(time) && time == 4711, "a refused file tells no pause");
        Check(ErrorHandler::GetError() == FILEINDEX_ERR_LOAD, "a refused file sets its error");
        Check(!Write(text, [] { return StatusMgr::Resume(); }), "a refused file is not written");
        return 0;
    }
    CheckReaders(*conf);
    CheckMarks(*conf);
    CheckPause(text, *conf);
    CheckMark(text, *conf, "no_space", StatusMgr::ShareSetNoSpace, StatusMgr::ShareIsNoSpace);
    CheckMark(text, *conf, "need_reindex", StatusMgr::ShareSetNeedReindex,
              StatusMgr::ShareIsNeedReindex);
    CheckRevive(run, text);
    CheckUpdated(text, *conf);
    return 0;
}
