#ifndef FILEINDEXCTL_TERMINAL_HELP_H
#define FILEINDEXCTL_TERMINAL_HELP_H

#include <CLI/CLI.hpp>
#include <string>

namespace CTL {

// The help texts: 80 columns wide, and no more about an option than its user needs.
class HelpFormatter : public CLI::Formatter {
  public:
    HelpFormatter();

    std::string make_subcommand(const CLI::App *sub) const override;
    std::string make_option(const CLI::Option *option, bool isPositional) const override;
};

} // namespace CTL

#endif
