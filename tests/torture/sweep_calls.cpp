#include <algorithm>
#include <cerrno>
#include <random>
#include <sys/syscall.h>

#include "calls.h"
#include "parts.h"
#include "tally.h"
#include "trial.h"
#include "watched_run.h"

namespace VANO::TORTURE {

namespace {

constexpr int kAttempts = 100;
constexpr unsigned kShortShare = 4; // a short form takes one call of so many

struct CallCase {
    SystemCall call;
    CallFault fault;
    bool everAfter = false;

    std::string Text(const std::string &operation) const {
        return operation + ", process " + std::to_string(call.process) + ", call " +
               std::to_string(call.index) + " " + NameOf(call) + ", " + NameOf(fault) +
               (everAfter ? ", ever after" : ", once");
    }
};

// Makes the calls of one case fail, and notes what that means for the judgement.
class Injector {
  public:
    Injector(const CallCase &now, Disturbance &disturbance)
        : case_(now), disturbance_(disturbance) {}

    [[nodiscard]] bool WasReached() const { return reached_; }

    Decision OnEntry(const SystemCall &call) {
        const bool isTheOne = IsSameCall(call, case_.call);
        reached_ = reached_ || isTheOne;
        if (!(isTheOne || (reached_ && case_.everAfter && IsPlausible(call)))) {
            return {};
        }
        Note(call);
        return {case_.fault.action == Action::kShorten ? Action::kShorten : ActionFor(call),
                case_.fault.error, !case_.everAfter};
    }

  private:
    bool IsPlausible(const SystemCall &call) {
        const auto faults = FaultsOf(call);
        const bool plausible =
            std::any_of(faults.begin(), faults.end(), [&](const CallFault &fault) {
                return fault.error == case_.fault.error &&
                       (fault.action == Action::kShorten) ==
                           (case_.fault.action == Action::kShorten);
            });
        // Signals and busy locks without end are no failure but a stop: every second call is met.
        const bool passes = case_.fault.error == EINTR && (++interrupted_ % 2) == 0;
        return plausible && !passes;
    }

    static Action ActionFor(const SystemCall &call) { return FaultsOf(call).front().action; }

    void Note(const SystemCall &call) {
        if (IsOneOf(call, {SYS_brk, SYS_mmap, SYS_mremap})) {
            disturbance_.memory = true;
        } else if (IsOneOf(call, {SYS_unlink, SYS_unlinkat})) {
            disturbance_.removal = true;
        } else if (IsOneOf(call, {SYS_flock, SYS_write})) {
            const std::string path = SubjectOf(call);
            const bool isLockFile = path == kFolderLock || path == kStatusLock;
            disturbance_.queue = disturbance_.queue || path.find(kQueueName) != std::string::npos;
            disturbance_.lockFailures += isLockFile ? 1 : 0;
        }
    }

    const CallCase &case_;
    Disturbance &disturbance_;
    bool reached_ = false;
    int interrupted_ = 0;
};

// Again when the call is not met: one that makes a random name need not be made every time.
std::string Try(const Trial &trial, const CallCase &now) {
    for (int attempt = 0; attempt < kAttempts; ++attempt) {
        const Shared<Disturbance> disturbance;
        Injector injector(now, *disturbance);
        Hooks hooks;
        hooks.onEntry = [&](const SystemCall &call) { return injector.OnEntry(call); };
        const std::string complaint = trial.Run(hooks, disturbance);
        if (!complaint.empty() || injector.WasReached()) {
            return complaint;
        }
    }
    return "the call was never reached";
}

// All that can happen to the calls, or a sample of it.
std::vector<CallCase> CasesOf(const std::vector<SystemCall> &calls, const Options &options,
                              std::mt19937 &random) {
    std::vector<CallCase> cases;
    for (const SystemCall &call : calls) {
        const std::vector<CallFault> faults = FaultsOf(call);
        if (options.isShort && !faults.empty() && random() % kShortShare == 0) {
            cases.push_back({call, faults[random() % faults.size()], random() % 2 == 0});
        }
        for (std::size_t i = 0; i < faults.size() && !options.isShort; ++i) {
            cases.push_back({call, faults[i], false});
            cases.push_back({call, faults[i], true});
        }
    }
    return cases;
}

} // namespace

long SweepCalls(const Options &options) {
    Tally tally("calls");
    std::mt19937 random(options.seed);
    long calls = 0;
    const int operations = ForEachOperation(options, false, [&](const Operation &operation) {
        const Trial trial(operation);
        const long before = tally.Cases();
        const std::vector<SystemCall> met = CallsOf(trial);
        for (const CallCase &now : CasesOf(met, options, random)) {
            tally.Count(now.Text(operation.name), Try(trial, now));
        }
        calls += static_cast<long>(met.size());
        if (options.verbose) {
            std::printf("  %s: %zu calls, %ld cases\n", operation.name, met.size(),
                        tally.Cases() - before);
        }
    });
    return tally.SumUp(std::to_string(operations) + " operations, " + std::to_string(calls) +
                       " system calls");
}

} // namespace VANO::TORTURE
