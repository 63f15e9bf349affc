#include <algorithm>
#include <csignal>
#include <map>
#include <memory>
#include <unistd.h>

#include "commands/command.h"
#include "state/asked_path.h"
#include "state/observer.h"
#include "terminal/fit.h"
#include "terminal/messages.h"
#include "terminal/output.h"
#include "terminal/terminal.h"
#include "watch/line_output.h"
#include "watch/live_output.h"
#include "watch/signals.h"

namespace CTL {

namespace {

constexpr char kFooter[] =
    R"(On a terminal the display is updated in place until Ctrl-C or q, except while in
the background. Elsewhere a line is written for each change. With --json each
update is one object on one line, even with --json=pretty.

Exit status: 0 when ended by Ctrl-C, q, SIGTERM or --count; 1 failed; 2 usage
error; 3 no such folder.

Examples:
  fileindexctl watch
  fileindexctl watch /photos --interval 10
  fileindexctl watch --count 1 --json)";

constexpr double kShortestInterval = 0.1;
constexpr double kLongestInterval = 3600;
// Counting a long queue is interrupted so often to show how far it is, and to hear signals.
constexpr std::chrono::milliseconds kSlice{100};
// What no signal tells of is noticed after that long.
constexpr std::chrono::seconds kSlumber{1};

struct Options {
    std::vector<std::string> paths;
    double interval = 1;
    unsigned long count = 0; // no end
    JsonMode json = JsonMode::kOff;
};

std::unique_ptr<WatchOutput> OutputFor(const Options &options) {
    if (options.json != JsonMode::kOff) {
        return std::make_unique<JsonOutput>();
    }
    if (IsTerminal(STDOUT_FILENO) && KnowsEscapeCodes()) {
        return std::make_unique<LiveOutput>(StyleOfOutput());
    }
    return std::make_unique<LineOutput>();
}

std::vector<int> SignalsFor(const WatchOutput &output) {
    std::vector<int> numbers = output.Signals();
    numbers.insert(numbers.end(), {SIGINT, SIGTERM, SIGHUP});
    return numbers;
}

class Watch {
  public:
    Watch(Observer &observer, WatchOutput &output)
        : observer_(observer), output_(output), signals_(SignalsFor(output)) {}

    ExitCode Run(const Options &options) {
        const std::chrono::duration<double> interval(options.interval);
        for (unsigned long looks = 1; GoesOn(); ++looks) {
            const auto next = Clock::now() + std::chrono::ceil<Clock::duration>(interval);
            LookOnce();
            if (looks == options.count) {
                break;
            }
            while (GoesOn() && Clock::now() < next) {
                WaitUntil(std::min(next, Clock::now() + kSlumber));
                isWritable_ = isWritable_ && output_.Attend();
            }
        }
        return isWritable_ ? kDone : kFailed;
    }

  private:
    [[nodiscard]] bool GoesOn() const { return isWritable_ && !isEnded_; }

    void LookOnce() {
        bool isCounted = false;
        while (!isCounted && GoesOn()) {
            isCounted = observer_.Look(Clock::now() + kSlice);
            const WatchedState state = See();
            isWritable_ = isCounted ? output_.Show(state) : output_.ShowCounting(state);
            WaitUntil(Clock::now());
        }
    }

    WatchedState See() {
        WatchedState state{observer_.State(), {}};
        const std::chrono::duration<double> time = Clock::now().time_since_epoch();
        for (const ShareState &share : state.service.shares) {
            QueuePace &progress = progress_[share.name];
            if (share.pending) {
                progress.Observe(time.count(), *share.pending);
            }
            state.progress.push_back(progress);
        }
        return state;
    }

    void WaitUntil(Clock::time_point until) {
        const int signal = signals_.WaitUntil(until, output_.Input());
        if (signal == SIGINT || signal == SIGTERM || signal == SIGHUP || output_.ReadsTheEnd()) {
            isEnded_ = true;
        } else if (signal != 0) {
            isWritable_ = isWritable_ && output_.Handle(signal);
        }
    }

    Observer &observer_;
    WatchOutput &output_;
    const Signals signals_;
    std::map<std::string, QueuePace> progress_;
    bool isWritable_ = true;
    bool isEnded_ = false;
};

ExitCode Run(const Options &options) {
    Observer observer(ToSharePaths(options.paths));
    if (!observer.ReadSettings()) {
        return Fail("Cannot read the settings");
    }
    if (!options.paths.empty() && observer.IsIdle()) {
        Say("Nothing is indexed at " + Named(options.paths) + ".");
        return kNotFound;
    }
    const std::unique_ptr<WatchOutput> output = OutputFor(options);
    return Watch(observer, *output).Run(options);
}

} // namespace

Action DeclareWatch(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Share paths or full paths; all folders by default")
        ->required(false)
        ->check(CheckFullPath);
    app.add_option("--interval", options->interval, "Time between updates; 1 by default")
        ->type_name("SECONDS");
    app.add_option("--count", options->count, "End after N updates")
        ->type_name("N")
        ->check(CLI::PositiveNumber);
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    app.callback([options] {
        // Written so that what is no number is refused too.
        if (!(options->interval >= kShortestInterval && options->interval <= kLongestInterval)) {
            throw CLI::ValidationError("--interval takes from 0.1 to 3600 seconds");
        }
    });
    return [options] { return Run(*options); };
}

} // namespace CTL
