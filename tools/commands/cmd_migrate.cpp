#include <fileindex/index_mgr.h>
#include <fileindex/migration.h>
#include <memory>

#include "commands/change.h"
#include "commands/command.h"
#include "state/asked_path.h"
#include "state/folder_view.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;

constexpr char kFooter[] =
    R"(Run after an upgrade from the previous release: brings the services in line with
the settings and reindexes every folder. The settings stay as they are.

Examples:
  fileindexctl migrate --dry-run
  fileindexctl migrate)";

void Preview(const std::vector<Folder> &folders, const Change &change) {
    if (folders.empty()) {
        change.Would("stop fileindexd: no folder is indexed");
        return;
    }
    change.Would("start fileindexd and switch Spotlight on");
    change.Would("watch every share that has indexed folders");
    for (const Folder &folder : folders) {
        change.Would("queue " + Shown(folder.path) + " for reindexing");
    }
}

ExitCode Run(Change &change) {
    std::vector<Folder> folders;
    if (!VANO::FILEINDEX::IndexMgr::List(folders)) {
        return Fail("Cannot migrate");
    }
    change.facts["paths"] = ArrayOf(PathsOf(folders));
    if (change.isDryRun) {
        Preview(folders, change);
        return kDone;
    }
    if (!While("Updating the services", [] { return VANO::FILEINDEX::Updater_zem60_beta2(); })) {
        return Fail("The migration stopped halfway");
    }
    Say(folders.empty() ? "fileindexd is stopped: no folder is indexed."
                        : "The services are up to date, and every folder is queued for "
                          "reindexing.");
    return kDone;
}

} // namespace

Action DeclareMigrate(CLI::App &app) {
    const auto change = std::make_shared<Change>();
    app.footer(kFooter);
    return MakeChange(app, *change, [change] { return Run(*change); });
}

} // namespace CTL
