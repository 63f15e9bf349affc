#include <algorithm>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <memory>

#include "command.h"
#include "messages.h"
#include "paths.h"
#include "text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] = R"(A folder that is set already keeps its other file types and its name.

Examples:
  fileindexctl add /photos --photo --video
  fileindexctl add /documents/letters --document --name Letters
  fileindexctl add /media/a /media/b --all)";

struct Options {
    std::vector<std::string> paths;
    std::string name;
    bool document = false;
    bool audio = false;
    bool video = false;
    bool photo = false;
    bool all = false;
};

Json::Value RequestOf(const Options &options) {
    Json::Value request(Json::arrayValue);
    for (const std::string &path : options.paths) {
        Json::Value folder(Json::objectValue);
        folder["path"] = path;
        if (!options.name.empty()) {
            folder["name"] = options.name;
        }
        const std::pair<const char *, bool> types[] = {{"document", options.document},
                                                       {"audio", options.audio},
                                                       {"video", options.video},
                                                       {"photo", options.photo}};
        for (const auto &[type, isWanted] : types) {
            if (isWanted || options.all) {
                folder[type] = true;
            }
        }
        request.append(folder);
    }
    return request;
}

// Whether the settings hold what was asked for, whoever else did not hear of it.
bool IsSaved(const Json::Value &request) {
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return false;
    }
    return std::all_of(request.begin(), request.end(), [&](const Json::Value &wanted) {
        return std::any_of(folders.begin(), folders.end(), [&](const Folder &folder) {
            const Json::Value set = folder.asJson();
            const auto keys = wanted.getMemberNames();
            return std::all_of(keys.begin(), keys.end(),
                               [&](const std::string &key) { return set[key] == wanted[key]; });
        });
    });
}

// The library calls a folder of an unknown share a bad parameter, without saying which. Resolving
// the paths again makes that the last error.
void BlameUnknownShare(const std::vector<std::string> &paths) {
    for (const std::string &path : paths) {
        std::string fullPath;
        if (!VANO::FILEINDEX::GetFullPath(fullPath, path)) {
            return;
        }
    }
}

ExitCode Run(const Options &options) {
    const std::string paths = Named(options.paths);
    const Json::Value request = RequestOf(options);
    if (!IndexMgr::Add(request)) {
        if (!IsSaved(request)) {
            BlameUnknownShare(options.paths);
            return Fail("Cannot add " + paths);
        }
        return FailHalfWay(paths + (options.paths.size() == 1 ? " is saved" : " are saved"),
                           "See the system log, then repeat this command.");
    }
    Say("Added " + paths + ".");
    for (const std::string &path : options.paths) {
        if (!VANO::FILEINDEX::CanPathBeIndexed(path)) {
            Say(Shown(path) + " cannot be indexed as it is: it is missing, or no plain folder of "
                              "a share that may be indexed.");
        }
    }
    return kDone;
}

} // namespace

Action DeclareAdd(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Share paths of the folders")->check(CheckFolderPath);
    CLI::Option *name =
        app.add_option("--name", options->name, "Display name, for a single folder");
    name->type_name("NAME");
    app.add_flag("--document", options->document, "Index documents");
    app.add_flag("--audio", options->audio, "Index audio files");
    app.add_flag("--video", options->video, "Index videos");
    app.add_flag("--photo", options->photo, "Index photos");
    app.add_flag("--all", options->all, "Index all of these");
    app.footer(kFooter);
    app.callback([options] {
        if (!options->document && !options->audio && !options->video && !options->photo &&
            !options->all) {
            throw CLI::ValidationError(
                "Say what to index: --document, --audio, --video, --photo or --all");
        }
        if (!options->name.empty() && options->paths.size() > 1) {
            throw CLI::ValidationError("--name is for a single folder");
        }
    });
    return [options] { return Run(*options); };
}

} // namespace CTL
