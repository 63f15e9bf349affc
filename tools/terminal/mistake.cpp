#include "terminal/mistake.h"

#include <algorithm>

#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

std::size_t Distance(const std::string &a, const std::string &b) {
    // steps[i][j] leads from the first i letters of a to the first j of b.
    std::vector<std::vector<std::size_t>> steps(a.size() + 1,
                                                std::vector<std::size_t>(b.size() + 1));
    for (std::size_t i = 0; i <= a.size(); ++i) {
        for (std::size_t j = 0; j <= b.size(); ++j) {
            if (i == 0 || j == 0) {
                steps[i][j] = i + j;
                continue;
            }
            const std::size_t change = a[i - 1] == b[j - 1] ? 0 : 1;
            steps[i][j] =
                std::min({steps[i - 1][j] + 1, steps[i][j - 1] + 1, steps[i - 1][j - 1] + change});
            if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1]) {
                steps[i][j] = std::min(steps[i][j], steps[i - 2][j - 2] + 1);
            }
        }
    }
    return steps[a.size()][b.size()];
}

// The one of the words that was meant by one that is cut short or mistyped; empty when none is
// near. A letter that is missing, surplus, wrong, or has changed places with its neighbour is one
// step.
std::string Nearest(const std::string &typed, const std::vector<std::string> &words) {
    constexpr std::size_t kLongest = 32; // nobody mistypes more than that into a command
    if (typed.size() > kLongest) {
        return {};
    }
    std::string nearest;
    std::size_t least =
        std::max<std::size_t>(2, typed.size() / 3 + 1); // further away it is another word
    for (const std::string &word : words) {
        if (typed.size() > 1 && word.compare(0, typed.size(), typed) == 0) {
            return word;
        }
        const std::size_t distance = Distance(typed, word);
        if (distance < least) {
            least = distance;
            nearest = word;
        }
    }
    return nearest;
}

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
        Say("Unexpected argument '" + Shown(word) + "'.");
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
