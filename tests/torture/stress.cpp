// Many at once: processes and threads that write, ask and append events, while the example's peer
// consumes the queues. Each thread owns one folder and one share mark, so that what must be in the
// files at the end can be told: what its last successful operation left, or what a later one left
// that failed only after it had saved.

#include <algorithm>
#include <chrono>
#include <fileindex/config.h>
#include <fileindex/event_queue.h>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/status.h>
#include <fileindex/status_mgr.h>
#include <fstream>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <random>
#include <set>
#include <shared_mutex>
#include <sstream>
#include <stdexcept>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

#include "log_notes.h"
#include "parts.h"
#include "support/files.h"
#include "system/child.h"
#include "tally.h"
#include "testbed.h"
#include "tracer.h"

namespace VANO::TORTURE {

namespace {

using namespace FILEINDEX;
using Clock = std::chrono::steady_clock;

constexpr int kEventCode = 7; // no code of the library's own: nothing else appends it

std::string ShareName(int process) {
    return "s" + std::to_string(process);
}
std::string ShareDirectory(int process) {
    return "/volume1/" + ShareName(process);
}
std::string ResultFile(int process) {
    return "/tmp/stress." + std::to_string(process);
}

// What a thing that one thread owns may be at the end; no text: it is not there.
using Value = std::optional<std::string>;

class Owned {
  public:
    // The outcome of an operation that was to make it `value`.
    void Became(const Value &value, bool succeeded, const LogNotes &notes) {
        if (succeeded) {
            values_ = {value};
        } else if (!notes.OnlyLockFailed()) {
            values_.insert(value); // it may have been saved before the failure
        }
    }
    [[nodiscard]] const std::set<Value> &Possible() const { return values_; }

  private:
    std::set<Value> values_{Value()};
};

struct Counts {
    long operations = 0;
    long succeeded = 0;
    long lockFailures = 0;
    long reads = 0;
    long events = 0;
};

// A lock that stays busy leaves two descriptors open: who fights for locks all day has to close
// them, while no operation is under way.
class Janitor {
  public:
    // Around an operation.
    [[nodiscard]] std::shared_lock<std::shared_mutex> Enter() {
        return std::shared_lock<std::shared_mutex>(mutex_);
    }

    void CloseLockFiles() {
        const std::unique_lock<std::shared_mutex> alone(mutex_);
        for (const std::string &name : NamesIn("/proc/self/fd")) {
            const int fd = std::stoi(name);
            const std::string path = PathOfFd(::getpid(), fd);
            if (path == kFolderLock || path == kStatusLock) {
                (void)::close(fd);
            }
        }
    }

  private:
    std::shared_mutex mutex_;
};

// One thread's part.
class Actor {
  public:
    Actor(Janitor &janitor, int process, int number, std::uint32_t seed)
        : janitor_(janitor), share_(ShareName(process)),
          name_(share_ + "t" + std::to_string(number)),
          folder_("/" + share_ + "/t" + std::to_string(number)),
          directory_(ShareDirectory(process)), random_(seed) {}

    void Run(Clock::time_point end) {
        while (Clock::now() < end) {
            Act();
            if (counts_.lockFailures >= nextCleaning_) {
                nextCleaning_ += kFailuresBetweenCleanings;
                janitor_.CloseLockFiles();
            }
        }
    }

    // "folder <path> <possible value>...", "mark <share> ...", "event <path>", "complaint <text>",
    // "count <name> <number>"
    void Write(std::ostream &out) const {
        WriteOwned(out, "folder", folder_, stored_);
        WriteOwned(out, "mark", name_, mark_);
        for (const std::string &path : events_) {
            out << "event " << path << '\n';
        }
        for (const std::string &complaint : complaints_) {
            out << "complaint " << complaint << '\n';
        }
        out << "count " << counts_.operations << ' ' << counts_.succeeded << ' '
            << counts_.lockFailures << ' ' << counts_.reads << ' ' << counts_.events << '\n';
    }

  private:
    static constexpr long kFailuresBetweenCleanings = 500;

    void Act() {
        const auto inside = janitor_.Enter();
        ForgetNotes();
        LOG_LEVEL = 7; // an event that is dropped is told of; any thread may set it at any time
        switch (random_() % 8) {
        case 0:
        case 1:
            UpsertFolder();
            break;
        case 2:
            DeleteFolder();
            break;
        case 3:
            MarkShare();
            break;
        case 4:
            PauseOrResume();
            break;
        case 5:
            AppendEvent();
            break;
        default:
            Read();
            break;
        }
    }

    static void WriteOwned(std::ostream &out, const char *kind, const std::string &name,
                           const Owned &owned) {
        out << kind << ' ' << name;
        for (const Value &value : owned.Possible()) {
            out << ' ' << value.value_or("-");
        }
        out << '\n';
    }

