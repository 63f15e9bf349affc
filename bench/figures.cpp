// The figures that scripts/bench reports, and the costs at growing sizes that it draws. Each figure
// measures an operation in turns with what it cannot be cheaper than, or with itself at another
// size, and gives "ours", "theirs" and "ratio" (of the times; of a speed-up its inverse, "speed").

#include <algorithm>
#include <benchmark/benchmark.h>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <fileindex/event_queue.h>
#include <fileindex/fileindex.h>
#include <fileindex/index_mgr.h>
#include <fileindex/status_mgr.h>
#include <filesystem>
#include <fstream>
#include <functional>
#include <json/reader.h>
#include <malloc.h>
#include <map>
#include <memory>
#include <new>
#include <simdjson.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/unique_fd.h"
#include "core/event.h"
#include "core/paths.h"
#include "support/daemon_peer.h"
#include "support/event_trace.h"
#include "support/files.h"
#include "workload.h"

namespace {

thread_local std::size_t g_allocations = 0;

} // namespace

// These stand before the C++ library's in every shared library too; inlined, one without the other
// would look like a mismatch.
[[gnu::noinline]] void *operator new(std::size_t size) {
    ++g_allocations;
    if (void *memory = std::malloc(size != 0 ? size : 1)) {
        return memory;
    }
    throw std::bad_alloc();
}

[[gnu::noinline]] void operator delete(void *memory) noexcept {
    std::free(memory);
}

[[gnu::noinline]] void operator delete(void *memory, std::size_t /*size*/) noexcept {
    std::free(memory);
}

