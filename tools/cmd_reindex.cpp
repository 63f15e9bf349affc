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
    R"(Shares that ran out of space are tried again. When one of the paths is not
indexed, nothing is done.

Examples:
  fileindexctl reindex /photos
  fileindexctl reindex /media/a /media/b)";

struct Options {
    std::vector<std::string> paths;
};

ExitCode Run(const Options &options) {
    const std::string paths = Named(options.paths);
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return Fail("Cannot index " + paths + " again");
    }
    std::vector<std::string> unknown;
    for (const std::string &path : options.paths) {
        if (!IndexMgr::IsPathIndexed(path, folders) &&
            !IndexMgr::IsPathContainIndexed(path, folders)) {
            unknown.push_back(path);
        }
    }
    if (!unknown.empty()) {
        Say("Nothing is done: " + Named(unknown) + " is not indexed.");
        Advise("fileindexctl add indexes a folder.");
        return kNotFound;
    }
    if (!IndexMgr::Reindex(ArrayOf(options.paths))) {
        return Fail("Cannot index " + paths + " again");
    }
    Say("Queued " + paths + " for a new index.");
    return kDone;
}

} // namespace

Action DeclareReindex(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Share paths of the folders")->check(CheckSharePath);
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
