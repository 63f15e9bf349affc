// no-space, need-reindex: the marks of shares in the status file.

#include <fileindex/status_mgr.h>
#include <iostream>
#include <memory>

#include "commands/change.h"
#include "commands/share_commands.h"
#include "state/known_shares.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::StatusMgr;

constexpr char kNoSpaceFooter[] =
    R"(Without an option, tells whether the share is marked: exit status 0 if it is, 3
if not. --set notifies the administrators unless the share was already marked.

Examples:
  fileindexctl share no-space photos
  fileindexctl share no-space photos --revive)";

constexpr char kNeedReindexFooter[] =
    R"(Without an option, tells whether the share is marked: exit status 0 if it is, 3
if not.

Examples:
  fileindexctl share need-reindex photos --json
  fileindexctl share need-reindex photos --set)";

// A mark that a share can have, and what is said about it.
struct Mark {
    const char *key;
    const char *yes; // "is out of space"
    const char *no;
    bool (*has)(const std::string &share);
    bool (*change)(const std::string &share, bool isSet);
};

constexpr Mark kNoSpace = {"no_space", "is marked as out of space", "is not marked as out of space",
                           StatusMgr::ShareIsNoSpace, StatusMgr::ShareSetNoSpace};
constexpr Mark kNeedReindex = {"need_reindex", "is marked as needing reindexing",
                               "is not marked as needing reindexing", StatusMgr::ShareIsNeedReindex,
                               StatusMgr::ShareSetNeedReindex};

struct Options {
    std::string share;
    bool set = false;
    bool clear = false;
    bool revive = false;
    Change change;

    [[nodiscard]] bool IsChange() const { return set || clear || revive; }
};

// The share that is meant. Marks of shares that are gone can be told and cleared.
ExitCode Find(std::string &name, const Options &options, const Mark &mark) {
    MarkedShare share;
    if (!LookUpShare(share, options.share)) {
        return Fail("Cannot look up share " + Shown(options.share));
    }
    name = share.name;
    return share.directory.empty() && !mark.has(name) ? SayNoShare(name) : kDone;
}

ExitCode Tell(const Options &options, const Mark &mark) {
    std::string share;
    if (const ExitCode found = Find(share, options, mark); found != kDone) {
        return found;
    }
    const bool hasMark = mark.has(share);
    if (options.change.json != JsonMode::kOff) {
        Json::Value answer(Json::objectValue);
        answer["name"] = share;
        answer[mark.key] = hasMark;
        PrintJson(answer, options.change.json);
    } else {
        std::cout << "Share " << Shown(share) << ' ' << (hasMark ? mark.yes : mark.no) << ".\n";
    }
    return hasMark ? kDone : kNotFound;
}

ExitCode ChangeMark(Options &options, const Mark &mark) {
    std::string share;
    if (const ExitCode found = Find(share, options, mark); found != kDone) {
        return found;
    }
    options.change.facts["shares"].append(share);
    const std::string sentence = "hare " + Shown(share) + " " + (options.set ? mark.yes : mark.no);
    if (options.change.isDryRun) {
        options.change.Would("ensure that s" + sentence);
        return kDone;
    }
    const bool isDone = While("Telling the indexing service", [&] {
        return options.revive ? StatusMgr::ShareRevive(share) : mark.change(share, options.set);
    });
    if (isDone) {
        Say("S" + sentence + (options.revive ? ", and is indexed again." : "."));
        return kDone;
    }
    return options.revive && !IsUnsaved() ? FailHalfWay("The mark is cleared", kDaemonAdvice)
                                          : Fail("Cannot change the mark of share " + Shown(share));
}

// `options` have been added to `app`, but for those of a change.
Action TellOrChange(CLI::App &app, const std::shared_ptr<Options> &options, const Mark &mark) {
    const Action change =
        MakeChange(app, options->change, [options, &mark] { return ChangeMark(*options, mark); });
    return
        [options, &mark, change] { return options->IsChange() ? change() : Tell(*options, mark); };
}

std::shared_ptr<Options> AddMarkOptionsTo(CLI::App &app) {
    auto options = std::make_shared<Options>();
    AddShareTo(app, "SHARE", options->share, "Name of the share");
    CLI::Option *set = app.add_flag("--set", options->set, "Set the mark");
    app.add_flag("--clear", options->clear, "Clear the mark")->excludes(set);
    return options;
}

} // namespace

Action DeclareShareNoSpace(CLI::App &app) {
    const auto options = AddMarkOptionsTo(app);
    app.add_flag("--revive", options->revive,
                 "Clear the mark and have the daemon index the share again")
        ->excludes(app.get_option("--set"))
        ->excludes(app.get_option("--clear"));
    app.footer(kNoSpaceFooter);
    return TellOrChange(app, options, kNoSpace);
}

Action DeclareShareNeedReindex(CLI::App &app) {
    const auto options = AddMarkOptionsTo(app);
    app.footer(kNeedReindexFooter);
    return TellOrChange(app, options, kNeedReindex);
}

} // namespace CTL
