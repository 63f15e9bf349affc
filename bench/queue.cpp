// A share's event queue: asking what waits in it, and adding to it.

#include "bench/benchmarks.h"

#include <algorithm>
#include <cstring>
#include <fcntl.h>
#include <fileindex/event_queue.h>
#include <fileindex/index_mgr.h>
#include <fileindex/status_mgr.h>
#include <filesystem>
#include <json/reader.h>
#include <map>
#include <memory>
#include <simdjson.h>
#include <string_view>
#include <sys/file.h>
#include <unistd.h>

#include "base/unique_fd.h"
#include "bench/appliance.h"
#include "bench/input.h"
#include "bench/measure.h"
#include "core/event.h"

namespace VANO::BENCH {

namespace {

using FILEINDEX::AddCustomEvent;
using FILEINDEX::IndexMgr;
using FILEINDEX::kEventSettingChanged;
using FILEINDEX::StatusMgr;
using FILEINDEX::UniqueFd;

constexpr std::size_t kEvents = 1'000'000;
constexpr std::size_t kQuickEvents = 10'000;

// --- What waits? ------------------------------------------------------------------------------

// The pending test of a folder without events: every line is compared and nothing is found.
Operation PendingTest(std::size_t events) {
    const FilledQueue &queue = FillQueue(events);
    Require(StatusMgr::GetFolderStatus(queue.waiting.front()) == "processing",
            "a folder with events is not pending");
    return {
        [folder = queue.idle.front()] { return StatusMgr::GetFolderStatus(folder) == "finished"; },
        {},
        {}};
}

// What a reader of events comes to: how many there are, and the sums of their codes and of the
// lengths of their paths. Touches what it must and can be compared.
struct Digest {
    std::size_t events = 0;
    std::uint64_t codes = 0;
    std::size_t pathBytes = 0;

