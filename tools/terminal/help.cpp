#include "terminal/help.h"

#include "terminal/text.h"

namespace CTL {

namespace {

constexpr std::size_t kNameColumns = 28;
constexpr std::size_t kColumns = 80;

// "--json{short}" is how CLI11 writes a flag that takes a value too.
std::string NameOf(const CLI::Option &option, bool isPositional) {
    std::string name = option.get_name(isPositional, !isPositional);
    const std::size_t brace = name.find('{');
    if (brace != std::string::npos) {
        return name.substr(0, brace) + "[=" + option.get_type_name() + "]";
    }
    if (!isPositional && option.get_type_size() != 0) {
        name += " " + option.get_type_name();
    }
    return option.get_expected_max() > 1 ? name + "..." : name;
}

// A name and what it means beside it, or on the next line where the name is long.
std::string Entry(const std::string &name, const std::string &description) {
    std::string entry = "  " + name;
    std::size_t column = entry.size();
    if (column + 2 > kNameColumns) {
        entry += "\n";
        column = 0;
    }
    // The blanks at its beginning stand for the name.
    const std::string text =
        Wrapped(std::string(kNameColumns, ' ') + description, kColumns, kNameColumns);
    return entry + text.substr(column) + "\n";
}

} // namespace

HelpFormatter::HelpFormatter() {
    label("OPTIONS", "OPTION...");
    label("SUBCOMMAND", "COMMAND");
    label("Positionals", "Arguments");
}

std::string HelpFormatter::make_subcommand(const CLI::App *sub) const {
    return Entry(sub->get_name(), sub->get_description());
}

std::string HelpFormatter::make_option(const CLI::Option *option, bool isPositional) const {
    return Entry(NameOf(*option, isPositional), option->get_description());
}

} // namespace CTL
