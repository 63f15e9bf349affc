#include <csignal>
#include <exception>
#include <iostream>
#include <memory>

#include "command.h"
#include "help.h"
#include "messages.h"

namespace {

const std::vector<CTL::Command> kCommands = {
    {"add", "Index folders, or index more of them", CTL::DeclareAdd},
    {"list", "Show the indexed folders", CTL::DeclareList},
    {"show", "Show one indexed folder", CTL::DeclareShow},
    {"remove", "Stop indexing folders", CTL::DeclareRemove},
    {"reindex", "Index folders again from the start", CTL::DeclareReindex},
    {"pause", "Pause all indexing", CTL::DeclarePause},
    {"resume", "Go on with indexing", CTL::DeclareResume},
    {"query", "Tell whether paths are indexed", CTL::DeclareQuery},
    {"share", "Follow what happens to a share", CTL::DeclareShare},
};

constexpr char kFooter[] = R"(Paths are share paths: /SHARE or /SHARE/FOLDER.

Exit status: 0 done, 1 failed, 2 mistake in the call, 3 not indexed or no such
folder.

Examples:
  fileindexctl add /photos --photo --video
  fileindexctl list
  fileindexctl COMMAND --help)";

// The subcommand whose arguments were being read.
std::string NameOf(const CLI::App &app) {
    const auto chosen = app.get_subcommands();
    return chosen.empty() ? app.get_name() : app.get_name() + " " + NameOf(*chosen.front());
}

int Run(int argc, char **argv) {
    CLI::App app("Manages the folders that the file-indexing service indexes.", "fileindexctl");
    app.footer(kFooter);
    app.formatter(std::make_shared<CTL::HelpFormatter>());
    const CTL::Action action = CTL::DeclareCommands(app, kCommands);
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success &help) {
        return app.exit(help);
    } catch (const CLI::ParseError &mistake) {
        CTL::Say(mistake.what());
        CTL::Advise("See " + NameOf(app) + " --help.");
        return CTL::kUsage;
    }
    const CTL::ExitCode result = action();
    if (!std::cout.flush()) {
        CTL::Say("Cannot write the output.");
        return CTL::kFailed;
    }
    return result;
}

} // namespace

int main(int argc, char **argv) {
    (void)std::signal(SIGPIPE, SIG_IGN); // so that a reader who went away is a failed write
    try {
        return Run(argc, argv);
    } catch (const std::exception &failure) {
        CTL::Say(failure.what());
        return CTL::kFailed;
    }
}