    bool operator==(const Digest &other) const {
        return events == other.events && codes == other.codes && pathBytes == other.pathBytes;
    }
};

// Each line, found with memchr() in memory, through one reader of the JSON library with its own
// settings; "event" and "path" are taken from it.
Digest DigestWithJsonLibrary(const std::string &text) {
    static const Json::CharReaderBuilder settings;
    const std::unique_ptr<Json::CharReader> reader(settings.newCharReader());
    Digest digest;
    Json::Value event;
    const char *const end = text.data() + text.size();
    for (const char *line = text.data(); line != end;) {
        const auto *const newline = static_cast<const char *>(
            std::memchr(line, '\n', static_cast<std::size_t>(end - line)));
        Require(newline != nullptr && reader->parse(line, newline, &event, nullptr), "bad line");
        ++digest.events;
        digest.codes += event["event"].asUInt();
        const char *begin = nullptr;
        const char *past = nullptr;
        Require(event["path"].getString(&begin, &past), "no path");
        digest.pathBytes += static_cast<std::size_t>(past - begin);
        line = newline + 1;
    }
    return digest;
}

// The same with iterate_many() over the same bytes in memory, at its own batch size and without
// its thread: all is measured on one core.
Digest DigestWithSimdjson(const simdjson::padded_string &text) {
    simdjson::ondemand::parser parser;
#ifdef SIMDJSON_THREADS_ENABLED
    parser.threaded = false;
#endif
    Digest digest;
    simdjson::ondemand::document_stream documents;
    Require(parser.iterate_many(text).get(documents) == simdjson::SUCCESS, "no documents");
    for (auto document : documents) {
        std::uint64_t code = 0;
        std::string_view path;
        Require(document["event"].get(code) == simdjson::SUCCESS &&
                    document["path"].get(path) == simdjson::SUCCESS,
                "bad document");
        ++digest.events;
        digest.codes += code;
        digest.pathBytes += path.size();
    }
    return digest;
}

Pair ScanAgainstJsonLibrary(std::size_t events) {
    const Operation scan = PendingTest(events);
    const auto text = std::make_shared<const std::string>(ContentOf(FillQueue(events).file));
    return {scan, {[=] { return DigestWithJsonLibrary(*text).events == events; }, {}, {}}};
}

Pair ScanAgainstSimdjson(std::size_t events) {
    const Operation scan = PendingTest(events);
    const std::string text = ContentOf(FillQueue(events).file);
    const Digest expected = DigestWithJsonLibrary(text);
    const auto padded = std::make_shared<const simdjson::padded_string>(text);
    return {scan, {[=] { return DigestWithSimdjson(*padded) == expected; }, {}, {}}};
}

// --- A settings page --------------------------------------------------------------------------

// The page holds the folders of the first share, which is the one with the queue.
bool IsRightPage(const Json::Value &page, const FilledQueue &queue) {
    const std::size_t count = queue.waiting.size() + queue.idle.size();
    if (page["total"] != Json::UInt64{kMaxFolders} || page["folder"].size() != count) {
        return false;
    }
    std::map<std::string, std::string> statuses;
    for (const Json::Value &folder : page["folder"]) {
        if (!folder["additional"]["is_valid"].asBool()) {
            return false;
        }
        statuses[folder["path"].asString()] = folder["additional"]["status"].asString();
    }
    const auto all = [&](const std::vector<std::string> &folders, const char *status) {
        return std::all_of(folders.begin(), folders.end(),
                           [&](const std::string &path) { return statuses[path] == status; });
    };
    return all(queue.waiting, "processing") && all(queue.idle, "finished");
}

Pair PageAgainstScan(std::size_t events) {
    const Operation scan = PendingTest(events);
    const FilledQueue queue = FillQueue(events);
    Json::Value additional(Json::arrayValue);
    additional.append("status");
    additional.append("is_valid");
    return {{[=] {
                 Json::Value page;
                 return IndexMgr::List(page, 0, queue.waiting.size() + queue.idle.size(), "path",
                                       "ASC", additional) &&
                        IsRightPage(page, queue);
             },
             {},
             {}},
            scan};
}

// --- Adding -----------------------------------------------------------------------------------

Json::Value ChangeReport() {
    Json::Value report(Json::objectValue);
    for (const char *type : {"document", "audio", "video", "photo"}) {
        report[type] = true;
    }
    return report;
}

bool AppendPlainly(const std::string &file, const std::string &line) {
    const UniqueFd queue(::open(file.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0666));
    return queue && ::flock(queue.Get(), LOCK_EX | LOCK_NB) == 0 &&
           ::write(queue.Get(), line.data(), line.size()) == static_cast<ssize_t>(line.size());
}

void CutTo(const std::string &file, std::size_t bytes) {
    Require(::truncate(file.c_str(), static_cast<off_t>(bytes)) == 0, "cannot cut the queue");
}

Pair AppendToEmptyQueue() {
    RemoveQueues();
    const std::string folder = FolderPaths(2).back();
    const std::string fullPath = FullPathOf(folder);
    const std::string file = QueueFileOf(folder.substr(1, folder.find('/', 1) - 1));
    Require(AppendPlainly(file, ""), "cannot make a queue");
    const auto append = [=, data = ChangeReport()] {
        return AddCustomEvent(kEventSettingChanged, fullPath, data);
    };
    const std::string line =
        R"({"data":{"audio":true,"document":true,"photo":true,"video":true},"event":131072,"path":")" +
        fullPath + "\"}\n";
    const auto prepare = [=] { CutTo(file, 0); };
    const auto check = [=] { return ContentOf(file) == line; };
    return {{append, prepare, check}, {[=] { return AppendPlainly(file, line); }, prepare, check}};
}

Operation AppendToQueue(std::size_t events) {
    const FilledQueue queue = FillQueue(events);
    // No re-index of an idle folder waits, so the whole queue is looked through.
    return {[=, path = FullPathOf(queue.idle.front()), data = ChangeReport()] {
                return AddCustomEvent(kEventSettingChanged, path, data);
            },
            {},
            [=] {
                const bool longer = std::filesystem::file_size(queue.file) > queue.bytes;
                CutTo(queue.file, queue.bytes);
                return longer;
            }};
}

} // namespace

void AddQueueBenchmarks() {
    const std::size_t events = Size(kEvents, kQuickEvents);
    AddComparison({"queue_scan",
                   "pending test on 1,000,000 events / jsoncpp on each line in memory",
                   Target::kAtLeast, 15, 1, [=] { return ScanAgainstJsonLibrary(events); }});
    AddComparison({"queue_scan_limit",
                   "pending test on 1,000,000 events / simdjson iterate_many in memory",
                   Target::kAtLeast, 0.6, 1, [=] { return ScanAgainstSimdjson(events); }});
    AddComparison({"append_event", "AddCustomEvent, empty queue / open + flock + write + close",
                   Target::kAtMost, 3, 1, AppendToEmptyQueue});
    AddComparison({"page_with_status",
                   "page of 50 with status and is_valid, 1,000,000 events / one scan of them",
                   Target::kAtMost, 3, 1, [=] { return PageAgainstScan(events); }});
    // Each queue serves both lines.
    for (std::size_t size = 1'000; size <= Size(10'000'000, 10'000); size *= 10) {
        AddSeries({"queue", "pending_test", {size}, PendingTest});
        AddSeries({"queue", "append_event", {size}, AppendToQueue});
    }
}

} // namespace VANO::BENCH
