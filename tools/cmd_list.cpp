#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <limits>
#include <memory>

#include "command.h"
#include "folder_view.h"
#include "messages.h"
#include "output.h"
#include "text.h"

namespace CTL {

namespace {

constexpr char kFooter[] =
    R"(The columns are path, name, file types and status: finished, processing, paused,
out of space, or cannot be indexed.

Examples:
  fileindexctl list
  fileindexctl list --share photos --json)";

struct Options {
    std::string share;
    JsonMode json = JsonMode::kOff;
};

bool LiesIn(const std::string &share, const Json::Value &folder) {
    std::string name;
    return share.empty() ||
           (VANO::FILEINDEX::GetShareNameByPath(name, folder["path"].asString()) && name == share);
}

void PrintTable(const Json::Value &folders) {
    Table table({"PATH", "NAME", "TYPES", "STATUS"});
    for (const Json::Value &folder : folders) {
        table.Add({folder["path"].asString(), folder["name"].asString(), TypesOf(folder),
                   StatusOf(folder)});
    }
    table.Print();
}

ExitCode Run(const Options &options) {
    Json::Value page;
    if (!VANO::FILEINDEX::IndexMgr::List(page, 0, std::numeric_limits<unsigned long>::max(), "path",
                                         "ASC", AdditionalKeys())) {
        return Fail("Cannot list the folders");
    }
    Json::Value folders(Json::arrayValue);
    for (const Json::Value &folder : page["folder"]) {
        if (LiesIn(options.share, folder)) {
            folders.append(folder);
        }
    }
    if (options.json != JsonMode::kOff) {
        Json::Value answer(Json::objectValue);
        answer["folder"] = folders;
        answer["total"] = folders.size();
        PrintJson(answer, options.json);
    } else if (!folders.empty()) {
        PrintTable(folders);
    }
    if (!folders.empty()) {
        return kDone;
    }
    if (options.share.empty()) {
        Say("No folder is indexed.");
        return kDone;
    }
    Say("No folder of share " + Shown(options.share) + " is indexed.");
    return kNotFound;
}

} // namespace

Action DeclareList(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    app.add_option("--share", options->share, "Only the folders of this share")->type_name("SHARE");
    AddJsonOption(app, options->json);
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
