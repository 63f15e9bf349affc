#include "mistake.h"

#include "messages.h"
#include "suggest.h"
#include "text.h"

namespace CTL {

namespace {

// The subcommand whose arguments were being read.
const CLI::App &Innermost(const CLI::App &app) {
    const auto chosen = app.get_subcommands();
    return chosen.empty() ? app : Innermost(*chosen.front());
}

std::string FullNameOf(const CLI::App &app) {
    const CLI::App *parent = app.get_parent();
    return parent == nullptr ? app.get_name() : FullNameOf(*parent) + " " + app.get_name();
}

bool IsOption(const std::string &word) {
    return word.size() > 1 && word[0] == '-';
}

std::vector<std::string> CommandsOf(const CLI::App &app) {
    std::vector<std::string> names;
    for (const CLI::App *command : app.get_subcommands([](const CLI::App *) { return true; })) {
        names.push_back(command->get_name());
    }
    return names;
}

std::vector<std::string> OptionsOf(const CLI::App &app) {
    std::vector<std::string> names;
    for (const CLI::Option *option : app.get_options()) {
        for (const std::string &name : option->get_lnames()) {
            names.push_back("--" + name);
        }
    }
    return names;
}

void Suggest(const std::string &typed, const std::vector<std::string> &names) {
    const std::string nearest = Nearest(typed.substr(0, typed.find('=')), names);
    if (!nearest.empty()) {
        Advise("Did you mean '" + nearest + "'?");
    }
}

void SayUnexpected(const CLI::App &app, const std::string &word) {
    const std::vector<std::string> commands = CommandsOf(app);
    if (IsOption(word)) {
        Say("There is no option '" + Shown(word) + "'.");
        Suggest(word, OptionsOf(app));
    } else if (!commands.empty()) {
        Say("There is no command '" + Shown(word) + "'.");
        Suggest(word, commands);
    } else {
        Say("Surplus argument '" + Shown(word) + "'.");
    }
}

} // namespace

bool IsCommandUnknown(const CLI::App &app) {
    const CLI::App &innermost = Innermost(app);
    const auto unexpected = innermost.remaining();
    return !unexpected.empty() && !IsOption(unexpected.front()) && !CommandsOf(innermost).empty();
}

ExitCode SayMistake(const CLI::App &app, const CLI::ParseError &mistake) {
    const CLI::App &innermost = Innermost(app);
    // What nobody took explains best what is missing.
    const auto unexpected = innermost.remaining();
    if (unexpected.empty()) {
        Say(Shown(mistake.what()) + (std::string(mistake.what()).back() == '.' ? "" : "."));
    } else {
        SayUnexpected(innermost, unexpected.front());
    }
    Advise("See " + FullNameOf(innermost) + " --help.");
    return kUsage;
}

} // namespace CTL
