#include "commands/command.h"

namespace CTL {

Action DeclareCommands(CLI::App &app, const std::vector<Command> &table) {
    // require_subcommand(1) would complain of a missing command where one is misspelt.
    app.require_subcommand(0, 1);
    app.callback([&app] {
        if (app.get_subcommands().empty()) {
            throw CLI::RequiredError("A subcommand is required", CLI::ExitCodes::RequiredError);
        }
    });
    std::vector<std::pair<CLI::App *, Action>> actions;
    for (const Command &command : table) {
        CLI::App *subcommand = app.add_subcommand(command.name, command.summary);
        subcommand->group("Commands");
        actions.emplace_back(subcommand, command.declare(*subcommand));
    }
    return [actions]() -> ExitCode {
        for (const auto &[subcommand, action] : actions) {
            if (subcommand->parsed()) {
                return action();
            }
        }
        return kUsage; // nobody gets here: one has been chosen
    };
}

} // namespace CTL
