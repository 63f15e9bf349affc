// The queue of each share, and the one beside it that the daemon took over.

#include <cerrno>
#include <ctime>

#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "doctor/queue_look.h"
#include "text.h"
#include "time_text.h"

namespace CTL::DOCTOR {

namespace {

// A daemon that keeps up takes a queue over within seconds, and works through it within a day even
// where a whole share is indexed anew.
constexpr std::size_t kMostEvents = 100000;
constexpr long long kLongestWait = 3600;
constexpr long long kLongestWork = 24LL * 3600;

// What the daemon can be expected to have done by now.
bool MayWait(const Machine &machine) {
    const Json::Value &status = machine.statusFile.value;
    const Json::Value pause = status.isObject() ? status.get("resume_time", -1) : -1;
    return pause.isInt64() && IsPaused(pause.asInt64(), std::time(nullptr));
}

std::string EventsOf(const QueueLook &look) {
    return (look.isWhole ? "" : "more than ") + Count(look.events, "event") + ", " +
           Size(look.bytes);
}

Finding &&WithCounts(Finding &&finding, const QueueLook &look) {
    finding.details["bytes"] = Json::UInt64(look.bytes);
    finding.details["events"] = Json::UInt64(look.events);
    finding.details["malformed"] = Json::UInt64(look.malformed);
    finding.details["age"] = Json::Int64(look.age);
    finding.details["whole"] = look.isWhole;
    return std::move(finding);
}

void JudgeContent(Findings &findings, const QueueLook &look, const std::string &path,
                  const KnownShare &share) {
    if (look.malformed > 0) {
        findings.push_back(WithCounts(
            Warning("queue-malformed", path,
                    Shown(path) +
                        " holds lines that are no events: " + std::to_string(look.malformed))
                .Because("They are passed over, and what they meant is lost.")
                .Mend("Index the share's folders again.", share.ReindexCommand()),
            look));
    }
}

void JudgeSize(Findings &findings, const QueueLook &look, const std::string &path) {
    if (static_cast<long long>(look.bytes) > kMostQueueBytes || look.events > kMostEvents) {
        findings.push_back(WithCounts(
            Warning("queue-long", path, Shown(path) + " is long: " + EventsOf(look))
                .Because("The daemon does not keep up (beyond 16 MiB or 100000 events).")
                .Mend("Look whether it runs and what it logs.", "fileindexctl doctor daemon"),
            look));
    }
}

void JudgeAge(Findings &findings, const QueueLook &look, const std::string &path, bool isTaken) {
    if (look.age > (isTaken ? kLongestWork : kLongestWait)) {
        findings.push_back(WithCounts(
            Warning("queue-old", path,
                    Shown(path) + ": the oldest event has waited for " + Duration(look.age))
                .Because(isTaken ? "The daemon took this queue over and does not come to its end "
                                   "(within a day)."
                                 : "The daemon does not take the queue over (within an hour).")
                .Mend("Look whether it runs and what it logs.", "fileindexctl doctor daemon"),
            look));
    }
}

// Whether a queue can be looked into. What keeps it from that is found; a missing one is empty.
bool IsQueue(Findings &findings, const std::string &path) {
    const FileLook look(path);
    if (look.error == ENOENT) {
        return false;
    }
    if (!look.Exists()) {
        findings.push_back(Unreadable("queue-unreadable", path, look.error));
        return false;
    }
    if (!look.IsRegular()) {
        findings.push_back(
            Error("queue-kind", path, Shown(path) + " is " + KindOf(look.info.st_mode))
                .Because("No event can be queued there.")
                .Mend("Move it out of the way.",
                      "mv " + Quoted(path) + " " + Quoted(path + ".odd")));
        return false;
    }
    return true;
}

} // namespace

Findings CheckQueues(const Machine &machine) {
    Findings findings;
    const bool mayWait = MayWait(machine);
    const auto lookAt = [&](const KnownShare &share, const std::string &path, bool isTaken) {
        if (!IsQueue(findings, path)) {
            return;
        }
        const QueueLook look = LookAtQueue(path);
        if (look.error != 0) {
            findings.push_back(Unreadable("queue-unreadable", path, look.error));
            return;
        }
        const std::size_t before = findings.size();
        JudgeContent(findings, look, path, share);
        JudgeSize(findings, look, path);
        if (!mayWait) {
            JudgeAge(findings, look, path, isTaken);
        }
        if (findings.size() == before) {
            findings.push_back(
                WithCounts(Ok("queue-good", path, Shown(path) + ": " + EventsOf(look)), look));
        }
    };
    for (const KnownShare &share : machine.shares) {
        if (!share.directory.empty() && DirectoryError(share.directory) == 0) {
            lookAt(share, share.Queue(), false);
            lookAt(share, share.Queue() + kTakenQueueSuffix, true);
        }
    }
    if (findings.empty()) {
        findings.push_back(Ok("queues-empty", "", "No event waits"));
    }
    return findings;
}

} // namespace CTL::DOCTOR
