#ifndef FILEINDEXCTL_DOCTOR_CHECKS_H
#define FILEINDEXCTL_DOCTOR_CHECKS_H

#include "doctor/evidence.h"
#include <json/value.h>
#include <vector>

#include "doctor/finding.h"

namespace CTL::DOCTOR {

// A check looks at one concern. It changes nothing: it makes no file and takes no lock. It finds
// something in any case, if only that all is well.
struct Check {
    const char *name;
    const char *title;
    Findings (*look)(const Evidence &evidence);
};

// One file each, named as the check.
Findings CheckSettings(const Evidence &evidence);
Findings CheckLocks(const Evidence &evidence);
Findings CheckShares(const Evidence &evidence);
Findings CheckFolders(const Evidence &evidence);
Findings CheckDaemon(const Evidence &evidence);
Findings CheckQueues(const Evidence &evidence);
Findings CheckMonitor(const Evidence &evidence);
Findings CheckSpotlight(const Evidence &evidence);
Findings CheckRoom(const Evidence &evidence);

// What one check has found.
struct Chapter {
    const Check *check;
    Findings findings;
};

using Report = std::vector<Chapter>;

// How many findings of that severity.
[[nodiscard]] std::size_t CountOf(const Report &report, Severity severity);

// To standard output; with `onlyProblems` without the findings that all is well, and nothing at all
// where there are no others. On a terminal the lines are no longer than it is wide.
void PrintReport(const Report &report, bool onlyProblems);

[[nodiscard]] Json::Value ReportAsJson(const Report &report, bool onlyProblems);

} // namespace CTL::DOCTOR

#endif
