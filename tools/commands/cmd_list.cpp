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
out of space, or cannot be indexed (fileindexctl show tells why).

Examples:
  fileindexctl list
  fileindexctl list --share photos --json
  fileindexctl list --sort name --desc --limit 10
  fileindexctl list --null | xargs -0 fileindexctl reindex)";

constexpr unsigned long kAll = std::numeric_limits<unsigned long>::max();

struct Options {
    std::string share;
    std::string sort = "path";
    bool isDescending = false;
    unsigned long offset = 0;
    unsigned long limit = kAll;
    bool isNull = false;
    JsonMode json = JsonMode::kOff;
};

std::string CheckField(const std::string &field) {
    const bool isKnown = field == "path" || field == "name" ||
                         std::find(kFileTypes.begin(), kFileTypes.end(), field) != kFileTypes.end();
    return isKnown ? "" : "it is path, name, document, audio, video or photo, not '" + field + "'";
}

bool LiesIn(const std::string &share, const Json::Value &folder) {
    std::string name;
    return share.empty() ||
           (VANO::FILEINDEX::GetShareNameByPath(name, folder["path"].asString()) && name == share);
}

// All that match, in order. The library's own pages know no share, and its descending ones do not
// move with the offset.
bool Matching(std::vector<Json::Value> &folders, const Options &options) {
    const std::string share = options.share.empty() ? "" : NameOfShare(options.share);
    Json::Value page;
    if (!VANO::FILEINDEX::IndexMgr::List(page, 0, kAll, options.sort, "ASC",
                                         Json::Value(Json::arrayValue))) {
        return false;
    }
    std::copy_if(page["folder"].begin(), page["folder"].end(), std::back_inserter(folders),
                 [&](const Json::Value &folder) { return LiesIn(share, folder); });
    if (options.isDescending) {
        std::reverse(folders.begin(), folders.end());
    }
    return true;
}

std::vector<Json::Value> PageOf(const std::vector<Json::Value> &folders, const Options &options) {
    const std::size_t begin = std::min<std::size_t>(options.offset, folders.size());
    const std::size_t count = std::min<std::size_t>(options.limit, folders.size() - begin);
    const auto first = folders.begin() + static_cast<std::ptrdiff_t>(begin);
    return {first, first + static_cast<std::ptrdiff_t>(count)};
}

void PrintPaths(const std::vector<Json::Value> &folders) {
    for (const Json::Value &folder : folders) {
        std::cout << folder["path"].asString() << '\0';
    }
}

void PrintFolders(const std::vector<Json::Value> &folders, std::size_t total,
                  const Options &options) {
    Json::Value answer(Json::objectValue);
    answer["folder"] = Json::Value(Json::arrayValue);
    answer["offset"] = Json::UInt64{options.offset};
    answer["total"] = Json::UInt64{total};
    Table table({"PATH", "NAME", "TYPES", "STATUS"});
    table.MayCut("PATH", 20);
    table.MayCut("NAME", 10);
    for (const Json::Value &setting : folders) {
        const Json::Value folder = WithFacts(setting);
        table.Add({folder["path"].asString(), folder["name"].asString(), TypesOf(folder),
                   StatusOf(folder)});
        answer["folder"].append(folder);
    }
    if (options.json != JsonMode::kOff) {
        PrintJson(answer, options.json);
    } else if (!folders.empty()) {
        table.Print();
    }
}

ExitCode SayHowMany(std::size_t shown, std::size_t total, const Options &options) {
    if (total == 0 && !options.share.empty()) {
        Say("No folder of share " + Shown(options.share) + " is indexed.");
        return kNotFound;
    }
    if (total == 0) {
        Say("No folder is indexed.");
        Advise("fileindexctl add indexes a folder.");
    } else if (shown < total) {
        Say("Shown " + std::to_string(shown) + " of " + std::to_string(total) + ".");
    }
    return kDone;
}

ExitCode Run(const Options &options) {
    std::vector<Json::Value> folders;
    if (!Matching(folders, options)) {
        return Fail("Cannot list the folders");
    }
    const std::vector<Json::Value> page = PageOf(folders, options);
    if (options.isNull) {
        PrintPaths(page);
        return folders.empty() && !options.share.empty() ? kNotFound : kDone;
    }
    PrintFolders(page, folders.size(), options);
    return SayHowMany(page.size(), folders.size(), options);
}

} // namespace

Action DeclareList(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    app.add_option("--share", options->share, "Only the folders of this share")->type_name("SHARE");
    app.add_option("--sort", options->sort, "In which order; by path without it")
        ->check(CheckField)
        ->type_name("path|name|document|audio|video|photo");
    app.add_flag("--desc", options->isDescending, "The other way round");
    app.add_option("--offset", options->offset, "Leave out so many at the beginning")
        ->check(CLI::NonNegativeNumber)
        ->type_name("N");
    app.add_option("--limit", options->limit, "Show so many at most")
        ->check(CLI::NonNegativeNumber)
        ->type_name("N");
    CLI::Option *null =
        app.add_flag("--null", options->isNull, "Only the paths, a zero byte after each");
    AddJsonOption(app, options->json);
    null->excludes(app.get_option("--json"))->excludes(app.get_option("-j"));
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
