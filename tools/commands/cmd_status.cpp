#include <iostream>
#include <memory>
#include <unistd.h>

#include "commands/command.h"
#include "state/asked_path.h"
#include "state/observer.h"
#include "terminal/messages.h"
#include "terminal/output.h"
#include "terminal/terminal.h"
#include "watch/service_text.h"

namespace CTL {

namespace {

constexpr char kFooter[] =
    R"(Shows the folders at, below or above each PATH, or all folders without PATH.
PENDING counts the queued events that the daemon has not handled yet. The daemon
counts as running if it listens for commands; fileindexctl doctor also checks
whether it answers.

Exit status: 0 running; 3 paused or not running; 4 unknown, or no such folder;
2 usage error.

Examples:
  fileindexctl status
  fileindexctl status /photos --json
  fileindexctl status >/dev/null || echo "not indexing")";

// When somebody who waits at a terminal wants to know why.
constexpr std::chrono::milliseconds kPatience{500};

struct Options {
    std::vector<std::string> paths;
    JsonMode json = JsonMode::kOff;
};

void PrintText(const ServiceState &state) {
    for (const HeadLine &line : HeadOf(state)) {
        std::cout << line.label << Coloured(line.text, line.colour, MayUseColour()) << '\n';
    }
    if (!state.folders.empty()) {
        std::cout << '\n';
        const std::size_t width = LineWidth(STDOUT_FILENO);
        for (const std::string &line : FoldersOf(state, width).Lines(width, StyleOfOutput())) {
            std::cout << line << '\n';
        }
    }
}

// By the convention of init scripts.
ExitCode ExitCodeOf(const ServiceState &state) {
    if (state.daemon == DaemonState::kUnknown || !state.resumeTime) {
        return kUnknown;
    }
    return state.daemon == DaemonState::kStopped || state.IsPaused() ? kPaused : kDone;
}

ExitCode Run(const Options &options) {
    Observer observer(ToSharePaths(options.paths));
    if (!observer.ReadSettings()) {
        (void)Fail("Cannot read the settings");
        return kUnknown;
    }
    if (!observer.Look(Clock::now() + kPatience)) {
        if (IsTerminal(STDOUT_FILENO)) {
            Say("Counting pending events; the queues are long.");
        }
        (void)observer.Look(Clock::time_point::max());
    }
    const ServiceState state = observer.State();
    if (options.json != JsonMode::kOff) {
        PrintJson(JsonOf(state), options.json);
    } else {
        PrintText(state);
    }
    if (!state.folders.empty()) {
        return ExitCodeOf(state);
    }
    if (options.paths.empty()) {
        Say("No folder is indexed.");
        return ExitCodeOf(state);
    }
    Say("Nothing is indexed at " + Named(options.paths) + ".");
    return kUnknown;
}

} // namespace

Action DeclareStatus(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Share paths or full paths")
        ->required(false)
        ->check(CheckFullPath);
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
