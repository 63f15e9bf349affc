#include <fileindex/index_mgr.h>
#include <memory>

#include "commands/change.h"
#include "commands/command.h"
#include "commands/folder_request.h"
#include "state/asked_path.h"
#include "state/folder_view.h"
#include "terminal/messages.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] =
    R"(Only what is given changes. If one of the folders is not indexed, nothing is
changed and the exit status is 3; use fileindexctl add to index a folder.

Examples:
  fileindexctl set /photos --video=no
  fileindexctl set /media/a /media/b --document=yes --audio=no
  fileindexctl set /photos --name "Our photos" --dry-run)";

constexpr Wording kWording = {"Cannot change", "Changed"};

struct Options {
    std::vector<std::string> paths;
    std::string name;
    bool hasName = false;                             // it may be given as empty
    std::array<std::string, kFileTypes.size()> types; // "yes", "no" or, when not given, empty
    Change change;
};

Json::Value MembersOf(const Options &options) {
    Json::Value members(Json::objectValue);
    if (options.hasName) {
        members["name"] = options.name;
    }
    for (std::size_t i = 0; i < kFileTypes.size(); ++i) {
        if (!options.types[i].empty()) {
            members[kFileTypes[i]] = options.types[i] == "yes";
        }
    }
    return members;
}

ExitCode Run(Options &options) {
    const std::vector<std::string> paths = ToSharePaths(options.paths);
    options.change.facts["paths"] = ArrayOf(paths);
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return Fail("Cannot change " + Named(paths));
    }
    // The library would add a folder that is not set.
    const std::vector<std::string> missing = NotSet(paths, folders);
    if (!missing.empty()) {
        Say("Nothing was changed: " + NamedNotSet(missing) + ".");
        Advise("fileindexctl list shows the indexed folders; add indexes more.");
        return kNotFound;
    }
    return Apply(options.change, RequestFor(paths, MembersOf(options)), kWording);
}

std::string CheckYesNo(const std::string &word) {
    return word == "yes" || word == "no" ? "" : "must be yes or no, not '" + word + "'";
}

void Check(const Options &options) {
    if (MembersOf(options).empty()) {
        throw CLI::ValidationError("Choose what to change: --document=yes|no, --audio=yes|no, "
                                   "--video=yes|no, --photo=yes|no or --name=NAME");
    }
    if (options.hasName && options.paths.size() > 1) {
        throw CLI::ValidationError("--name is for a single folder");
    }
}

} // namespace

Action DeclareSet(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Folders, by share path or full path")->check(CheckSharePath);
    CLI::Option *name =
        app.add_option("--name", options->name, "Display name, for a single folder");
    name->type_name("NAME");
    const std::array<const char *, kFileTypes.size()> meanings = {
        "Index documents or not", "Index audio files or not", "Index videos or not",
        "Index photos or not"};
    for (std::size_t i = 0; i < kFileTypes.size(); ++i) {
        app.add_option(std::string("--") + kFileTypes[i], options->types[i], meanings[i])
            ->type_name("yes|no")
            ->check(CheckYesNo);
    }
    app.footer(kFooter);
    app.callback([options, name] {
        options->hasName = name->count() > 0;
        Check(*options);
    });
    return MakeChange(app, options->change, [options] { return Run(*options); });
}

} // namespace CTL
