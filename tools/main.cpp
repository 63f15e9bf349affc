#include <csignal>
#include <exception>
#include <fcntl.h>
#include <iostream>
#include <json/value.h>
#include <memory>
#include <unistd.h>

#include "commands/command.h"
#include "terminal/help.h"
#include "terminal/messages.h"
#include "terminal/mistake.h"
#include "terminal/text.h"

namespace {

const std::vector<CTL::Command> kCommands = {
    {"list", "Show the indexed folders", CTL::DeclareList},
    {"show", "Show one indexed folder", CTL::DeclareShow},
    {"add", "Index folders, or more of their file types", CTL::DeclareAdd},
    {"set", "Change the file types or the name of folders", CTL::DeclareSet},
    {"remove", "Stop indexing folders", CTL::DeclareRemove},
    {"reindex", "Index folders again from scratch", CTL::DeclareReindex},
    {"status", "Show daemon and indexing status", CTL::DeclareStatus},
    {"watch", "Show the progress of indexing live", CTL::DeclareWatch},
    {"pause", "Pause all indexing", CTL::DeclarePause},
    {"resume", "Resume indexing", CTL::DeclareResume},
    {"query", "Tell whether paths are indexed, and why", CTL::DeclareQuery},
    {"share", "Adapt the index to changes of shares", CTL::DeclareShare},
    {"marks", "List or set the marks of finished upgrade steps", CTL::DeclareMarks},
    {"migrate", "Finish an upgrade from the previous release", CTL::DeclareMigrate},
    {"doctor", "Find what is wrong and how to fix it", CTL::DeclareDoctor},
};

constexpr char kFooter[] =
    R"(A path is a share path, /SHARE or /SHARE/FOLDER, or a full path in the file
system. It is taken as a share path if its first component names a share, else
as a full path if it lies in a share, else as a share path whose share is gone.

Exit status: 0 done; 1 failed; 2 usage error; 3 not indexed, not marked, or not
found. For status: 0 running; 3 paused or not running; 4 unknown, or no such
folder.

Examples:
  fileindexctl add /photos --photo --video
  fileindexctl list
  fileindexctl COMMAND --help)";

int Run(int argc, char **argv) {
    CLI::App app("Manages the folders that the file-indexing service indexes.", "fileindexctl");
    app.footer(kFooter);
    app.formatter(std::make_shared<CTL::HelpFormatter>());
    app.set_help_flag("-h,--help", "Show this text");
    app.set_version_flag("--version", "fileindexctl " FILEINDEX_VERSION, "Show the version");
    const CTL::Action action = CTL::DeclareCommands(app, kCommands);
    try {
        app.parse(argc, argv);
    } catch (const CLI::Success &help) {
        return CTL::IsCommandUnknown(app) ? CTL::SayMistake(app, help) : app.exit(help);
    } catch (const CLI::ParseError &mistake) {
        return CTL::SayMistake(app, mistake);
    }
    return action();
}

// What was printed has not been written before.
int Written(int result) {
    if (!std::cout.flush()) {
        CTL::Say("Cannot write the output.");
        return CTL::kFailed;
    }
    return result;
}

// A file that is opened would take the place of a standard stream that is closed, and what is
// printed would go into it. Nothing can be written to this one.
void FillStandardStreams() {
    for (int fd = STDIN_FILENO; fd <= STDERR_FILENO; ++fd) {
        if (::fcntl(fd, F_GETFD) == -1) {
            (void)::open("/dev/null", O_RDONLY); // takes the lowest number that is free
        }
    }
}

} // namespace

int main(int argc, char **argv) {
    FillStandardStreams();
    (void)std::signal(SIGPIPE, SIG_IGN); // so that a reader who went away is a failed write
    try {
        return Written(Run(argc, argv));
    } catch (const Json::Exception &failure) {
        CTL::Say("A settings file holds a value of the wrong type: " + CTL::Shown(failure.what()));
        CTL::Advise("fileindexctl doctor settings shows where.");
    } catch (const std::exception &failure) {
        CTL::Say(CTL::Shown(failure.what()));
    }
    return CTL::kFailed;
}
