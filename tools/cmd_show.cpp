#include <fileindex/error_handler.h>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <memory>

#include "command.h"
#include "folder_view.h"
#include "index_refusal.h"
#include "messages.h"
#include "output.h"
#include "paths.h"
#include "text.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] = R"(Exit status: 0, or 3 when the folder is not set.

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

ExitCode SayNotSet(const std::string &path) {
    Say(Shown(path) + " is not set.");
    std::vector<fileindex::Folder> folders;
    (void)fileindex::IndexMgr::List(folders); // without a list there is no hint
    const std::string governing =
        fileindex::GetMostSuitableCfg(Resolved(folders), ToFullPath(path))["path"].asString();
    Advise(governing.empty() ? "fileindexctl list shows the folders that are."
                             : "It lies in " + Shown(governing) + ", which is.");
    return kNotFound;
}

ExitCode Run(const Options &options) {
    std::string path = options.path;
    (void)ToSharePath(path, options.path); // it has been checked to be one
    Json::Value setting;
    if (!fileindex::IndexMgr::Get(setting, path)) {
        return fileindex::ErrorHandler::GetError() == fileindex::FILEINDEX_ERR_NO_SUCH_FOLDER
                   ? SayNotSet(path)
                   : Fail("Cannot read the setting of " + Shown(path));
    }
    Json::Value answer = WithFacts(setting);
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
        Advise(refusal->mend);
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
