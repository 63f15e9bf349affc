#include <fileindex/error_handler.h>
#include <fileindex/folder.h>
#include <fileindex/index_mgr.h>
#include <memory>

#include "command.h"
#include "folder_view.h"
#include "messages.h"
#include "output.h"
#include "paths.h"
#include "text.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] = R"(Examples:
  fileindexctl show /photos
  fileindexctl show /photos --json)";

struct Options {
    std::string path;
    JsonMode json = JsonMode::kOff;
};

void PrintLines(const Json::Value &folder, const std::string &fullPath) {
    Table table({"FIELD", "VALUE"});
    table.Add({"path", folder["path"].asString()});
    table.Add({"full path", fullPath});
    table.Add({"name", folder["name"].asString()});
    table.Add({"types", TypesOf(folder)});
    table.Add({"status", StatusOf(folder)});
    table.Print();
}

ExitCode Run(const Options &options) {
    Json::Value setting;
    if (!fileindex::IndexMgr::Get(setting, options.path)) {
        if (fileindex::ErrorHandler::GetError() != fileindex::FILEINDEX_ERR_NO_SUCH_FOLDER) {
            return Fail("Cannot read the setting of " + Shown(options.path));
        }
        Say(Shown(options.path) + " is not set.");
        Advise("fileindexctl list shows the folders that are.");
        return kNotFound;
    }
    fileindex::Folder folder;
    (void)folder.Reload(options.path, setting); // a share that is gone shows in the status
    const Json::Value answer = folder.asJson(AdditionalKeys());
    if (options.json != JsonMode::kOff) {
        PrintJson(answer, options.json);
    } else {
        PrintLines(answer, folder.full_path);
    }
    return kDone;
}

} // namespace

Action DeclareShow(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    app.add_option("PATH", options->path, "Share path of the folder")
        ->required()
        ->check(CheckSharePath);
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
