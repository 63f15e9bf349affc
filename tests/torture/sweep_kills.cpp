#include <random>
#include <sys/syscall.h>

#include "calls.h"
#include "parts.h"
#include "tally.h"
#include "trial.h"
#include "watched_run.h"

namespace VANO::TORTURE {

namespace {

constexpr unsigned kShortShare = 8;

Decision KillAt(const SystemCall &call, const SystemCall &wanted) {
    return IsSameCall(call, wanted) ? Decision{Action::kKill, 0, true} : Decision{};
}

// The caller itself dies.
std::string KillCaller(const Trial &trial, const SystemCall &wanted) {
    std::vector<QueuedEvent> appended;
    Hooks hooks;
    hooks.onEntry = [&](const SystemCall &call) { return KillAt(call, wanted); };
    hooks.onExit = [&](const SystemCall &call, long result) {
        const std::string path = IsOneOf(call, {SYS_write}) ? SubjectOf(call) : "";
        if (path.find(kQueueName) != std::string::npos && result > 1 &&
            static_cast<std::uint64_t>(result) == call.arguments[2]) {
            const auto size = static_cast<std::size_t>(result);
            appended.push_back({path, ReadBytes(call.pid, call.arguments[1], size - 1)});
        }
    };
    return trial.RunKilled(hooks, appended);
}

// A process dies that was to start a program for it.
std::string KillHelper(const Trial &trial, const SystemCall &wanted) {
    const Shared<Disturbance> none;
    Hooks hooks;
    hooks.onEntry = [&](const SystemCall &call) { return KillAt(call, wanted); };
    return trial.Run(hooks, none);
}

} // namespace

long SweepKills(const Options &options) {
    Tally tally("kills");
    std::mt19937 random(options.seed);
    const int operations = ForEachOperation(options, true, [&](const Operation &operation) {
        const Trial trial(operation);
        for (const SystemCall &call : CallsOf(trial)) {
            if (options.isShort && random() % kShortShare != 0) {
                continue;
            }
            tally.Count(std::string(operation.name) + ", process " + std::to_string(call.process) +
                            ", killed at call " + std::to_string(call.index) + " " + NameOf(call),
                        call.process == 0 ? KillCaller(trial, call) : KillHelper(trial, call));
        }
        if (options.verbose) {
            std::printf("  %s\n", operation.name);
        }
    });
    return tally.SumUp(std::to_string(operations) + " operations");
}

} // namespace VANO::TORTURE
