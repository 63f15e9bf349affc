#include <fileindex/index_mgr.h>
#include <memory>

#include "command.h"
#include "messages.h"
#include "output.h"
#include "paths.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] = R"(Exit status: 0 when all of them are indexed, 3 otherwise.

Examples:
  fileindexctl query /photos/2016
  fileindexctl query --full-path /volume1/photos/2016/a.jpg
  fileindexctl query --share photos music --json)";

struct Options {
    std::vector<std::string> paths;
    bool isShare = false;
    bool isFullPath = false;
    JsonMode json = JsonMode::kOff;
};

bool IsIndexed(const std::string &path, const Options &options,
               const std::vector<Folder> &folders) {
    if (options.isShare) {
        return IndexMgr::IsShareIndexed(path);
    }
    return options.isFullPath ? IndexMgr::IsFullPathIndexed(path, folders)
                              : IndexMgr::IsPathIndexed(path, folders);
}

ExitCode Run(const Options &options) {
    // The queries answer no for settings that cannot be loaded.
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return Fail("Cannot tell what is indexed");
    }
    Table table({"ANSWER", "PATH"});
    Json::Value answers(Json::objectValue);
    ExitCode result = kDone;
    for (const std::string &path : options.paths) {
        const bool isIndexed = IsIndexed(path, options, folders);
        table.Add({isIndexed ? "indexed" : "not indexed", path});
        answers[path] = isIndexed;
        result = isIndexed ? result : kNotFound;
    }
    if (options.json != JsonMode::kOff) {
        PrintJson(answers, options.json);
    } else {
        table.Print();
    }
    return result;
}

std::string MistakeIn(const Options &options) {
    for (const std::string &path : options.paths) {
        std::string mistake = options.isShare      ? std::string()
                              : options.isFullPath ? CheckFullPath(path)
                                                   : CheckSharePath(path);
        if (!mistake.empty()) {
            return mistake;
        }
    }
    return {};
}

} // namespace

Action DeclareQuery(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Share paths, or what the options say");
    CLI::Option *share = app.add_flag("--share", options->isShare, "They are names of shares");
    app.add_flag("--full-path", options->isFullPath, "They are paths of the file system")
        ->excludes(share);
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    app.callback([options] {
        const std::string mistake = MistakeIn(*options);
        if (!mistake.empty()) {
            throw CLI::ValidationError(mistake);
        }
    });
    return [options] { return Run(*options); };
}

} // namespace CTL
