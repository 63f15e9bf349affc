#include "commands/share_commands.h"

#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

constexpr char kFooter[] = R"(Examples:
  fileindexctl share list
  fileindexctl share pause photos
  fileindexctl share rename photos pictures
  fileindexctl share resume pictures)";

std::string CheckName(const std::string &name) {
    return name.empty() || name.find('/') != std::string::npos
               ? "'" + name + "' is not a share name"
               : "";
}

const std::vector<Command> kShareCommands = {
    {"list", "Show the shares, their folders and marks", DeclareShareList},
    {"pause", "Stop indexing a share", DeclareSharePause},
    {"resume", "Resume indexing a share", DeclareShareResume},
    {"remove", "Remove the folders of a share that is being removed", DeclareShareRemove},
    {"rename", "Move the folders of a share to its new name", DeclareShareRename},
    {"clean", "Delete the index of a share", DeclareShareClean},
    {"no-space", "Show or change the out-of-space mark of a share", DeclareShareNoSpace},
    {"need-reindex", "Show or change the needs-reindexing mark of a share",
     DeclareShareNeedReindex},
};

} // namespace

void AddShareTo(CLI::App &app, const char *label, std::string &share, const char *description) {
    app.add_option(label, share, description)->required()->check(CheckName);
}

ExitCode SayNoShare(const std::string &share) {
    Say("No share has the name " + Shown(share) + ".");
    Advise("fileindexctl share list shows the shares.");
    return kNotFound;
}

Action DeclareShare(CLI::App &app) {
    app.footer(kFooter);
    return DeclareCommands(app, kShareCommands);
}

} // namespace CTL
