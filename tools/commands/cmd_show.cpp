#include <algorithm>
#include <fileindex/index_mgr.h>
#include <memory>

#include "commands/command.h"
#include "state/asked_path.h"
#include "state/folder_view.h"
#include "state/refusal_text.h"
#include "terminal/messages.h"
#include "terminal/output.h"
#include "terminal/text.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] = R"(Exit status: 0, or 3 if the folder is not indexed.

Examples:
  fileindexctl show /photos
  fileindexctl show /volume1/photos --json=pretty)";

struct Options {
    std::string path;
    JsonMode json = JsonMode::kOff;
};

void PrintLines(const Json::Value &folder) {
    Table table({"FIELD", "VALUE"});
    table.Add({"path", folder["path"].asString()});
    table.Add({"full path", folder["full_path"].asString()});
    table.Add({"name", folder["name"].asString()});
    table.Add({"types", TypesOf(folder)});
    table.Add({"status", StatusOf(folder)});
    table.Print();
}

ExitCode SayNotSet(const std::string &path, const std::vector<fileindex::Folder> &folders) {
    Say(Shown(path) + " is not an indexed folder.");
    const std::string governing = GoverningSetting(ToFullPath(path), folders)["path"].asString();
    Advise(governing.empty() ? "fileindexctl list shows the indexed folders."
                             : "It lies in " + Shown(governing) + ", which is indexed.");
    return kNotFound;
}

ExitCode Run(const Options &options) {
    // IndexMgr::Get() would take the lock, which is for those who may change something.
    std::vector<fileindex::Folder> folders;
    if (!fileindex::IndexMgr::List(folders)) {
        return Fail("Cannot read the setting of " + Shown(options.path));
    }
    std::string path = options.path;
    (void)ToSharePath(path, options.path); // it has been checked to be one
    const auto setting = std::find_if(folders.begin(), folders.end(),
                                      [&](const auto &folder) { return folder.path == path; });
    if (setting == folders.end()) {
        return SayNotSet(path, folders);
    }
    Json::Value answer = setting->asJson(FolderFacts());
    answer["full_path"] = ToFullPath(path);
    const auto refusal = RefusalOf(path);
    answer["refusal"] = AsJson(refusal);
    if (options.json != JsonMode::kOff) {
        PrintJson(answer, options.json);
        return kDone;
    }
    PrintLines(answer);
    if (refusal) {
        Say(Shown(path) + " cannot be indexed: " + refusal->why + ".");
        Advise(refusal->fix);
    }
    return kDone;
}

} // namespace

Action DeclareShow(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    app.add_option("PATH", options->path, "The folder, by share path or full path")
        ->required()
        ->check(CheckSharePath);
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
