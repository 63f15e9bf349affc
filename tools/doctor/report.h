#ifndef FILEINDEXCTL_DOCTOR_REPORT_H
#define FILEINDEXCTL_DOCTOR_REPORT_H

#include <json/value.h>
#include <vector>

#include "doctor/checks.h"

namespace CTL::DOCTOR {

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
