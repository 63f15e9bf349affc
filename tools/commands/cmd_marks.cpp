#include <fileindex/status_mgr.h>
#include <memory>

#include "commands/change.h"
#include "commands/command.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/output.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::StatusMgr;

constexpr char kFooter[] =
    R"(Upgrade steps that must run only once set a mark when they are done.

Examples:
  fileindexctl marks list --json
  fileindexctl marks set reindexed-for-2.0 --dry-run
  fileindexctl marks set reindexed-for-2.0)";

// The other members of the file that keeps the marks.
bool IsReserved(const std::string &name) {
    return name == "resume_time" || name == "no_space" || name == "need_reindex";
}

std::string CheckName(const std::string &name) {
    return name.empty() || IsReserved(name)
               ? "'" + name + "' cannot be a mark: the status file has it for something else"
               : "";
}

ExitCode RunList(JsonMode json) {
    Json::Value status;
    if (!LoadStatus(status)) {
        return Fail("Cannot list the marks");
    }
    Json::Value answer(Json::objectValue);
    answer["mark"] = Json::Value(Json::arrayValue);
    Table table({"MARK", "STATE"});
    for (const std::string &name : status.getMemberNames()) {
        if (IsReserved(name)) {
            continue;
        }
        // What is neither true nor false was not set as a mark, and the library throws for it.
        const Json::Value &value = status[name];
        const bool isDone = (value.isBool() || value.isNumeric()) && StatusMgr::IsUpdated(name);
        Json::Value mark(Json::objectValue);
        mark["name"] = name;
        mark["done"] = isDone;
        answer["mark"].append(mark);
        table.Add({name, isDone ? "done" : "not done"});
    }
    if (json != JsonMode::kOff) {
        PrintJson(answer, json);
    } else if (!answer["mark"].empty()) {
        table.Print();
    }
    if (answer["mark"].empty()) {
        Say("No mark is set.");
    }
    return kDone;
}

Action DeclareList(CLI::App &app) {
    const auto json = std::make_shared<JsonMode>(JsonMode::kOff);
    AddJsonOption(app, *json);
    app.footer(kFooter);
    return [json] { return RunList(*json); };
}

struct SetOptions {
    std::string name;
    Change change;
};

ExitCode RunSet(SetOptions &options) {
    options.change.facts["marks"].append(options.name);
    if (options.change.isDryRun) {
        options.change.Would("mark " + Shown(options.name) + " as done");
        return kDone;
    }
    if (!StatusMgr::SetUpdated(options.name)) {
        return Fail("Cannot mark " + Shown(options.name) + " as done");
    }
    Say("Marked " + Shown(options.name) + " as done.");
    return kDone;
}

Action DeclareSetMark(CLI::App &app) {
    const auto options = std::make_shared<SetOptions>();
    app.add_option("MARK", options->name, "Name of the step")->required()->check(CheckName);
    app.footer(kFooter);
    return MakeChange(app, options->change, [options] { return RunSet(*options); });
}

const std::vector<Command> kMarksCommands = {
    {"list", "Show the marks", DeclareList},
    {"set", "Mark a step as done", DeclareSetMark},
};

} // namespace

Action DeclareMarks(CLI::App &app) {
    app.footer(kFooter);
    return DeclareCommands(app, kMarksCommands);
}

} // namespace CTL
