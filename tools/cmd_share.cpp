#include <fileindex/index_mgr.h>
#include <memory>

#include "command.h"
#include "messages.h"
#include "text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] = R"(Examples:
  fileindexctl share pause photos
  fileindexctl share rename photos pictures
  fileindexctl share resume pictures)";

// Names as they stand in paths.
std::string CheckName(const std::string &name) {
    return name.empty() || name.find('/') != std::string::npos
               ? "'" + Shown(name) + "' is no name of a share"
               : "";
}

CLI::Option *AddNameTo(CLI::App &app, const char *label, std::string &name,
                       const char *description) {
    return app.add_option(label, name, description)->required()->check(CheckName);
}

Action DeclareSharePause(CLI::App &app) {
    const auto share = std::make_shared<std::string>();
    AddNameTo(app, "SHARE", *share, "Name of the share");
    return [share] {
        if (!IndexMgr::SharePause(*share)) {
            return Fail("Cannot pause share " + Shown(*share));
        }
        Say("Share " + Shown(*share) + " is paused.");
        return kDone;
    };
}

Action DeclareShareResume(CLI::App &app) {
    const auto share = std::make_shared<std::string>();
    AddNameTo(app, "SHARE", *share, "Name of the share");
    return [share] {
        if (!IndexMgr::ShareResume(*share)) {
            return Fail("Cannot resume share " + Shown(*share));
        }
        Say("Share " + Shown(*share) + " is worked on again.");
        return kDone;
    };
}

struct Names {
    std::string old;
    std::string now;
};

Action DeclareShareRename(CLI::App &app) {
    const auto names = std::make_shared<Names>();
    AddNameTo(app, "OLD", names->old, "Name that the share had");
    AddNameTo(app, "NEW", names->now, "Name that it has now");
    return [names] {
        const std::string what = Shown(names->old) + " to " + Shown(names->now);
        if (!IndexMgr::IsShareIndexed(names->old)) {
            Say("Nothing is done: no folder of share " + Shown(names->old) + " is indexed.");
            return kNotFound;
        }
        if (!IndexMgr::ShareRename(names->old, names->now)) {
            return Fail("Cannot move the folders of " + what);
        }
        Say("Moved the folders of " + what + ".");
        return kDone;
    };
}

const std::vector<Command> kShareCommands = {
    {"rename", "Move the folders of a share to its new name", DeclareShareRename},
    {"pause", "Stop the work on one share", DeclareSharePause},
    {"resume", "Go on with the work on one share", DeclareShareResume},
};

} // namespace

Action DeclareShare(CLI::App &app) {
    app.footer(kFooter);
    return DeclareCommands(app, kShareCommands);
}

} // namespace CTL
