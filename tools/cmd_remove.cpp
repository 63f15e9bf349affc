#include <algorithm>
#include <fileindex/index_mgr.h>
#include <memory>

#include "command.h"
#include "messages.h"
#include "paths.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] =
    R"(The files stay; a share without indexed folders loses its index. When one of the
folders is not set, nothing is removed.

Examples:
  fileindexctl remove /photos
  fileindexctl remove /media/a /media/b)";

struct Options {
    std::vector<std::string> paths;
};

bool IsSet(const std::string &path, const std::vector<Folder> &folders) {
    return std::any_of(folders.begin(), folders.end(),
                       [&](const Folder &folder) { return folder.path == path; });
}

std::vector<std::string> NotSet(const std::vector<std::string> &paths,
                                const std::vector<Folder> &folders) {
    std::vector<std::string> missing;
    for (const std::string &path : paths) {
        if (!IsSet(path, folders)) {
            missing.push_back(path);
        }
    }
    return missing;
}

ExitCode Run(const Options &options) {
    const std::string paths = Named(options.paths);
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return Fail("Cannot remove " + paths);
    }
    // The library takes a folder that is not set for removed.
    const auto missing = NotSet(options.paths, folders);
    if (!missing.empty()) {
        Say("Nothing is removed: " + Named(missing) + " is not set.");
        Advise("fileindexctl list shows the folders that are.");
        return kNotFound;
    }
    if (!IndexMgr::Delete(ArrayOf(options.paths))) {
        if (!IndexMgr::List(folders) ||
            NotSet(options.paths, folders).size() < options.paths.size()) {
            return Fail("Cannot remove " + paths);
        }
        return FailHalfWay("The setting is removed", "See the system log.");
    }
    Say("Removed " + paths + ".");
    return kDone;
}

} // namespace

Action DeclareRemove(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Share paths of the folders")->check(CheckSharePath);
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
