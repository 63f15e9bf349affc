#include <algorithm>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <memory>
#include <set>

#include "commands/change.h"
#include "commands/command.h"
#include "state/asked_path.h"
#include "state/folder_view.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;

constexpr char kFooter[] =
    R"(The files stay. A share that has no indexed folder left loses its index. If one
of the folders is not indexed, nothing is removed and the exit status is 3.

Examples:
  fileindexctl remove /photos
  fileindexctl remove /volume2/media/a /media/b --dry-run)";

struct Options {
    std::vector<std::string> paths;
    Change change;
};

std::string ShareOf(const std::string &path) {
    std::string share;
    (void)VANO::FILEINDEX::GetShareNameByPath(share, path); // no path is empty
    return share;
}

std::set<std::string> SharesOf(const std::vector<std::string> &paths) {
    std::set<std::string> shares;
    for (const std::string &path : paths) {
        shares.insert(ShareOf(path));
    }
    return shares;
}

std::vector<std::string> Left(const std::vector<Folder> &folders,
                              const std::vector<std::string> &paths) {
    std::vector<std::string> left;
    for (const Folder &folder : folders) {
        if (std::find(paths.begin(), paths.end(), folder.path) == paths.end()) {
            left.push_back(folder.path);
        }
    }
    return left;
}

// The shares that lose their index; one that is gone has none.
std::vector<std::string> SharesToClean(const std::vector<std::string> &paths,
                                       const std::vector<std::string> &left) {
    const std::set<std::string> kept = SharesOf(left);
    std::vector<std::string> shares;
    for (const std::string &share : SharesOf(paths)) {
        if (kept.count(share) == 0 && !DirectoryOfShare(share).empty()) {
            shares.push_back(share);
        }
    }
    return shares;
}

// Drops the settings of shares that are gone. The library does that too, and then fails for their
// index, which nobody can delete.
bool RemoveGone(const std::vector<std::string> &paths) {
    if (paths.empty() || IndexMgr::Delete(ArrayOf(paths))) {
        return true;
    }
    std::vector<Folder> folders;
    if (IsUnsaved() || !IndexMgr::List(folders) || NotSet(paths, folders).size() < paths.size()) {
        return false;
    }
    ForgetErrors();
    return true;
}

ExitCode Remove(const std::vector<std::string> &paths) {
    std::vector<std::string> present;
    std::vector<std::string> gone;
    for (const std::string &path : paths) {
        (DirectoryOfShare(ShareOf(path)).empty() ? gone : present).push_back(path);
    }
    const bool isDone = While("Telling the indexing service", [&] {
        return RemoveGone(gone) && (present.empty() || IndexMgr::Delete(ArrayOf(present)));
    });
    if (!isDone) {
        std::vector<Folder> folders;
        if (IsUnsaved() || !IndexMgr::List(folders) ||
            NotSet(paths, folders).size() < paths.size()) {
            return Fail("Cannot remove " + Named(paths));
        }
        return FailHalfWay("The setting is removed", "fileindexctl doctor shows what is wrong.");
    }
    Say("Removed " + Named(paths) + ".");
    if (!gone.empty()) {
        Advise("There was no index to delete for " + Named(gone) + ": no share has that name.");
    }
    return kDone;
}

// Whether a folder is set under another spelling of its share's name than the share's own.
bool IsMisspelt(const std::string &asked, const std::vector<Folder> &folders) {
    const std::string own = OwnNameOf(ShareOf(asked));
    return !own.empty() && own != ShareOf(asked) && IsSet(asked, folders);
}

// The library would take the share for one without folders, and delete the index of the others.
ExitCode SayMisspelt(const std::string &asked) {
    const std::string share = ShareOf(asked);
    const std::string own = OwnNameOf(share);
    Say("Nothing was removed: " + Shown(asked) + " is set under another spelling of share " +
        Shown(own) + ", which would lose its index.");
    Advise("fileindexctl share rename " + Shown(share) + " " + Shown(own) +
           " corrects that; then remove it.");
    return kFailed;
}

ExitCode Run(Options &options) {
    const std::vector<std::string> paths = ToSharePaths(options.paths);
    options.change.facts["paths"] = ArrayOf(paths);
    std::vector<Folder> folders;
    if (!IndexMgr::List(folders)) {
        return Fail("Cannot remove " + Named(paths));
    }
    const auto misspelt =
        std::find_if(options.paths.begin(), options.paths.end(),
                     [&](const std::string &asked) { return IsMisspelt(asked, folders); });
    if (misspelt != options.paths.end()) {
        return SayMisspelt(*misspelt);
    }
    // The library takes a folder that is not set for removed.
    const std::vector<std::string> missing = NotSet(paths, folders);
    if (!missing.empty()) {
        Say("Nothing was removed: " + NamedNotSet(missing) + ".");
        Advise("fileindexctl list shows the indexed folders.");
        return kNotFound;
    }
    const std::vector<std::string> left = Left(folders, paths);
    const std::vector<std::string> cleaned = SharesToClean(paths, left);
    options.change.facts["shares"] = ArrayOf(cleaned);
    if (!options.change.isDryRun) {
        return Remove(paths);
    }
    for (const std::string &path : paths) {
        options.change.Would("remove " + Shown(path));
    }
    for (const std::string &share : cleaned) {
        options.change.Would("delete the index of share " + Shown(share));
    }
    if (left.empty()) {
        options.change.Would("stop fileindexd and switch Spotlight off: no folder would be left");
    }
    return kDone;
}

} // namespace

Action DeclareRemove(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    AddPathsTo(app, options->paths, "Folders, by share path or full path")->check(CheckSharePath);
    app.footer(kFooter);
    return MakeChange(app, options->change, [options] { return Run(*options); });
}

} // namespace CTL
