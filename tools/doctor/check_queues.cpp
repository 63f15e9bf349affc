// The queue of each share, and the one beside it that the daemon took over.

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <string_view>
#include <sys/stat.h>

#include "core/event.h"
#include "core/paths.h"
#include "core/progress_words.h"
#include "core/share_files.h"
#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "state/queue_file.h"
#include "terminal/text.h"
#include "terminal/times.h"

namespace CTL::DOCTOR {

namespace {

// A daemon that keeps up takes a queue over within seconds, and works through it within a day even
// where a whole share is indexed anew.
constexpr std::size_t kMostEvents = 100000;
constexpr long long kMostQueueBytes = 16LL * 1024 * 1024;

// What one queue file holds.
struct QueueLook {
    int error = 0; // the errno when it could not be read
    unsigned long long bytes = 0;
    long long age = 0; // seconds since its oldest event, as far as the file system tells
    std::size_t events = 0;
    std::size_t malformed = 0; // lines that are no events
    bool isWhole = true;       // false when no more than kMostQueueBytes were read
};

// A line that is being written can be taken for a malformed one.
QueueLook LookInto(const QueueFile &queue) {
    QueueLook look;
    look.bytes = static_cast<unsigned long long>(queue.Size());
    look.age = queue.Age();
    look.isWhole = queue.Size() <= kMostQueueBytes;
    const auto wanted = std::min<long long>(queue.Size(), kMostQueueBytes);
    const std::string text = queue.ReadAt(0, static_cast<std::size_t>(wanted));
    look.error = errno;
    VANO::FILEINDEX::EventParser parser;
    VANO::FILEINDEX::QueueEvent event{};
    for (std::string_view rest = text; !rest.empty();) {
        const std::size_t end = rest.find('\n');
        if (end == std::string_view::npos && !look.isWhole) {
            break;
        }
        ++(parser.Parse(event, rest.substr(0, end)) ? look.events : look.malformed);
        rest.remove_prefix(end == std::string_view::npos ? rest.size() : end + 1);
    }
    return look;
}

struct Patience {
    long long seconds;
    const char *atAnEnd; // why it matters
};

constexpr Patience kBeforeItIsTaken = {3600,
                                       "The daemon does not take the queue over (within an hour)."};
constexpr Patience kOnceItIsTaken = {
    24LL * 3600, "The daemon took this queue over and has not finished it (within a day)."};

// What the daemon can be expected to have done by now.
bool MayWait(const Evidence &evidence) {
    const Json::Value &status = evidence.statusFile.value;
    const Json::Value pause = status.isObject() ? status.get("resume_time", -1) : -1;
    return pause.isInt64() && VANO::FILEINDEX::IsPaused(pause.asInt64(), std::time(nullptr));
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
                        " has lines that are not events: " + std::to_string(look.malformed))
                .Because("They are skipped, and what they said is lost.")
                .Fix("Reindex the share's folders.", ReindexCommand(share)),
            look));
    }
}

void JudgeSize(Findings &findings, const QueueLook &look, const std::string &path) {
    if (static_cast<long long>(look.bytes) > kMostQueueBytes || look.events > kMostEvents) {
        findings.push_back(WithCounts(
            Warning("queue-long", path, Shown(path) + " is long: " + EventsOf(look))
                .Because("The daemon does not keep up (beyond 16 MiB or 100000 events).")
                .Fix("Check whether it runs and what it logs.", "fileindexctl doctor daemon"),
            look));
    }
}

void JudgeAge(Findings &findings, const QueueLook &look, const std::string &path,
              const Patience &patience) {
    if (look.age > patience.seconds) {
        findings.push_back(WithCounts(
            Warning("queue-old", path,
                    Shown(path) + ": the oldest event has waited for " + DurationText(look.age))
                .Because(patience.atAnEnd)
                .Fix("Check whether it runs and what it logs.", "fileindexctl doctor daemon"),
            look));
    }
}

Finding WrongKind(const std::string &path, mode_t mode) {
    return Error("queue-kind", path, Shown(path) + " is " + KindOf(mode))
        .Because("No event can be queued there.")
        .Fix("Move it out of the way.", "mv " + Quoted(path) + " " + Quoted(path + ".odd"));
}

// Whether the queues can be looked for in the directory that should hold them.
bool MayHoldQueues(Findings &findings, const std::string &directory) {
    const FileLook look(directory);
    const bool isInTheWay = look.Exists() && !S_ISDIR(look.info.st_mode);
    if (isInTheWay) {
        findings.push_back(WrongKind(directory, look.info.st_mode));
    }
    return !isInTheWay;
}

// Why a queue could not be opened.
Finding Obstacle(const std::string &path, int error) {
    struct stat info {};
    const bool isKnown = VANO::FILEINDEX::ShareFile(path).Stat(info);
    return isKnown && !S_ISREG(info.st_mode) ? WrongKind(path, info.st_mode)
                                             : Unreadable("queue-unreadable", path, error);
}

// A missing queue is empty: there is nothing to be said of it.
void LookAtQueue(Findings &findings, const Evidence &evidence, const KnownShare &share,
                 const std::string &path, const Patience &patience) {
    const QueueFile queue(path);
    const QueueLook look = queue.IsOpen() ? LookInto(queue) : QueueLook{queue.Error()};
    if (look.error != 0) {
        findings.push_back(Obstacle(path, look.error));
        return;
    }
    if (!queue.IsOpen()) {
        return;
    }
    const std::size_t before = findings.size();
    JudgeContent(findings, look, path, share);
    JudgeSize(findings, look, path);
    if (!MayWait(evidence)) {
        JudgeAge(findings, look, path, patience);
    }
    if (findings.size() == before) {
        findings.push_back(
            WithCounts(Ok("queue-good", path, Shown(path) + ": " + EventsOf(look)), look));
    }
}

} // namespace

Findings CheckQueues(const Evidence &evidence) {
    Findings findings;
    for (const KnownShare &share : evidence.shares) {
        const std::string queue = VANO::FILEINDEX::QueueIn(share.directory);
        if (!share.directory.empty() && DirectoryError(share.directory) == 0 &&
            MayHoldQueues(findings, queue.substr(0, queue.rfind('/')))) {
            LookAtQueue(findings, evidence, share, queue, kBeforeItIsTaken);
            LookAtQueue(findings, evidence, share, queue + VANO::FILEINDEX::kTakenQueueSuffix,
                        kOnceItIsTaken);
        }
    }
    if (findings.empty()) {
        findings.push_back(Ok("queues-empty", "", "No event waits"));
    }
    return findings;
}

} // namespace CTL::DOCTOR
