// remove, rename: what moves the folder settings of a share.

#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <memory>

#include "commands/change.h"
#include "commands/share_commands.h"
#include "state/asked_path.h"
#include "state/folder_view.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kRemoveFooter[] =
    R"(For a share that is being removed. The daemon is not told and the index stays:
run fileindexctl share pause and clean first, while the share still exists.

Examples:
  fileindexctl share remove photos --dry-run
  fileindexctl share remove photos)";

constexpr char kRenameFooter[] =
    R"(For a share that has been renamed: the system must already know its new name.
Only the settings move: run fileindexctl share pause before and resume after.

Examples:
  fileindexctl share pause photos
  fileindexctl share rename photos pictures
  fileindexctl share resume pictures)";

struct RemoveOptions {
    std::string share;
    Change change;
};

struct RenameOptions {
    std::string old;
    std::string now;
    Change change;
};

ExitCode SayNoFolders(const std::string &share) {
    Say("Nothing was done: no folder of share " + Shown(share) + " is indexed.");
    Advise("fileindexctl share list shows the shares.");
    return kNotFound;
}

ExitCode RunRemove(RemoveOptions &options) {
    MarkedShare share;
    const std::string failure = "Cannot remove the folders of share " + Shown(options.share);
    if (!LookUpShare(share, options.share)) {
        return Fail(failure);
    }
    if (share.folders.empty()) {
        return SayNoFolders(share.name);
    }
    options.change.facts["shares"].append(share.name);
    options.change.facts["paths"] = ArrayOf(PathsOf(share.folders));
    if (options.change.isDryRun) {
        for (const Folder &folder : share.folders) {
            options.change.Would("remove " + Shown(folder.path));
        }
        return kDone;
    }
    if (!While("Removing", [&] { return IndexMgr::ShareRemove(share.name); })) {
        return Fail(failure);
    }
    Say("Removed " + Count(share.folders.size(), "folder") + " of share " + Shown(share.name) +
        ".");
    if (!share.directory.empty()) {
        Advise("Its index still exists; fileindexctl share clean deletes it.");
    }
    return kDone;
}

ExitCode RunRename(RenameOptions &options) {
    MarkedShare share;
    const std::string own = OwnNameOf(options.now);
    const std::string now = own.empty() ? options.now : own;
    const std::string what = Shown(options.old) + " to " + Shown(now);
    if (!LookUpShare(share, options.old)) {
        return Fail("Cannot move the folders of " + what);
    }
    if (share.folders.empty()) {
        return SayNoFolders(share.name);
    }
    options.change.facts["shares"].append(share.name);
    options.change.facts["shares"].append(now);
    options.change.facts["paths"] = ArrayOf(PathsOf(share.folders));
    if (own.empty()) {
        // To the library a new name that is no share's is a bad parameter; this names the reason.
        std::string fullPath;
        (void)VANO::FILEINDEX::GetFullPath(fullPath, "/" + now);
        return Fail("Cannot move the folders of " + what);
    }
    if (options.change.isDryRun) {
        for (const Folder &folder : share.folders) {
            options.change.Would("move " + Shown(folder.path) + " to " +
                                 Shown(VANO::FILEINDEX::ReplaceShareName(folder.path, now)));
        }
        return kDone;
    }
    if (!IndexMgr::ShareRename(share.name, now)) {
        return Fail("Cannot move the folders of " + what);
    }
    Say("Moved the folders of " + what + ".");
    Advise("Run fileindexctl share resume next.");
    return kDone;
}

} // namespace

Action DeclareShareRemove(CLI::App &app) {
    const auto options = std::make_shared<RemoveOptions>();
    AddShareTo(app, "SHARE", options->share, "Name of the share");
    app.footer(kRemoveFooter);
    return MakeChange(app, options->change, [options] { return RunRemove(*options); });
}

Action DeclareShareRename(CLI::App &app) {
    const auto options = std::make_shared<RenameOptions>();
    AddShareTo(app, "OLD", options->old, "Former name of the share");
    AddShareTo(app, "NEW", options->now, "New name of the share");
    app.footer(kRenameFooter);
    return MakeChange(app, options->change, [options] { return RunRename(*options); });
}

} // namespace CTL