namespace VANO::BENCH {

namespace {

using FILEINDEX::Folder;
using FILEINDEX::IndexMgr;
using FILEINDEX::StatusMgr;
using FILEINDEX::UniqueFd;
using TESTS::DaemonPeer;

bool g_quick = false; // sizes that only show that everything runs

std::size_t Events() {
    return g_quick ? 10'000 : 1'000'000;
}

double MinSeconds() {
    return g_quick ? 0.01 : 0.3;
}

// --- How it is measured -----------------------------------------------------------------------

// Something that is timed. A wrong answer is no time: it ends the benchmark with an error.
struct Operation {
    std::function<bool()> run;          // timed; false for a wrong answer
    std::function<void()> prepare = {}; // before each sample, not timed
    std::function<bool()> check = {};   // after each sample, not timed
};

struct Pair {
    Operation ours;
    Operation theirs;
};

double Median(std::vector<double> values) {
    const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

// Processor time, the kernel's included: other programs disturb it less than elapsed time, and
// nothing that is measured here sleeps or waits for a disk.
double Now() {
    timespec now{};
    (void)::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

// What reading the clock adds to a sample.
double ClockCost() {
    static const double cost = [] {
        std::vector<double> samples(1001);
        for (double &sample : samples) {
            const double begin = Now();
            sample = Now() - begin;
        }
        return Median(samples);
    }();
    return cost;
}

double TimeOf(const Operation &operation, int calls) {
    if (operation.prepare) {
        operation.prepare();
    }
    const double clockCost = ClockCost();
    bool right = true;
    const double begin = Now();
    for (int i = 0; i < calls; ++i) {
        right = operation.run() && right;
    }
    const double elapsed = Now() - begin - clockCost;
    Require(right && (!operation.check || operation.check()) && elapsed > 0, "wrong answer");
    return elapsed / calls;
}

template <typename Body>
void Guarded(benchmark::State &state, Body body) {
    try {
        body();
    } catch (const std::exception &problem) {
        state.SkipWithError(problem.what());
    }
}

// A sample of the one, a sample of the other: what disturbs the machine meets both.
void AddFigure(const char *key, const std::function<Pair()> &setUp, int calls = 1) {
    benchmark::RegisterBenchmark(key,
                                 [=](benchmark::State &state) {
                                     Guarded(state, [&] {
                                         const Pair pair = setUp();
                                         std::vector<double> ours;
                                         std::vector<double> theirs;
                                         for (auto _ : state) {
                                             ours.push_back(TimeOf(pair.ours, calls));
                                             theirs.push_back(TimeOf(pair.theirs, calls));
                                             state.SetIterationTime((ours.back() + theirs.back()) *
                                                                    calls);
                                         }
                                         state.counters["ours"] = Median(ours);
                                         state.counters["theirs"] = Median(theirs);
                                         state.counters["ratio"] = Median(ours) / Median(theirs);
                                         state.counters["speed"] = Median(theirs) / Median(ours);
                                     });
                                 })
        ->UseManualTime()
        ->MinTime(MinSeconds());
}

// The cost of an operation at growing sizes: a line of the chart, "series/<axis>/<name>/<size>".
void AddSeries(const char *name, const std::vector<std::int64_t> &sizes,
               const std::function<Operation(std::size_t)> &setUp) {
    auto *const series = benchmark::RegisterBenchmark(name, [=](benchmark::State &state) {
        Guarded(state, [&] {
            const Operation operation = setUp(static_cast<std::size_t>(state.range(0)));
            std::vector<double> times;
            for (auto _ : state) {
                times.push_back(TimeOf(operation, 1));
                state.SetIterationTime(times.back());
            }
            state.counters["seconds"] = Median(times);
        });
    });
    for (const std::int64_t size : sizes) {
        series->Arg(size);
    }
    series->UseManualTime()->MinTime(MinSeconds())->Repetitions(1);
}

// --- Is this path indexed? --------------------------------------------------------------------

// A path that no folder covers, though it begins as one does nearly to the end.
std::string PathOfNoFolder() {
    std::string path = FullPathOf(FolderPaths(kMaxFolders).back());
    path.back() = path.back() == 'x' ? 'y' : 'x';
    return path + "/IMG_2041.JPG";
}

std::string PathInFolder() {
    return FullPathOf(FolderPaths(1).front()) + "/IMG_2041.JPG";
}

bool ReadSettingsPlainly() {
    const UniqueFd file(::open(FILEINDEX::kFolderConfPath, O_RDONLY | O_CLOEXEC));
    struct stat info {};
    if (!file || ::fstat(file.Get(), &info) != 0) {
        return false;
    }
    std::string text(static_cast<std::size_t>(info.st_size), '\0');
    if (::read(file.Get(), text.data(), text.size()) != info.st_size) {
        return false;
    }
    static const Json::CharReaderBuilder settings;
    const std::unique_ptr<Json::CharReader> reader(settings.newCharReader());
    Json::Value value;
    return reader->parse(text.data(), text.data() + text.size(), &value, nullptr) &&
           value.size() == kMaxFolders;
}

Operation OneShotQuery(std::size_t folders) {
    SetFolders(folders);
    Require(FILEIDXIsFullPathIndexed(PathInFolder().c_str()) == 1, "a folder is not found");
    return {[path = PathOfNoFolder()] { return FILEIDXIsFullPathIndexed(path.c_str()) == 0; }};
}

std::vector<Folder> HeldList(std::size_t count) {
    SetFolders(count);
    std::vector<Folder> folders;
    Require(IndexMgr::List(folders) && folders.size() == count, "the settings do not load");
    return folders;
}

std::size_t AllocationsOfQuery(const std::string &path, std::size_t folders) {
    const std::vector<Folder> held = HeldList(folders);
    const std::size_t before = g_allocations;
    Require(!IndexMgr::IsFullPathIndexed(path, held), "wrong answer");
    return g_allocations - before;
}

bool StartsWithOneOf(const std::string &path, const std::vector<std::string> &prefixes) {
    return std::any_of(prefixes.begin(), prefixes.end(), [&](const std::string &prefix) {
        return path.size() >= prefix.size() &&
               std::memcmp(path.data(), prefix.data(), prefix.size()) == 0;
    });
}

Pair ListQuery() {
    const std::string path = PathOfNoFolder();
    Require(AllocationsOfQuery(path, kMaxFolders) == AllocationsOfQuery(path, 10),
            "memory is allocated for each record");
    const std::vector<Folder> held = HeldList(kMaxFolders);
    std::vector<std::string> prefixes;
    for (const Folder &folder : held) {
        prefixes.push_back(folder.full_path);
    }
    Require(IndexMgr::IsFullPathIndexed(PathInFolder(), held), "a folder is not found");
    return {{[=] { return !IndexMgr::IsFullPathIndexed(path, held); }},
            {[=] { return !StartsWithOneOf(path, prefixes); }}};
}

Operation LoadAndList(std::size_t count) {
    return {[count] {
                std::vector<Folder> folders;
                return IndexMgr::List(folders) && folders.size() == count;
            },
            [count] { SetFolders(count); }};
}

// --- What waits in the queue? -----------------------------------------------------------------

// The pending test of a folder without events: every line is compared and nothing is found.
Operation PendingTest(std::size_t events) {
    const FilledQueue &queue = FillQueue(events);
    Require(StatusMgr::GetFolderStatus(queue.waiting.front()) == "processing",
            "a folder with events is not pending");
    return {
        [folder = queue.idle.front()] { return StatusMgr::GetFolderStatus(folder) == "finished"; }};
}

// What a reader of events comes to. Touches what it must and can be compared.
struct Digest {
    std::size_t events = 0;
    std::uint64_t codes = 0;
    std::size_t pathBytes = 0;

    bool operator==(const Digest &other) const {
        return events == other.events && codes == other.codes && pathBytes == other.pathBytes;
    }
};

// Each line, found with memchr() in memory, through one reader with its own settings.
Digest DigestWithJsoncpp(const std::string &text) {
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

// The same over the same bytes, at its own batch size and on one core, as all is measured.
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

Pair ScanAgainstJsoncpp() {
    const Operation scan = PendingTest(Events());
    const auto text =
        std::make_shared<const std::string>(TESTS::ReadText(FillQueue(Events()).file));
    return {scan, {[=] { return DigestWithJsoncpp(*text).events == Events(); }}};
}

Pair ScanAgainstSimdjson() {
    const Operation scan = PendingTest(Events());
    const std::string text = TESTS::ReadText(FillQueue(Events()).file);
    const Digest expected = DigestWithJsoncpp(text);
    const auto padded = std::make_shared<const simdjson::padded_string>(text);
    return {scan, {[=] { return DigestWithSimdjson(*padded) == expected; }}};
}

// The page holds the folders of the first share, which is the one with the queue.
bool IsRightPage(const Json::Value &page, const FilledQueue &queue) {
    if (page["total"] != Json::UInt64{kMaxFolders} ||
        page["folder"].size() != queue.waiting.size() + queue.idle.size()) {
        return false;
    }
    std::map<std::string, std::string> expected;
    for (const std::string &path : queue.waiting) {
        expected[path] = "processing";
    }
    for (const std::string &path : queue.idle) {
        expected[path] = "finished";
    }
    return std::all_of(page["folder"].begin(), page["folder"].end(), [&](const Json::Value &shown) {
        return shown["additional"]["is_valid"].asBool() &&
               shown["additional"]["status"] == expected[shown["path"].asString()];
    });
}

Pair PageAgainstScan() {
    const Operation scan = PendingTest(Events());
    Json::Value additional(Json::arrayValue);
    additional.append("status");
    additional.append("is_valid");
    return {{[additional, queue = FillQueue(Events())] {
                Json::Value page;
                return IndexMgr::List(page, 0, queue.waiting.size() + queue.idle.size(), "path",
                                      "ASC", additional) &&
                       IsRightPage(page, queue);
            }},
            scan};
}

// In megabytes; in a process that does nothing else, so that no freed memory can be used again.
void PeakMemory(benchmark::State &state) {
    const auto kilobytes = [](const std::string &name) {
        std::ifstream status("/proc/self/status");
        std::string word;
        double figure = 0;
        while (status >> word && (word != name + ":" || !(status >> figure))) {
        }
        return figure;
    };
    Guarded(state, [&] {
        const std::string folder =
            FillQueue(kNoLimit, g_quick ? 16'000'000 : 1'000'000'000).idle.front();
        (void)::malloc_trim(0);
        std::ofstream("/proc/self/clear_refs") << '5'; // the peak is counted anew
        const double before = kilobytes("VmRSS");
        for (auto _ : state) {
            Require(StatusMgr::GetFolderStatus(folder) == "finished", "wrong answer");
        }
        const double peak = kilobytes("VmHWM");
        RemoveQueues();
        Require(before > 0 && peak >= before, "the kernel does not tell the peak");
        state.counters["megabytes"] = (peak - before) * 1024 / 1e6;
    });
}

// --- Changing something -----------------------------------------------------------------------

bool AppendPlainly(const std::string &file, const std::string &line) {
    const UniqueFd queue(::open(file.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0666));
    return queue && ::flock(queue.Get(), LOCK_EX | LOCK_NB) == 0 &&
           ::write(queue.Get(), line.data(), line.size()) == static_cast<ssize_t>(line.size());
}

bool AddEvent(const std::string &fullPath) {
    Json::Value report(Json::objectValue);
    for (const char *type : {"document", "audio", "video", "photo"}) {
        report[type] = true;
    }
    return FILEINDEX::AddCustomEvent(FILEINDEX::kEventSettingChanged, fullPath, report);
}

Pair AppendToEmptyQueue() {
    RemoveQueues();
    const std::string folder = FolderPaths(2).back(); // of a share in memory
    const std::string fullPath = FullPathOf(folder);
    const std::string file = QueueFileOf(folder);
    const std::string line =
        R"({"data":{"audio":true,"document":true,"photo":true,"video":true},"event":131072,"path":")" +
        fullPath + "\"}\n";
    const auto prepare = [=] { TESTS::PutFile(file, ""); };
    const auto check = [=] { return TESTS::ReadText(file) == line; };
    return {{[=] { return AddEvent(fullPath); }, prepare, check},
            {[=] { return AppendPlainly(file, line); }, prepare, check}};
}

// No re-index of an idle folder waits, so the whole queue is searched for one.
Operation AppendToQueue(std::size_t events) {
    const FilledQueue queue = FillQueue(events);
    return {[path = FullPathOf(queue.idle.front())] { return AddEvent(path); },
            {},
            [queue] {
                const bool longer = std::filesystem::file_size(queue.file) > queue.bytes;
                std::filesystem::resize_file(queue.file, queue.bytes);
                return longer;
            }};
}

// One request on an appliance without settings and with empty queues; every folder is announced to
// the daemon.
Operation BulkUpsert(const std::shared_ptr<DaemonPeer> &daemon, std::size_t count) {
    Json::Value request(Json::arrayValue);
    for (const std::string &path : FolderPaths(count)) {
        Json::Value &folder = request.append(Json::Value(Json::objectValue));
        folder["path"] = path;
        folder["photo"] = true;
    }
    return {[=] {
                const bool done = IndexMgr::Upsert(request);
                daemon->Sync();
                return done;
            },
            [=] {
                SetFolders(0);
                RemoveQueues();
                daemon->Clear();
                TESTS::EventTrace::Get().Clear();
            },
            [=] {
                std::vector<Folder> folders;
                return daemon->Commands().size() == count && IndexMgr::List(folders) &&
                       folders.size() == count;
            }};
}

Pair BulkUpsertGrowth() {
    const auto daemon = std::make_shared<DaemonPeer>();
    return {BulkUpsert(daemon, kMaxFolders), BulkUpsert(daemon, kMaxFolders / 10)};
}

void AddAll() {
    AddFigure("one_shot_query", [] {
        return Pair{OneShotQuery(kMaxFolders), {ReadSettingsPlainly}};
    });
    AddFigure("list_query", ListQuery, 100);
    AddFigure("load_growth", [] {
        return Pair{LoadAndList(kMaxFolders), LoadAndList(kMaxFolders / 10)};
    });
    AddFigure("queue_scan", ScanAgainstJsoncpp);
    AddFigure("queue_scan_limit", ScanAgainstSimdjson);
    AddFigure("page_with_status", PageAgainstScan);
    AddFigure("append_event", AppendToEmptyQueue);
    AddFigure("bulk_upsert_growth", BulkUpsertGrowth);
    benchmark::RegisterBenchmark("peak_memory", PeakMemory)->Iterations(1)->Repetitions(1);

    const std::vector<std::int64_t> folders = {10, 30, 100, 300, 1000};
    AddSeries("series/folders/one_shot_query", folders, OneShotQuery);
    AddSeries("series/folders/load_and_list", folders, LoadAndList);
    AddSeries("series/folders/bulk_upsert", folders,
              [](std::size_t count) { return BulkUpsert(std::make_shared<DaemonPeer>(), count); });
    std::vector<std::int64_t> events = {1'000, 10'000};
    if (!g_quick) {
        events.insert(events.end(), {100'000, 1'000'000, 10'000'000});
    }
    AddSeries("series/queue/pending_test", events, PendingTest);
    AddSeries("series/queue/append_event", events, AppendToQueue);
}

} // namespace

} // namespace VANO::BENCH

int main(int argc, char **argv) {
    VANO::BENCH::g_quick = std::getenv("FILEINDEX_BENCH_QUICK") != nullptr;
    benchmark::Initialize(&argc, argv);
    VANO::BENCH::MakeAppliance();
    VANO::BENCH::AddAll();
    return benchmark::RunSpecifiedBenchmarks() != 0 ? 0 : 2;
}