    bool Finish(bool succeeded) {
        ++counts_.operations;
        counts_.succeeded += succeeded ? 1 : 0;
        counts_.lockFailures += !succeeded && Notes().OnlyLockFailed() ? 1 : 0;
        if (Notes().loadFailed) {
            complaints_.push_back("a settings file did not load");
        }
        return succeeded;
    }

    std::string NextName() { return name_ + "." + std::to_string(++serial_); }

    void UpsertFolder() {
        const std::string name = NextName();
        Json::Value request(Json::arrayValue);
        request[0]["path"] = folder_;
        request[0]["name"] = name;
        request[0]["photo"] = random_() % 2 == 0;
        const bool succeeded = Finish(IndexMgr::Upsert(request));
        stored_.Became(name, succeeded, Notes());
    }

    void DeleteFolder() {
        Json::Value request(Json::arrayValue);
        request.append(folder_);
        const bool succeeded = Finish(IndexMgr::Delete(request));
        stored_.Became(std::nullopt, succeeded, Notes());
    }

    void MarkShare() {
        const bool marked = random_() % 2 == 0;
        const bool succeeded = Finish(StatusMgr::ShareSetNeedReindex(name_, marked));
        mark_.Became(marked ? Value("true") : Value(), succeeded, Notes());
    }

    void PauseOrResume() {
        (void)Finish(random_() % 2 == 0 ? StatusMgr::Pause(1000) : StatusMgr::Resume());
    }

    void AppendEvent() {
        const std::string path = directory_ + "/e/" + NextName();
        if (Finish(AddCustomEvent(kEventCode, path, Json::Value())) && !Notes().eventDropped) {
            events_.push_back(path);
            ++counts_.events;
        }
    }

    void Read() {
        std::vector<Folder> folders;
        Status status;
        const bool loaded = IndexMgr::List(folders) && status.Load();
        counts_.reads += 2;
        if (!Finish(loaded)) {
            complaints_.push_back("an unlocked reader failed");
        }
        const auto mine = std::find_if(folders.begin(), folders.end(), [&](const Folder &folder) {
            return folder.path == folder_;
        });
        const Value value = mine == folders.end() ? Value() : Value(mine->name);
        if (loaded && stored_.Possible().count(value) == 0) {
            complaints_.push_back(folder_ + " reads as " + value.value_or("missing"));
        }
    }

