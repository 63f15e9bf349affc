#include "index_mgr/index_mgr_fixture.h"

#include <algorithm>
#include <sstream>

namespace VANO::TESTS {

namespace {

bool StartsWith(const std::string &text, const std::string &start) {
    return text.compare(0, start.size(), start) == 0;
}

} // namespace

std::string Changed(const std::string &file) {
    return "file: " + file;
}

std::string Locked(const std::string &file) {
    return "flock(" + file + ", 6)";
}

std::string Unlocked(const std::string &file) {
    return "flock(" + file + ", 8)";
}

std::string Made(const std::string &directory) {
    return "VANOEAMKDir(0, " + directory + "/@eaDir)";
}

std::string Told(const std::string &command, const std::string &key, const std::string &value) {
    Json::Value message(Json::objectValue);
    message["type"] = command;
    message["data"][key] = value;
    return "socket: " + CompactText(message);
}

std::string Watched(const std::string &directory, const std::vector<std::string> &fullPaths) {
    Json::Value description(Json::objectValue);
    description["queue"] = QueueOf(directory);
    description["config"] = Json::Value(Json::arrayValue);
    for (const std::string &path : fullPaths) {
        Json::Value entry(Json::objectValue);
        entry["path"] = path;
        entry["mask"] = 65486;
        entry["ignore"].append("@eaDir");
        description["config"].append(entry);
    }
    return "MonitorQueue::Upsert(" + CompactText(description) + ", fileindex, 1)";
}

std::string Unwatched(const std::string &directory) {
    return "MonitorQueue::Delete(" + QueueOf(directory) + ", fileindex, 1)";
}

std::string Removed(const std::string &path) {
    return "VLIBCExec(/bin/rm, -rf, " + path + ")";
}

std::vector<Json::Value> EventsIn(const std::string &queue) {
    const std::string text = ReadText(queue);
    EXPECT_TRUE(text.empty() || text.back() == '\n') << "the last line is not ended";
    std::istringstream lines(text);
    std::vector<Json::Value> events;
    for (std::string line; std::getline(lines, line);) {
        events.push_back(Json(line));
    }
    return events;
}

Json::Value Event(int code, const std::string &path, const Json::Value &data) {
    Json::Value event(Json::objectValue);
    event["event"] = code;
    event["path"] = path;
    event["data"] = data;
    return event;
}

Json::Value Report(bool document, bool audio, bool video, bool photo) {
    Json::Value report(Json::objectValue);
    report["document"] = document;
    report["audio"] = audio;
    report["video"] = video;
    report["photo"] = photo;
    return report;
}

Json::Value EverythingChanged() {
    return Report(true, true, true, true);
}

Json::Value NothingChanged() {
    return Report(false, false, false, false);
}

Json::Value PhotoFolder(const std::string &path) {
    Json::Value folder(Json::objectValue);
    folder["path"] = path;
    folder["name"] = "";
    folder["document"] = false;
    folder["audio"] = false;
    folder["video"] = false;
    folder["photo"] = true;
    return folder;
}

Json::Value Paths(const std::vector<std::string> &paths) {
    Json::Value array(Json::arrayValue);
    for (const std::string &path : paths) {
        array.append(path);
    }
    return array;
}

Arrangement NothingInTheWay() {
    return [] { return nullptr; };
}

Arrangement SettingsHold(const std::string &text) {
    return [text] {
        PutFile(kFolderFile, text);
        return nullptr;
    };
}

Arrangement Refused(const std::string &platformFunction, const std::vector<int> &answers) {
    return [platformFunction, answers] {
        FakePlatform::Get().Answer(platformFunction, answers);
        return nullptr;
    };
}

Arrangement Refused(Call call, int error, int nth) {
    return [call, error, nth] {
        Fault::Fail(call, error, nth);
        return nullptr;
    };
}

Arrangement Gone(const std::string &share, const std::string &platformFunction) {
    return [share, platformFunction] {
        FakePlatform::Get().Before(platformFunction,
                                   [share] { FakePlatform::Get().RemoveShare(share); });
        return nullptr;
    };
}

Arrangement Gone(const std::string &share, Call call) {
    return [share, call] {
        Fault::Before(call, [share](CallInfo &) { FakePlatform::Get().RemoveShare(share); });
        return nullptr;
    };
}

const std::vector<FailingStep> &FailuresBeforeAnyStep() {
    const auto lockHeld = [] {
        PutFile(kFolderFile, "{"); // is not read
        Fault::Quiet(Call::Usleep);
        return std::make_shared<HoldLock>(kFolderLock);
    };
    const auto lockRefused = [] {
        Fault::FailPath(Call::Open, "fileidx_cfg_folder.lock", EACCES);
        return nullptr;
    };
    const auto fullDisk = [] {
        Fault::FailAlways(Call::Write, ENOSPC);
        return nullptr;
    };
    static const std::string file(kFolderFile);
    static const std::vector<FailingStep> steps = {
        {"LockHeld", lockHeld, 0, {"config:74 Failed to lock folder"}, FILEINDEX_ERR_LOCK, true, 2},
        {"LockFileRefused",
         lockRefused,
         0,
         {"config:74 Failed to lock folder"},
         FILEINDEX_ERR_LOCK},
        {"SettingsNoJson",
         SettingsHold("{"),
         0,
         {"config:22 Failed to load json from " + file},
         FILEINDEX_ERR_LOAD},
        {"SettingsOfAnotherShape",
         SettingsHold("[ ]"),
         0,
         {"folders:80 Malformed folders: []"},
         FILEINDEX_ERR_MALFORMED},
        {"SaveOnAFullDisk",
         fullDisk,
         0,
         {"config:38 Failed to save json to " + file},
         FILEINDEX_ERR_SAVE}};
    return steps;
}

const std::vector<ServiceFailure> &ServiceFailures() {
    static const std::vector<ServiceFailure> failures = {
        {"Stop", "VLIBServiceStop", {kStopped, kSpotlightOff, kRestarted}},
        {"Spotlight", "VANOSMBSetSpotlight", {kStopped, kSpotlightOff}},
        {"Restart", "VLIBServiceRestart", {kStopped, kSpotlightOff, kRestarted}}};
    return failures;
}

void IndexMgrTest::ExpectFailure(const FailingStep &row, const std::function<bool()> &operation,
                                 std::vector<std::string> allSteps) {
    SetPlatformError();
    const auto daemon = row.daemonRuns ? std::make_unique<DaemonPeer>() : nullptr;
    const Obstacle obstacle = row.arrange();
    Watch();
    EXPECT_FALSE(operation());
    ExpectLeakedDescriptors(row.leaks);
    ExpectError(row.error);
    ExpectLog(row.log);
    allSteps.resize(row.steps);
    EXPECT_EQ(Steps(), allSteps);
    Fault::Reset();
}

void IndexMgrTest::ExpectSuccess(const ServiceFailure &row, const std::function<bool()> &operation,
                                 const std::vector<std::string> &laterSteps) {
    PutFolders({"/photos/a"});
    platform.spotlight = true;
    SetPlatformError();
    platform.AnswerAlways(row.function, -1);
    Watch();
    EXPECT_TRUE(operation());
    ExpectLog({std::string("index_mgr:* ") + row.function + " failed: err=[0x00AB service.c:77]"});
    ExpectError(FILEINDEX_ERR_NONE);
    std::vector<std::string> expected = {Changed(kFolderFile)};
    expected.insert(expected.end(), row.services.begin(), row.services.end());
    expected.insert(expected.end(), laterSteps.begin(), laterSteps.end());
    EXPECT_EQ(Steps(), expected);
}

void IndexMgrTest::WatchLockAt(const std::vector<std::string> &platformFunctions,
                               const std::vector<Call> &calls) {
    const auto look = [this](const std::string &what) {
        (IsLocked(kFolderLock) ? held : unheld).push_back(what);
    };
    for (const std::string &function : platformFunctions) {
        platform.Before(function, [look, function] { look(function); });
    }
    for (const Call call : calls) {
        Fault::Before(call, [look](CallInfo &info) {
            if (info.call != Call::Write || info.path == QueueOf(kPhotos)) {
                look(info.Name());
            }
        });
    }
}

void IndexMgrTest::SetUp() {
    LibraryTest::SetUp();
    platform.AddShare("photos", kPhotos);
    platform.AddShare("video", kVideo);
    platform.AddShare("music", kMusic);
    for (const char *directory : {kPhotos, kVideo, kMusic}) {
        PutFile(QueueOf(directory), "");
    }
}

void IndexMgrTest::PutFolders(const std::vector<std::string> &paths) {
    Json::Value settings(Json::objectValue);
    for (const std::string &path : paths) {
        settings[path] = PhotoFolder(path);
    }
    PutFile(kFolderFile, CompactText(settings));
}

std::vector<std::string> IndexMgrTest::StoredPaths() {
    return ReadJson(kFolderFile).getMemberNames();
}

void IndexMgrTest::Watch() {
    EventTrace::Get().Clear();
    for (const std::string &path : {std::string(kFolderFile), std::string(kStatusFile),
                                    QueueOf(kPhotos), QueueOf(kVideo), QueueOf(kMusic)}) {
        EventTrace::Get().WatchFile(path);
    }
}

std::vector<std::string> IndexMgrTest::Steps() {
    std::vector<std::string> steps = Effects();
    const auto accompanies = [](const std::string &entry) {
        return StartsWith(entry, "log: ") || StartsWith(entry, "VANOEAMKDir(");
    };
    steps.erase(std::remove_if(steps.begin(), steps.end(), accompanies), steps.end());
    return steps;
}

void IndexMgrTest::SetPlatformError() {
    platform.lastError = 0xAB;
    platform.lastErrorFile = "service.c";
    platform.lastErrorLine = 77;
}

} // namespace VANO::TESTS
