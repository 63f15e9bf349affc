#include <iostream>
#include <memory>

#include "commands/share_commands.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/output.h"

namespace CTL {

namespace {

constexpr char kFooter[] =
    R"(Shows all shares of the system, and shares that are gone but still have folders
or marks. The columns are share, directory, indexed folders and state.

Examples:
  fileindexctl share list
  fileindexctl share list --json=pretty
  fileindexctl share list --null | xargs -0 fileindexctl query --share)";

struct Options {
    bool isNull = false;
    JsonMode json = JsonMode::kOff;
};

std::string StateText(const MarkedShare &share) {
    std::string text = share.directory.empty() ? "no such share" : "";
    if (share.isOutOfSpace) {
        text += (text.empty() ? "" : ", ") + std::string("out of space");
    }
    if (share.needsReindex) {
        text += (text.empty() ? "" : ", ") + std::string("needs reindexing");
    }
    return text;
}

Json::Value AsJson(const MarkedShare &share) {
    Json::Value value(Json::objectValue);
    value["name"] = share.name;
    value["directory"] = share.directory;
    value["folders"] = Json::UInt64{share.folders.size()};
    value["no_space"] = share.isOutOfSpace;
    value["need_reindex"] = share.needsReindex;
    return value;
}

void PrintNames(const std::vector<MarkedShare> &shares) {
    for (const MarkedShare &share : shares) {
        std::cout << share.name << '\0';
    }
}

void PrintShares(const std::vector<MarkedShare> &shares, JsonMode json) {
    Json::Value answer(Json::objectValue);
    answer["share"] = Json::Value(Json::arrayValue);
    Table table({"SHARE", "DIRECTORY", "FOLDERS", "STATE"});
    table.MayCut("SHARE", 12);
    table.MayCut("DIRECTORY", 20);
    for (const MarkedShare &share : shares) {
        table.Add(
            {share.name, share.directory, std::to_string(share.folders.size()), StateText(share)});
        answer["share"].append(AsJson(share));
    }
    if (json != JsonMode::kOff) {
        PrintJson(answer, json);
    } else if (!shares.empty()) {
        table.Print();
    }
}

ExitCode Run(const Options &options) {
    std::vector<MarkedShare> shares;
    if (!ListShares(shares)) {
        return Fail("Cannot list the shares");
    }
    if (options.isNull) {
        PrintNames(shares);
        return kDone;
    }
    PrintShares(shares, options.json);
    if (shares.empty()) {
        Say("There are no shares.");
    }
    return kDone;
}

} // namespace

Action DeclareShareList(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    CLI::Option *null = app.add_flag("--null", options->isNull,
                                     "Print only the names, each followed by a zero byte");
    AddJsonOption(app, options->json);
    null->excludes(app.get_option("--json"))->excludes(app.get_option("-j"));
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
