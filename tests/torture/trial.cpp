#include "trial.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <exception>
#include <json/reader.h>
#include <map>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>
#include <sys/wait.h>
#include <syslog.h>
#include <unistd.h>

#include "peer.h"
#include "records.h"
#include "support/files.h"

namespace VANO::TORTURE {

// What the process under torture says of itself, in memory shared with this one.
struct Trial::Report {
    bool finished;
    bool threw;
    Result result;
    long requests;
    char what[200];
    char complaint[4000];
};

namespace {

constexpr std::chrono::seconds kLimit{20};

void Complain(std::string &complaints, const std::string &complaint) {
    complaints += (complaints.empty() ? "" : "; ") + complaint;
}

std::string Brief(const std::string &text) {
    return text.size() > 300 ? text.substr(0, 300) + "..." : text;
}

// --- descriptors, locks, records ----------------------------------------------------------------

using Descriptors = std::map<int, std::string>;

Descriptors OpenDescriptors() {
    ::closelog(); // the connection to the system log is nobody's leak
    return TESTS::OpenDescriptors();
}

std::string CheckDescriptors(const Descriptors &before, int lockFailures) {
    std::string complaints;
    for (const auto &[fd, path] : OpenDescriptors()) {
        const auto found = before.find(fd);
        if (found != before.end() && found->second == path) {
            continue;
        }
        const bool isLockFile = path == kFolderLock || path == kStatusLock;
        if (!isLockFile || --lockFailures < 0) {
            Complain(complaints, "descriptor leaked: " + path);
        }
    }
    return complaints;
}

std::string CheckLocks() {
    std::vector<std::string> files{kFolderLock, kStatusLock};
    for (const std::string &share : kShares) {
        files.push_back(QueueOf(share));
    }
    std::string complaints;
    for (const std::string &file : files) {
        if (IsLocked(file)) {
            Complain(complaints, "still locked: " + file);
        }
    }
    return complaints;
}

// --- files --------------------------------------------------------------------------------------

bool EndsWith(const std::string &text, const std::string &end) {
    return text.size() >= end.size() &&
           text.compare(text.size() - end.size(), end.size(), end) == 0;
}

const std::string *Find(const Snapshot &snapshot, const std::string &path) {
    const auto found = snapshot.find(path);
    return found == snapshot.end() ? nullptr : &found->second;
}

bool IsQueue(const std::string &path) {
    return EndsWith(path, kQueueName);
}

// What is removed by a program, whose failure is none of the operation's.
bool IsIndexData(const std::string &path) {
    return path.find("/@eaDir/") != std::string::npos;
}

// The status without the marks that a failed append sets.
std::string WithoutMarks(const std::string &text) {
    Json::Value status;
    Json::CharReaderBuilder builder;
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    if (!reader->parse(text.data(), text.data() + text.size(), &status, nullptr) ||
        !status.isObject()) {
        return "not a JSON object: " + text;
    }
    status.removeMember("need_reindex");
    return TESTS::CompactText(status);
}

// The text of a file that must be one of two; no text stands for no file.
struct FileStates {
    const std::string *now;
    const std::string *before;
    const std::string *after;
};

bool IsSame(const std::string *a, const std::string *b) {
    return a == nullptr || b == nullptr ? a == b : *a == *b;
}

bool IsSameBut(const std::string *a, const std::string *b) {
    const std::string empty = "{}";
    return WithoutMarks(a == nullptr ? empty : *a) == WithoutMarks(b == nullptr ? empty : *b);
}

class StateCheck {
  public:
    // `marks`: the operation may have marked a share. `strays`: files may be left over.
    StateCheck(const Snapshot &before, const Snapshot &after, bool marks, bool strays)
        : before_(before), after_(after), marks_(marks), strays_(strays) {}

    std::string EitherState(const Snapshot &now, bool queues = true) const {
        return Check(now, false, queues);
    }
    std::string NewState(const Snapshot &now, bool queues) const {
        return Check(now, true, queues);
    }

