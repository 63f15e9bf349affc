// pause, resume, clean: what needs a share that is there.

#include <fileindex/index_mgr.h>
#include <memory>

#include "commands/change.h"
#include "commands/share_commands.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::IndexMgr;

constexpr char kPauseFooter[] =
    R"(The daemon stops working on the share, and changes in it are no longer watched,
until fileindexctl share resume. The settings stay.

Examples:
  fileindexctl share pause photos)";

constexpr char kResumeFooter[] =
    R"(Changes in the share are watched again, and the daemon works on it.

Examples:
  fileindexctl share resume photos)";

constexpr char kCleanFooter[] =
    R"(Deletes the share's index database and event queue, for a share that is removed
or is to be indexed from scratch. The files and the settings stay.

Examples:
  fileindexctl share clean photos --dry-run
  fileindexctl share clean photos)";

// An operation on a share, and what is said about it.
struct Operation {
    bool (*run)(const std::string &share);
    const char *would; // "stop indexing share"
    const char *attempt;
    const char *done;
    const char *next; // what to do then; may be empty
};

constexpr Operation kPause = {IndexMgr::SharePause, "stop indexing share",
                              "Cannot stop indexing share", "Stopped indexing share",
                              "Use fileindexctl share resume to resume."};
constexpr Operation kResume = {IndexMgr::ShareResume, "resume indexing share",
                               "Cannot resume indexing share", "Resumed indexing share", ""};
constexpr Operation kClean = {IndexMgr::CleanShareIndexData, "delete the index of share",
                              "Cannot delete the index of share", "Deleted the index of share",
                              "Use fileindexctl reindex to rebuild it."};

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
