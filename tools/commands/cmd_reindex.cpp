#include <fileindex/index_mgr.h>
#include <memory>

#include "commands/change.h"
#include "commands/command.h"
#include "state/asked_path.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] =
    R"(Shares that ran out of space are tried again. If one of the paths is not
indexed, nothing is done and the exit status is 3. --all skips folders whose
share is gone; the exit status is then 1.

Examples:
  fileindexctl reindex /photos
  fileindexctl reindex /media/a /volume2/media/b
  fileindexctl reindex --all --dry-run)";

struct Options {
    std::vector<std::string> paths;
    bool all = false;
    Change change;
};

ExitCode Queue(const std::vector<std::string> &paths, Change &change) {
    change.facts["paths"] = ArrayOf(paths);
    if (change.isDryRun) {
        for (const std::string &path : paths) {
            change.Would("queue " + Shown(path) + " for reindexing");
        }
        return kDone;
    }
    if (!While("Queueing", [&] { return IndexMgr::Reindex(ArrayOf(paths)); })) {
        return Fail("Cannot reindex " + Named(paths));
    }
    Say("Queued " + Named(paths) + " for reindexing.");
    return kDone;
}

ExitCode QueuePaths(Options &options, const std::vector<Folder> &folders) {
    const std::vector<std::string> paths = ToSharePaths(options.paths);
    std::vector<std::string> unknown;
    for (const std::string &path : paths) {
        if (!IndexMgr::IsPathIndexed(path, folders) &&
            !IndexMgr::IsPathContainIndexed(path, folders)) {
            unknown.push_back(path);
        }
    }
    if (!unknown.empty()) {
        Say("Nothing was done: " + Named(unknown) +
            (unknown.size() == 1 ? " is not indexed." : " are not indexed."));
        Advise("Use fileindexctl add to index a folder.");
        return kNotFound;
    }
    return Queue(paths, options.change);
}

ExitCode QueueAll(Options &options, const std::vector<Folder> &folders) {
    std::vector<std::string> paths;
    std::vector<std::string> gone;
    for (const Folder &folder : folders) {
        (folder.full_path.empty() ? gone : paths).push_back(folder.path);
    }
    ExitCode result = kNotFound;
    if (!paths.empty()) {
        result = Queue(paths, options.change);
    }
    if (folders.empty()) {
        Say("No folder is indexed.");
    }
    if (!gone.empty()) {
        Say("Skipped " + Named(gone) + ": no share has that name.");
        Advise("Use fileindexctl remove to remove the setting.");
        result = kFailed;
    }
    return result;
}

ExitCode Run(Options &options) {
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return Fail("Cannot reindex");
    }
    return options.all ? QueueAll(options, folders) : QueuePaths(options, folders);
}

} // namespace

Action DeclareReindex(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    CLI::Option *paths = AddPathsTo(app, options->paths, "Paths in or above indexed folders");
    paths->check(CheckSharePath)->required(false);
    app.add_flag("--all", options->all, "Every indexed folder")->excludes(paths);
    app.footer(kFooter);
    app.callback([options] {
        if (options->paths.empty() && !options->all) {
            throw CLI::ValidationError("Choose what to index again: PATH... or --all");
        }
    });
    return MakeChange(app, options->change, [options] { return Run(*options); });
}

} // namespace CTL
