#include <algorithm>
#include <memory>

#include "commands/command.h"
#include "doctor/checks.h"
#include "terminal/output.h"

namespace CTL {

namespace {

using namespace DOCTOR;

constexpr char kFooter[] =
    R"(Checks what usually goes wrong and says how to fix it. Changes nothing.

The checks are settings, locks, shares, folders, daemon, queues, monitor,
spotlight and room; without CHECK all are run. What only root can check is
reported as unknown.

A queue is long above 16 MiB or 100000 events, and old if its first event has
waited for an hour, or for a day after the daemon took the queue over. A lock is
reported if it is held for a second. A share is nearly full if less than 5 % of
it is free (more than 10 GiB is always enough, less than 100 MiB never).

Exit status: 0 no error, perhaps warnings; 1 errors; 2 usage error.

Examples:
  fileindexctl doctor
  fileindexctl doctor --quiet
  fileindexctl doctor locks daemon --json=pretty)";

const std::vector<Check> kChecks = {
    {"settings", "Settings", CheckSettings},
    {"locks", "Locks", CheckLocks},
    {"shares", "Shares", CheckShares},
    {"folders", "Folders", CheckFolders},
    {"daemon", "Daemon", CheckDaemon},
    {"queues", "Queues", CheckQueues},
    {"monitor", "Change monitor", CheckMonitor},
    {"spotlight", "Spotlight", CheckSpotlight},
    {"room", "Room", CheckRoom},
};

struct Options {
    std::vector<std::string> checks;
    bool isQuiet = false;
    JsonMode json = JsonMode::kOff;
};

bool IsWanted(const Check &check, const Options &options) {
    return options.checks.empty() || std::find(options.checks.begin(), options.checks.end(),
                                               check.name) != options.checks.end();
}

ExitCode Run(const Options &options) {
    const Evidence evidence = GatherEvidence();
    Report report;
    for (const Check &check : kChecks) {
        if (IsWanted(check, options)) {
            report.push_back({&check, check.look(evidence)});
        }
    }
    if (options.json == JsonMode::kOff) {
        PrintReport(report, options.isQuiet);
    } else {
        PrintJson(ReportAsJson(report, options.isQuiet), options.json);
    }
    return CountOf(report, Severity::kError) == 0 ? kDone : kFailed;
}

std::vector<std::string> CheckNames() {
    std::vector<std::string> names;
    names.reserve(kChecks.size());
    for (const Check &check : kChecks) {
        names.emplace_back(check.name);
    }
    return names;
}

} // namespace

Action DeclareDoctor(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    app.add_option("CHECK", options->checks, "Run only these checks")
        ->check(CLI::IsMember(CheckNames()).description(""));
    app.add_flag("--quiet,-q", options->isQuiet, "Show problems only");
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
