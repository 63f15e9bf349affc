#include "doctor/checks.h"

#include <algorithm>
#include <iostream>
#include <unistd.h>

#include "terminal/terminal.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

constexpr std::size_t kIndent = 11; // "  warning  "
constexpr std::size_t kCommandIndent = kIndent + 2;

struct Mark {
    const char *word;
    Colour colour;
};

Mark MarkOf(Severity severity) {
    switch (severity) {
    case Severity::kOk:
        return {"ok", Colour::kGood};
    case Severity::kUnknown:
        return {"unknown", Colour::kPlain};
    case Severity::kWarning:
        return {"warning", Colour::kBold};
    case Severity::kError:
        break;
    }
    return {"error", Colour::kBad};
}

void PrintParagraph(const std::string &text) {
    if (!text.empty()) {
        std::cout << Wrapped(std::string(kIndent, ' ') + text, LineWidth(STDOUT_FILENO), kIndent)
                  << '\n';
    }
}

void PrintFinding(const Finding &finding) {
    const Mark mark = MarkOf(finding.severity);
    const std::string word = Padded(mark.word, kIndent - 4);
    const std::string text =
        Wrapped("  " + word + "  " + finding.what, LineWidth(STDOUT_FILENO), kIndent);
    std::cout << "  " << Coloured(word, mark.colour, MayUseColour()) << text.substr(2 + word.size())
              << '\n';
    PrintParagraph(finding.why);
    PrintParagraph(finding.fix);
    if (!finding.command.empty()) {
        std::cout << std::string(kCommandIndent, ' ')
                  << Coloured(finding.command, Colour::kBold, MayUseColour()) << '\n';
    }
}

bool IsShown(const Finding &finding, bool onlyProblems) {
    return !onlyProblems || finding.severity != Severity::kOk;
}

bool IsShown(const Chapter &chapter, bool onlyProblems) {
    return std::any_of(chapter.findings.begin(), chapter.findings.end(),
                       [&](const Finding &finding) { return IsShown(finding, onlyProblems); });
}

// "2 errors, 1 warning"; empty when all is well.
std::string SumOf(const Report &report) {
    std::string sum;
    const auto add = [&sum](std::size_t count, const std::string &text) {
        if (count > 0) {
            sum += (sum.empty() ? "" : ", ") + text;
        }
    };
    const std::size_t errors = CountOf(report, Severity::kError);
    const std::size_t warnings = CountOf(report, Severity::kWarning);
    const std::size_t unknown = CountOf(report, Severity::kUnknown);
    add(errors, Count(errors, "error"));
    add(warnings, Count(warnings, "warning"));
    add(unknown, std::to_string(unknown) + " unknown");
    return sum;
}

const char *WorstOf(const Report &report) {
    for (const Severity severity : {Severity::kError, Severity::kWarning, Severity::kUnknown}) {
        if (CountOf(report, severity) > 0) {
            return MarkOf(severity).word;
        }
    }
    return MarkOf(Severity::kOk).word;
}

Json::Value AsJson(const Finding &finding, const Check &check) {
    Json::Value object = finding.details;
    object["check"] = check.name;
    object["severity"] = MarkOf(finding.severity).word;
    object["code"] = finding.code;
    object["subject"] = finding.subject;
    object["what"] = finding.what;
    object["why"] = finding.why;
    object["fix"] = finding.fix;
    object["command"] = finding.command;
    return object;
}

} // namespace

std::size_t CountOf(const Report &report, Severity severity) {
    std::size_t count = 0;
    for (const Chapter &chapter : report) {
        count += static_cast<std::size_t>(
            std::count_if(chapter.findings.begin(), chapter.findings.end(),
                          [&](const Finding &finding) { return finding.severity == severity; }));
    }
    return count;
}

void PrintReport(const Report &report, bool onlyProblems) {
    bool isAnyShown = false;
    for (const Chapter &chapter : report) {
        if (!IsShown(chapter, onlyProblems)) {
            continue;
        }
        isAnyShown = true;
        std::cout << Coloured(chapter.check->title, Colour::kBold, MayUseColour()) << '\n';
        for (const Finding &finding : chapter.findings) {
            if (IsShown(finding, onlyProblems)) {
                PrintFinding(finding);
            }
        }
    }
    const std::string sum = SumOf(report);
    if (isAnyShown) {
        std::cout << '\n' << (sum.empty() ? "Nothing is wrong." : sum + ".") << '\n';
    }
}

Json::Value ReportAsJson(const Report &report, bool onlyProblems) {
    Json::Value findings(Json::arrayValue);
    for (const Chapter &chapter : report) {
        for (const Finding &finding : chapter.findings) {
            if (IsShown(finding, onlyProblems)) {
                findings.append(AsJson(finding, *chapter.check));
            }
        }
    }
    Json::Value object(Json::objectValue);
    object["result"] = WorstOf(report);
    object["errors"] = Json::UInt64(CountOf(report, Severity::kError));
    object["warnings"] = Json::UInt64(CountOf(report, Severity::kWarning));
    object["unknown"] = Json::UInt64(CountOf(report, Severity::kUnknown));
    object["findings"] = findings;
    return object;
}

} // namespace CTL::DOCTOR
