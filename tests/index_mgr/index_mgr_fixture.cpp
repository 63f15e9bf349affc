#include "index_mgr/index_mgr_fixture.h"

#include <algorithm>
#include <json/writer.h>
#include <sstream>

namespace VANO::TESTS {

namespace {

std::string Compact(const Json::Value &value) {
    Json::StreamWriterBuilder settings;
    settings["indentation"] = "";
    settings["emitUTF8"] = true;
    return Json::writeString(settings, value);
}

bool StartsWith(const std::string &text, const std::string &start) {
    return text.compare(0, start.size(), start) == 0;
}

} // namespace

std::string QueueOf(const std::string &directory) {
    return directory + "/@eaDir/VANO@file_index_queue";
}

std::string DatabaseOf(const std::string &directory) {
    return directory + "/@eaDir/VANO@.fileindexdb";
}

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
    return "socket: " + Compact(message);
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
    return "MonitorQueue::Upsert(" + Compact(description) + ", fileindex, 1)";
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
    PutFile(kFolderFile, Compact(settings));
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
