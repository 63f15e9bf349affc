#include <algorithm>
#include <fcntl.h>
#include <unistd.h>

#include "calls.h"
#include "parts.h"
#include "peer.h"
#include "queue_worker.h"
#include "support/files.h"
#include "tally.h"
#include "tracer.h"

namespace VANO::TORTURE {

namespace {

constexpr char kHandled[] = "/run/torture.handled";
constexpr std::chrono::seconds kLimit{20};
constexpr int kEvents = 3;

const std::string &Queue() {
    static const std::string queue = QueueOf(kShares.front());
    return queue;
}

// Events 0 to 2 wait; those that a dead peer had taken over come first.
void Arrange(int takenOver) {
    std::string taken;
    std::string waiting;
    for (int number = 0; number < kEvents; ++number) {
        (number < takenOver ? taken : waiting) += EventLine("/" + std::to_string(number));
    }
    PutFile(kHandled, "");
    RemoveTree(Queue() + ".tmp");
    PutFile(Queue(), waiting);
    if (takenOver > 0) {
        PutFile(Queue() + ".tmp", taken);
    }
}

// A peer that keeps a record of what it has handled; an event is done when its line is there.
void WorkOff() {
    const int record = ::open(kHandled, O_WRONLY | O_APPEND | O_CLOEXEC);
    const peer::QueueHandlers handlers{
        [&](const std::string &, const peer::Event &event) {
            const std::string line = event.path + "\n";
            return ::write(record, line.data(), line.size()) == static_cast<ssize_t>(line.size());
        },
        [](const std::string &, const std::string &) { return false; }};
    std::string reason;
    while (peer::WorkOffQueue(Queue(), handlers, reason) == peer::QueueResult::kDone) {
    }
    (void)::close(record);
}

void WatchedWorkOff() {
    WatchBegins();
    WorkOff();
    WatchEnds();
}

std::string CheckHandled() {
    if (IsLocked(Queue()) || Exists(Queue()) || Exists(Queue() + ".tmp")) {
        return "the queue is not worked off";
    }
    const std::string handled = ReadText(kHandled);
    for (int number = 0; number < kEvents; ++number) {
        if (handled.find("/" + std::to_string(number) + "\n") == std::string::npos) {
            return "event " + std::to_string(number) + " is lost";
        }
    }
    return "";
}

std::string KillPeer(int takenOver, int index) {
    Arrange(takenOver);
    Hooks hooks;
    hooks.onEntry = [&](const SystemCall &call) {
        return call.index == index ? Decision{Action::kKill, 0, true} : Decision{};
    };
    (void)RunTraced(WatchedWorkOff, hooks, kLimit);
    (void)RunForked(WorkOff, kLimit);
    return CheckHandled();
}

int CountCalls(int takenOver) {
    Arrange(takenOver);
    int calls = 0;
    Hooks hooks;
    hooks.onEntry = [&](const SystemCall &) {
        ++calls;
        return Decision{};
    };
    (void)RunTraced(WatchedWorkOff, hooks, kLimit);
    return calls;
}

} // namespace

long SweepPeerKills(const Options &) {
    Tally tally("peer-kills");
    MakeDirs(kShares.front() + "/@eaDir");
    for (const int takenOver : {0, 1, kEvents}) {
        const int calls = CountCalls(takenOver);
        for (int index = 0; index < calls; ++index) {
            tally.Count(std::to_string(takenOver) + " taken over, killed at call " +
                            std::to_string(index),
                        KillPeer(takenOver, index));
        }
    }
    return tally.SumUp("3 queues");
}

} // namespace VANO::TORTURE