  private:
    std::string Check(const Snapshot &now, bool mustBeNew, bool queues) const {
        std::set<std::string> paths;
        for (const Snapshot *snapshot : {&now, &before_, &after_}) {
            for (const auto &entry : *snapshot) {
                paths.insert(entry.first);
            }
        }
        std::string complaints;
        for (const std::string &path : paths) {
            const FileStates states{Find(now, path), Find(before_, path), Find(after_, path)};
            const std::string complaint = IsQueue(path) ? CheckQueue(states, mustBeNew && queues)
                                                        : CheckFile(path, states, mustBeNew);
            if (!complaint.empty()) {
                Complain(complaints, path + " " + complaint);
            }
        }
        return complaints;
    }

    std::string CheckFile(const std::string &path, const FileStates &states, bool mustBeNew) const {
        if (states.before == nullptr && states.after == nullptr && path != kStatusFile) {
            return strays_ ? "" : "is left over";
        }
        const bool marked = marks_ && path == kStatusFile;
        const auto same = marked ? IsSameBut : IsSame;
        const bool mayBeOld = !mustBeNew || (states.after == nullptr && IsIndexData(path));
        if (same(states.now, states.after) || (mayBeOld && same(states.now, states.before))) {
            return "";
        }
        return states.now == nullptr ? "is gone" : "holds " + Brief(*states.now);
    }

    // What waited must still be there, unless it was to go.
    static std::string CheckQueue(const FileStates &states, bool mustBeNew) {
        if (states.after == nullptr) {
            return ""; // what cannot be removed stays
        }
        if (mustBeNew) {
            return IsSame(states.now, states.after) ? "" : "lacks an event";
        }
        if (states.before == nullptr) {
            return "";
        }
        if (states.now == nullptr) {
            return "is gone";
        }
        const bool isKept = states.now->compare(0, states.before->size(), *states.before) == 0;
        return isKept ? "" : "lost an event";
    }

