#include "commands/change.h"

#include <iostream>
#include <utility>

namespace CTL {

namespace {

// "share rename" of the tool's command.
std::string NameOf(const CLI::App &app) {
    const CLI::App *parent = app.get_parent();
    const bool isTop = parent->get_parent() == nullptr;
    return (isTop ? "" : NameOf(*parent) + " ") + app.get_name();
}

} // namespace

void Change::Would(const std::string &what) const {
    if (json == JsonMode::kOff) {
        std::cout << "Would " << what << ".\n";
    }
}

Action MakeChange(CLI::App &app, Change &change, Action act) {
    app.add_flag("--dry-run", change.isDryRun, "Only show what would be done");
    AddJsonOption(app, change.json);
    return [name = NameOf(app), &change, act = std::move(act)] {
        const ExitCode result = act();
        Json::Value answer = change.facts;
        answer["command"] = name;
        answer["done"] = result == kDone && !change.isDryRun;
        answer["dry_run"] = change.isDryRun;
        PrintJson(answer, change.json);
        return result;
    };
}

} // namespace CTL