    Janitor &janitor_;
    long nextCleaning_ = kFailuresBetweenCleanings;
    std::string share_;
    std::string name_;
    std::string folder_;
    std::string directory_;
    std::mt19937 random_;
    long serial_ = 0;
    Owned stored_;
    Owned mark_;
    std::vector<std::string> events_; // appended with success
    std::vector<std::string> complaints_;
    Counts counts_;
};

// One process; ends it.
[[noreturn]] void RunProcess(int process, const Options &options) {
    Janitor janitor;
    const Clock::time_point end = Clock::now() + std::chrono::seconds(options.seconds);
    std::vector<Actor> actors;
    for (int number = 0; number < options.threads; ++number) {
        actors.emplace_back(janitor, process, number,
                            options.seed + static_cast<std::uint32_t>(process * 100 + number));
    }
    std::vector<std::thread> threads;
    threads.reserve(actors.size());
    for (Actor &actor : actors) {
        threads.emplace_back([&actor, end] { actor.Run(end); });
    }
    for (std::thread &thread : threads) {
        thread.join();
    }
    std::ofstream out(ResultFile(process));
    for (const Actor &actor : actors) {
        actor.Write(out);
    }
    out.close();
    std::exit(out ? 0 : 1);
}

// --- what came of it ----------------------------------------------------------------------------

struct Results {
    std::map<std::string, std::set<std::string>> folders; // possible names by path
    std::map<std::string, std::set<std::string>> marks;
    std::vector<std::string> events;
    std::vector<std::string> complaints;
    Counts counts;
};

void ReadLine(Results &results, const std::string &line) {
    std::istringstream words(line);
    std::string kind;
    words >> kind;
    std::string name;
    if (kind == "folder" || kind == "mark") {
        words >> name;
        auto &possible = (kind == "folder" ? results.folders : results.marks)[name];
        for (std::string value; words >> value;) {
            possible.insert(value);
        }
    } else if (kind == "event") {
        words >> name;
        results.events.push_back(name);
    } else if (kind == "complaint") {
        results.complaints.push_back(line);
    } else {
        Counts counts;
        words >> counts.operations >> counts.succeeded >> counts.lockFailures >> counts.reads >>
            counts.events;
        results.counts.operations += counts.operations;
        results.counts.succeeded += counts.succeeded;
        results.counts.lockFailures += counts.lockFailures;
        results.counts.reads += counts.reads;
        results.counts.events += counts.events;
    }
}

Results ReadResults(int processes) {
    Results results;
    for (int process = 0; process < processes; ++process) {
        for (const std::string &line : LinesOf(ReadText(ResultFile(process)))) {
            ReadLine(results, line);
        }
    }
    return results;
}

void CheckOwned(Tally &tally, const char *kind,
                const std::map<std::string, std::set<std::string>> &all,
                const std::function<std::string(const std::string &)> &valueOf) {
    for (const auto &[name, possible] : all) {
        const std::string value = valueOf(name);
        tally.Count(std::string(kind) + " " + name,
                    possible.count(value) != 0 ? "" : "is " + value + " in the end");
    }
}

// How often each of our events was printed by the peer: "event 3 <queue>: 7 <path> null".
std::map<std::string, int> EventsOfPeer(const std::string &output) {
    const std::string mark = ": " + std::to_string(kEventCode) + " ";
    std::map<std::string, int> met;
    for (const std::string &line : LinesOf(output)) {
        const std::size_t begin = line.find(mark);
        if (line.rfind("event ", 0) == 0 && begin != std::string::npos) {
            const std::size_t path = begin + mark.size();
            ++met[line.substr(path, line.rfind(' ') - path)];
        }
    }
    return met;
}

void Check(Tally &tally, const Results &results, const std::string &peerOutput) {
    const Json::Value folders = ReadJson(kFolderFile);
    const Json::Value marks = ReadJson(kStatusFile)["need_reindex"];
    CheckOwned(tally, "folder", results.folders, [&](const std::string &path) {
        return folders.isMember(path) ? folders[path]["name"].asString() : "-";
    });
    CheckOwned(tally, "mark", results.marks,
               [&](const std::string &name) { return marks.isMember(name) ? "true" : "-"; });
    std::map<std::string, int> met = EventsOfPeer(peerOutput);
    for (const std::string &path : results.events) {
        const int times = met[path];
        tally.Count("event " + path, times == 1 ? "" : "met " + std::to_string(times) + " times");
    }
    for (const std::string &complaint : results.complaints) {
        tally.Count("a thread", complaint);
    }
}

// Each share has a folder that stays: with its last folder a share loses its queue.
void Arrange(int processes) {
    std::map<std::string, std::string> shares;
    Json::Value folders(Json::objectValue);
    for (int process = 0; process < processes; ++process) {
        shares[ShareName(process)] = ShareDirectory(process);
        folders["/" + ShareName(process) + "/keep"]["name"] = "keep";
    }
    PutShares(shares, {"keep"});
    PutFile(kFolderFile, CompactText(folders));
    PutFile(kStatusFile, "{}");
}

bool AreQueuesEmpty(int processes) {
    for (int process = 0; process < processes; ++process) {
        const std::string share = ShareDirectory(process);
        if (Exists(QueueOf(share)) || Exists(TakenOf(share))) {
            return false;
        }
    }
    return true;
}

} // namespace

long Stress(const Options &options) {
    Tally tally("stress");
    Arrange(options.processes);
    const std::string out = "/tmp/peer.out";
    Child peer({PEER_PATH, "--interval", "5"}, out, "/tmp/peer.err");
    if (!Eventually([] { return Exists(kDaemonSocket); })) {
        throw std::runtime_error("the peer does not start: " + ReadText("/tmp/peer.err"));
    }
    std::vector<pid_t> processes;
    for (int process = 0; process < options.processes; ++process) {
        const pid_t pid = ::fork();
        if (pid == 0) {
            RunProcess(process, options);
        }
        processes.push_back(pid);
    }
    for (const pid_t pid : processes) {
        int status = -1;
        (void)::waitpid(pid, &status, 0);
        tally.Count("process", status == 0 ? "" : "ended with " + std::to_string(status));
    }
    // A paused peer leaves its queues.
    tally.Count("resume", StatusMgr::Resume() ? "" : "fails");
    tally.Count("queues", Eventually([&] { return AreQueuesEmpty(options.processes); })
                              ? ""
                              : "are not worked off");
    peer.Signal(SIGTERM);
    tally.Count("peer", peer.Wait() == 0 ? "" : "ended badly");
    const Results results = ReadResults(options.processes);
    Check(tally, results, ReadText(out));
    const Counts &counts = results.counts;
    return tally.SumUp(
        std::to_string(options.processes) + " processes of " + std::to_string(options.threads) +
        " threads, " + std::to_string(options.seconds) + " seconds, " +
        std::to_string(counts.operations) + " operations (" + std::to_string(counts.succeeded) +
        " succeeded, " + std::to_string(counts.lockFailures) + " found a lock busy), " +
        std::to_string(counts.reads) + " files read unlocked, " + std::to_string(counts.events) +
        " events");
}

} // namespace VANO::TORTURE
