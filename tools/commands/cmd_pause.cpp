#include <fileindex/daemon_socket.h>
#include <fileindex/status.h>
#include <limits>
#include <memory>

#include "commands/change.h"
#include "commands/command.h"
#include "config/settings_lock.h"
#include "core/progress_words.h"
#include "terminal/messages.h"
#include "terminal/times.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::kPausedWithoutEnd;
using VANO::FILEINDEX::Status;

constexpr char kFooter[] =
    R"(Without a time, indexing stays paused until fileindexctl resume. 07:30 is the
next time that the clock shows it.

Examples:
  fileindexctl pause
  fileindexctl pause --for 8h
  fileindexctl pause --for 1d12h --dry-run
  fileindexctl pause --until 07:30
  fileindexctl pause --until "2026-12-24 18:00")";

// The service keeps the end of a pause in 32 bits.
constexpr long long kLatestEnd = std::numeric_limits<std::int32_t>::max();

struct Options {
    std::string duration;
    std::string until;
    long long resumeTime = kPausedWithoutEnd;
    Change change;
};

// What StatusMgr::Pause() does, which takes whole hours only.
bool PauseUntil(long long resumeTime) {
    Status status;
    const VANO::FILEINDEX::SettingsLock lock(status);
    Json::Value parameters(Json::objectValue);
    parameters["resume_time"] = Json::Int64{resumeTime};
    return lock.IsHeld() && status.Load() && status.Pause(resumeTime) && status.Save() &&
           VANO::FILEINDEX::SendCammandToDaemon("pause", parameters);
}

ExitCode Run(Options &options) {
    const long long resumeTime = options.resumeTime;
    options.change.facts["resume_time"] = Json::Int64{resumeTime};
    if (options.change.isDryRun) {
        options.change.Would("pause indexing until " + EndText(resumeTime, std::time(nullptr)));
        return kDone;
    }
    if (!While("Telling the daemon", [&] { return PauseUntil(resumeTime); })) {
        return IsUnsaved() ? Fail("Cannot pause indexing")
                           : FailHalfWay("The pause is saved", kDaemonAdvice);
    }
    Say("Indexing is " + PauseText(resumeTime, std::time(nullptr)) + ".");
    if (resumeTime == kPausedWithoutEnd) {
        Advise("fileindexctl resume ends the pause.");
    }
    return kDone;
}

void ReadTimes(Options &options) {
    if (options.duration.empty() && options.until.empty()) {
        return;
    }
    const std::time_t now = std::time(nullptr);
    long long seconds = 0;
    std::time_t end = 0;
    if (!options.duration.empty() && !ReadDuration(seconds, options.duration)) {
        throw CLI::ValidationError(
            "--for takes a number with d, h or m, such as 8h or 1d12h, not '" + options.duration +
            "'");
    }
    if (!options.until.empty() && !ReadMoment(end, options.until, now)) {
        throw CLI::ValidationError("--until takes a time such as 07:30 or '2026-12-24 18:00', "
                                   "not '" +
                                   options.until + "'");
    }
    options.resumeTime = options.until.empty() ? now + seconds : end;
    if (options.resumeTime <= now) {
        throw CLI::ValidationError("That pause would end immediately");
    }
    if (options.resumeTime > kLatestEnd) {
        throw CLI::ValidationError("A pause cannot end after January 2038; leave out the time to "
                                   "pause until further notice");
    }
}

} // namespace

Action DeclarePause(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    CLI::Option *duration = app.add_option("--for", options->duration, "How long: 8h, 90m, 2d");
    duration->type_name("TIME");
    CLI::Option *until =
        app.add_option("--until", options->until, "Until a time, or a date and time");
    until->type_name("TIME")->excludes(duration);
    app.footer(kFooter);
    app.callback([options, duration, until] {
        // An empty word is no time, but CLI11 hands it on as if none had been given.
        for (const CLI::Option *option : {duration, until}) {
            if (option->count() > 0 && option->as<std::string>().empty()) {
                throw CLI::ValidationError(option->get_name() + " needs a time");
            }
        }
        ReadTimes(*options);
    });
    return MakeChange(app, options->change, [options] { return Run(*options); });
}

} // namespace CTL
