// pause, resume, clean: what needs a share that is there.

#include <fileindex/index_mgr.h>
#include <memory>

#include "commands/change.h"
#include "commands/share_commands.h"
#include "state/share_record.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::IndexMgr;

constexpr char kPauseFooter[] =
    R"(The daemon drops the share's worker and the share is watched no more, until
fileindexctl share resume. The settings stay.

Examples:
  fileindexctl share pause photos)";

constexpr char kResumeFooter[] = R"(The share is watched again, and the daemon starts its worker.

Examples:
  fileindexctl share resume photos)";

constexpr char kCleanFooter[] =
    R"(Deletes the share's index database and its event queue, for a share that is
removed or to be indexed from nothing. The files and the settings stay.

Examples:
  fileindexctl share clean photos --dry-run
  fileindexctl share clean photos)";

// An operation on a share, and what is said about it.
struct Operation {
    bool (*run)(const std::string &share);
    const char *would; // "stop the work on share"
    const char *attempt;
    const char *done;
    const char *next; // what to do then; may be empty
};

constexpr Operation kPause = {IndexMgr::SharePause, "stop the work on share",
                              "Cannot stop the work on share", "Stopped the work on share",
                              "fileindexctl share resume takes it up again."};
constexpr Operation kResume = {IndexMgr::ShareResume, "take up the work on share",
                               "Cannot take up the work on share", "Took up the work on share", ""};
constexpr Operation kClean = {IndexMgr::CleanShareIndexData, "delete the index of share",
                              "Cannot delete the index of share", "Deleted the index of share",
                              "fileindexctl reindex makes a new one for its folders."};

struct Options {
    std::string share;
    Change change;
};

ExitCode Run(Options &options, const Operation &operation) {
    const std::string name = OwnNameOf(options.share);
    if (name.empty()) {
        return SayNoShare(options.share);
    }
    options.change.facts["shares"].append(name);
    const std::string share = " " + Shown(name);
    if (options.change.isDryRun) {
        options.change.Would(operation.would + share);
        return kDone;
    }
    if (!While("Telling the indexing service", [&] { return operation.run(name); })) {
        return Fail(operation.attempt + share);
    }
    Say(operation.done + share + ".");
    if (*operation.next != '\0') {
        Advise(operation.next);
    }
    return kDone;
}

Action Declare(CLI::App &app, const Operation &operation, const char *footer) {
    const auto options = std::make_shared<Options>();
    AddShareTo(app, "SHARE", options->share, "Name of the share");
    app.footer(footer);
    return MakeChange(app, options->change,
                      [options, &operation] { return Run(*options, operation); });
}

} // namespace

Action DeclareSharePause(CLI::App &app) {
    return Declare(app, kPause, kPauseFooter);
}

Action DeclareShareResume(CLI::App &app) {
    return Declare(app, kResume, kResumeFooter);
}

Action DeclareShareClean(CLI::App &app) {
    return Declare(app, kClean, kCleanFooter);
}

} // namespace CTL
