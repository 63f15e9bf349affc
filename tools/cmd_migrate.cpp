#include <fileindex/index_mgr.h>
#include <fileindex/migration.h>
#include <iostream>
#include <memory>

#include "command.h"
#include "messages.h"
#include "text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;

constexpr char kFooter[] =
    R"(For the upgrade step, after an upgrade from the previous release. The settings
stay as they are. Running it again does all of it again.

Examples:
  fileindexctl migrate --dry-run
  fileindexctl migrate)";

void Preview(const std::vector<Folder> &folders) {
    if (folders.empty()) {
        std::cout << "Would stop fileindexd: no folder is indexed.\n";
        return;
    }
    std::cout << "Would start fileindexd and switch Spotlight on.\n"
                 "Would have every share with indexed folders watched.\n";
    for (const Folder &folder : folders) {
        std::cout << "Would queue " << Shown(folder.path) << " for a new index.\n";
    }
}

ExitCode Run(bool isDryRun) {
    std::vector<Folder> folders;
    if (!VANO::FILEINDEX::IndexMgr::List(folders)) {
        return Fail("Cannot migrate");
    }
    if (isDryRun) {
        Preview(folders);
        return kDone;
    }
    if (!While("Bringing the services into line",
               [] { return VANO::FILEINDEX::Updater_zem60_beta2(); })) {
        return Fail("The migration stopped half-way");
    }
    Say(folders.empty() ? "fileindexd is stopped: no folder is indexed."
                        : "The services follow the settings, and every folder is queued for a "
                          "new index.");
    return kDone;
}

} // namespace

Action DeclareMigrate(CLI::App &app) {
    const auto isDryRun = std::make_shared<bool>(false);
    AddDryRunOption(app, *isDryRun);
    app.footer(kFooter);
    return [isDryRun] { return Run(*isDryRun); };
}

} // namespace CTL
