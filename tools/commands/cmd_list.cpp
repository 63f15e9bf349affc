#include <algorithm>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <iostream>
#include <limits>
#include <memory>

#include "commands/command.h"
#include "state/folder_view.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/output.h"
#include "terminal/text.h"

namespace CTL {

namespace {

constexpr char kFooter[] =
    R"(The columns are path, name, file types and status: finished, processing, paused,
out of space, or cannot be indexed (fileindexctl show says why).

Examples:
  fileindexctl list
  fileindexctl list --share photos --json
  fileindexctl list --null | xargs -0 fileindexctl reindex)";

struct Options {
    std::string share;
    bool isNull = false;
    JsonMode json = JsonMode::kOff;
};

bool LiesIn(const std::string &share, const Json::Value &folder) {
    std::string name;
    return share.empty() ||
           (VANO::FILEINDEX::GetShareNameByPath(name, folder["path"].asString()) && name == share);
}

// By path. False when the settings cannot be read.
bool Matching(std::vector<Json::Value> &folders, const Options &options) {
    const std::string share = options.share.empty() ? "" : NameOfShare(options.share);
    Json::Value page;
    if (!VANO::FILEINDEX::IndexMgr::List(page, 0, std::numeric_limits<unsigned long>::max(), "path",
                                         "ASC", FolderFacts())) {
        return false;
    }
    std::copy_if(page["folder"].begin(), page["folder"].end(), std::back_inserter(folders),
                 [&](const Json::Value &folder) { return LiesIn(share, folder); });
    return true;
}

void PrintPaths(const std::vector<Json::Value> &folders) {
    for (const Json::Value &folder : folders) {
        std::cout << folder["path"].asString() << '\0';
    }
}

void PrintFolders(const std::vector<Json::Value> &folders, JsonMode json) {
    Json::Value answer(Json::objectValue);
    answer["folder"] = Json::Value(Json::arrayValue);
    Table table({"PATH", "NAME", "TYPES", "STATUS"});
    table.MayCut("PATH", 20);
    table.MayCut("NAME", 10);
    for (const Json::Value &folder : folders) {
        table.Add({folder["path"].asString(), folder["name"].asString(), TypesOf(folder),
                   StatusOf(folder)});
        answer["folder"].append(folder);
    }
    if (json != JsonMode::kOff) {
        PrintJson(answer, json);
    } else if (!folders.empty()) {
        table.Print();
    }
}

ExitCode Run(const Options &options) {
    std::vector<Json::Value> folders;
    if (!Matching(folders, options)) {
        return Fail("Cannot list the folders");
    }
    const bool isNoneOfShare = folders.empty() && !options.share.empty();
    if (options.isNull) {
        PrintPaths(folders);
        return isNoneOfShare ? kNotFound : kDone;
    }
    PrintFolders(folders, options.json);
    if (isNoneOfShare) {
        Say("No folder of share " + Shown(options.share) + " is indexed.");
        return kNotFound;
    }
    if (folders.empty()) {
        Say("No folder is indexed.");
        Advise("Use fileindexctl add to index one.");
    }
    return kDone;
}

} // namespace

Action DeclareList(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    app.add_option("--share", options->share, "Show only the folders of this share")
        ->type_name("SHARE");
    CLI::Option *null = app.add_flag("--null", options->isNull,
                                     "Print only the paths, each followed by a zero byte");
    AddJsonOption(app, options->json);
    null->excludes(app.get_option("--json"))->excludes(app.get_option("-j"));
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
