#include <fileindex/error_handler.h>
#include <fileindex/status_mgr.h>

#include "command.h"
#include "messages.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] = R"(Examples:
  fileindexctl resume)";

ExitCode Run() {
    if (!fileindex::StatusMgr::Resume()) {
        if (fileindex::ErrorHandler::GetError() != fileindex::FILEINDEX_ERR_NONE) {
            return Fail("Cannot end the pause");
        }
        return FailHalfWay("The end of the pause is saved",
                           "The daemon could not be told: is fileindexd running?");
    }
    Say("Indexing goes on.");
    return kDone;
}

} // namespace

Action DeclareResume(CLI::App &app) {
    app.footer(kFooter);
    return [] { return Run(); };
}

} // namespace CTL
