#include <memory>

#include "commands/change.h"
#include "commands/command.h"
#include "commands/folder_request.h"
#include "state/asked_path.h"
#include "state/folder_view.h"

namespace CTL {

namespace {

constexpr char kFooter[] =
    R"(A folder that is already indexed keeps its other file types and its name.

Examples:
  fileindexctl add /photos --photo --video
  fileindexctl add /documents/letters --document --name Letters
  fileindexctl add /volume2/media/a /volume2/media/b --all --dry-run)";

constexpr Wording kWording = {"Cannot add", "Added"};

struct Options {
    std::vector<std::string> paths;
    std::string name;
    std::array<bool, kFileTypes.size()> types{};
    bool all = false;
    Change change;
};

Json::Value RequestOf(const Options &options) {
    Json::Value members(Json::objectValue);
    if (!options.name.empty()) {
        members["name"] = options.name;
    }
    for (std::size_t i = 0; i < kFileTypes.size(); ++i) {
        if (options.types[i] || options.all) {
            members[kFileTypes[i]] = true;
        }
    }
    return RequestFor(ToSharePaths(options.paths), members);
}

ExitCode Run(Options &options) {
    return Apply(options.change, RequestOf(options), kWording);
}

void Check(const Options &options) {
    const bool hasType =
        std::find(options.types.begin(), options.types.end(), true) != options.types.end();
    if (!hasType && !options.all) {
        throw CLI::ValidationError(
            "Choose what to index: --document, --audio, --video, --photo or --all");
    }
    if (!options.name.empty() && options.paths.size() > 1) {
        throw CLI::ValidationError("--name is for a single folder");
    }
}

} // namespace

Action DeclareAdd(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Folders, by share path or full path")->check(CheckFolderPath);
    app.add_option("--name", options->name, "Display name, for a single folder")->type_name("NAME");
    const std::array<const char *, kFileTypes.size()> meanings = {
        "Index documents", "Index audio files", "Index videos", "Index photos"};
    for (std::size_t i = 0; i < kFileTypes.size(); ++i) {
        app.add_flag(std::string("--") + kFileTypes[i], options->types[i], meanings[i]);
    }
    app.add_flag("--all", options->all, "Index all four file types");
    app.footer(kFooter);
    app.callback([options] { Check(*options); });
    return MakeChange(app, options->change, [options] { return Run(*options); });
}

} // namespace CTL