    const Snapshot &before_;
    const Snapshot &after_;
    bool marks_;
    bool strays_;
};

// --- the process under torture ------------------------------------------------------------------

// The operation again, with nothing in its way.
std::string FollowUp(const Operation &operation, const StateCheck &check) {
    try {
        if (operation.run() != Result::kDone) {
            return "the next operation fails";
        }
    } catch (const std::exception &exception) {
        return std::string("the next operation throws ") + exception.what();
    }
    const std::string complaint = check.NewState(Testbed::Look(), false);
    return complaint.empty() ? "" : "after the next operation: " + complaint;
}

std::string CheckRecords() {
    return OpenRecords() == 0 ? "" : "a share record leaked";
}

std::string Join(std::initializer_list<std::string> complaints) {
    std::string all;
    for (const std::string &complaint : complaints) {
        if (!complaint.empty()) {
            all += (all.empty() ? "" : "; ") + complaint;
        }
    }
    return all;
}

// Of an operation that was to be survived.
std::string CheckEnding(const Ending &ending, bool finished, const char *complaint) {
    if (ending.hung) {
        return "hung";
    }
    if (WIFSIGNALED(ending.status)) {
        return std::string("crashed: ") + ::strsignal(WTERMSIG(ending.status));
    }
    return finished ? complaint : "ended early";
}

} // namespace

void Trial::RunAndJudge(Report &report, const Disturbance &disturbance,
                        const std::function<void()> &begin,
                        const std::function<void()> &end) const {
    const Descriptors before = OpenDescriptors();
    begin();
    try {
        report.result = operation_.run();
    } catch (const std::exception &exception) {
        report.threw = true;
        std::snprintf(report.what, sizeof(report.what), "%s", exception.what());
    }
    end();
    const std::string descriptors = CheckDescriptors(before, disturbance.lockFailures);
    const std::string complaint =
        Join({descriptors, CheckRecords(), CheckLocks(), Judge(report, disturbance)});
    std::snprintf(report.complaint, sizeof(report.complaint), "%s", complaint.c_str());
    report.finished = true;
}

std::string Trial::Judge(const Report &report, const Disturbance &disturbance) const {
    const bool done = !report.threw && report.result == Result::kDone;
    const StateCheck check(before_, after_, operation_.queuesEvents && !done, disturbance.removal);
    const Snapshot now = Testbed::Look();
    Snapshot judged = now;
    if (done && operation_.mayLeaveStatus &&
        IsSame(Find(now, kStatusFile), Find(before_, kStatusFile))) {
        judged[kStatusFile] = after_.at(kStatusFile);
    }
    const bool queues = !disturbance.queue && !operation_.mayLackEvents;
    const std::string state = done ? check.NewState(judged, queues) : check.EitherState(judged);
    std::string answer;
    if (report.threw && !(disturbance.memory && operation_.mayThrow)) {
        answer = std::string("threw ") + report.what;
    } else if (!report.threw && report.result == Result::kWrong) {
        answer = "answered wrongly";
    }
    return Join({answer, state, FollowUp(operation_, check)});
}

Trial::Trial(const Operation &operation) : operation_(operation) {
    Testbed::Reset(operation.start);
    before_ = Testbed::Look();
    const auto body = [&] {
        try {
            ::_exit(operation_.run() == Result::kDone ? 0 : 1);
        } catch (const std::exception &) {
            ::_exit(2);
        }
    };
    const Ending ending = RunForked(body, kLimit);
    after_ = Testbed::Look();
    if (ending.hung || ending.status != 0) {
        throw std::runtime_error(std::string(operation.name) + " fails undisturbed");
    }
}

std::string Trial::Run(const Hooks &hooks, const Shared<Disturbance> &disturbance) const {
    Testbed::Reset(operation_.start);
    const Shared<Report> report;
    const auto body = [&] { RunAndJudge(*report, *disturbance, WatchBegins, WatchEnds); };
    const Ending ending = RunTraced(body, hooks, kLimit);
    return CheckEnding(ending, report->finished, report->complaint);
}

std::string Trial::Run(const MemoryFault &fault, long &requests) const {
    Testbed::Reset(operation_.start);
    const Shared<Report> report;
    Disturbance disturbance;
    disturbance.memory = true;
    const auto body = [&] {
        RunAndJudge(
            *report, disturbance, [&] { ArmMemoryFault(fault); },
            [&] { report->requests = DisarmMemoryFault(); });
    };
    const Ending ending = RunForked(body, kLimit);
    requests = report->requests;
    return CheckEnding(ending, report->finished, report->complaint);
}

std::string Trial::RunKilled(const Hooks &hooks, const std::vector<QueuedEvent> &appended) const {
    Testbed::Reset(operation_.start);
    const auto killed = [&] {
        WatchBegins();
        (void)operation_.run();
        WatchEnds();
    };
    if (RunTraced(killed, hooks, kLimit).hung) {
        return "hung";
    }
    // A process that is killed cannot clear up: its temporary file may stay.
    const StateCheck check(before_, after_, operation_.queuesEvents, true);
    const Shared<Report> report;
    const auto next = [&] {
        const std::string state = Join({CheckLocks(), check.EitherState(Testbed::Look())});
        const std::string followUp = FollowUp(operation_, check);
        const std::string complaint = Join({state, followUp, CheckPeer(ExpectedOfPeer(appended))});
        std::snprintf(report->complaint, sizeof(report->complaint), "%s", complaint.c_str());
        report->finished = true;
    };
    const Ending ending = RunForked(next, kLimit);
    return CheckEnding(ending, report->finished, report->complaint);
}

// What waited before and what was appended, but for the queues that the operation removes.
std::vector<QueuedEvent> Trial::ExpectedOfPeer(const std::vector<QueuedEvent> &appended) const {
    std::vector<QueuedEvent> expected = appended;
    for (const std::string &share : kShares) {
        for (const std::string &event : EventsAtStart(share)) {
            expected.push_back({QueueOf(share), event});
        }
    }
    const auto isRemoved = [&](const QueuedEvent &event) {
        return Find(after_, event.queue) == nullptr;
    };
    expected.erase(std::remove_if(expected.begin(), expected.end(), isRemoved), expected.end());
    return expected;
}

} // namespace VANO::TORTURE
