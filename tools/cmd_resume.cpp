#include <fileindex/status_mgr.h>
#include <iostream>
#include <memory>

#include "command.h"
#include "messages.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] = R"(Examples:
  fileindexctl resume
  fileindexctl resume --dry-run)";

ExitCode Run(bool isDryRun) {
    if (isDryRun) {
        std::cout << "Would end any pause and tell the daemon.\n";
        return kDone;
    }
    if (!While("Telling the daemon", [] { return fileindex::StatusMgr::Resume(); })) {
        return IsUnsaved() ? Fail("Cannot end the pause")
                           : FailHalfWay("The end of the pause is saved", kDaemonAdvice);
    }
    Say("Indexing goes on.");
    return kDone;
}

} // namespace

Action DeclareResume(CLI::App &app) {
    const auto isDryRun = std::make_shared<bool>(false);
    AddDryRunOption(app, *isDryRun);
    app.footer(kFooter);
    return [isDryRun] { return Run(*isDryRun); };
}

} // namespace CTL
