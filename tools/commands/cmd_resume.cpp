#include <fileindex/status_mgr.h>
#include <memory>

#include "commands/change.h"
#include "commands/command.h"
#include "terminal/messages.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] = R"(Examples:
  fileindexctl resume
  fileindexctl resume --dry-run)";

ExitCode Run(const Change &change) {
    if (change.isDryRun) {
        change.Would("end the pause, if any, and tell the daemon");
        return kDone;
    }
    if (!While("Telling the daemon", [] { return fileindex::StatusMgr::Resume(); })) {
        return IsUnsaved() ? Fail("Cannot end the pause")
                           : FailHalfWay("The end of the pause is saved", kDaemonAdvice);
    }
    Say("Indexing is resumed.");
    return kDone;
}

} // namespace

Action DeclareResume(CLI::App &app) {
    const auto change = std::make_shared<Change>();
    app.footer(kFooter);
    return MakeChange(app, *change, [change] { return Run(*change); });
}

} // namespace CTL
