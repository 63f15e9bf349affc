#include <fileindex/status_mgr.h>
#include <iostream>
#include <limits>
#include <memory>

#include "command.h"
#include "messages.h"
#include "times.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] =
    R"(The service counts whole hours: what lies between them is rounded up. Without an
option the pause has no end.

Examples:
  fileindexctl pause
  fileindexctl pause --for 8h
  fileindexctl pause --for 1d12h --dry-run
  fileindexctl pause --until 07:30
  fileindexctl pause --until "2026-12-24 18:00")";

constexpr long long kSecondsPerHour = 3600;

struct Options {
    std::string duration;
    std::string until;
    bool isForever = false; // as without any option
    bool isDryRun = false;
    long long seconds = 0; // 0 for no end
};

// The library keeps the end of a pause in 32 bits.
long long MostHours(std::time_t now) {
    return (std::numeric_limits<std::int32_t>::max() - now) / kSecondsPerHour;
}

int HoursOf(const Options &options) {
    return static_cast<int>((options.seconds + kSecondsPerHour - 1) / kSecondsPerHour);
}

void SayRounding(const Options &options) {
    if (options.seconds % kSecondsPerHour != 0) {
        Advise("The service counts whole hours: rounded up to " + std::to_string(HoursOf(options)) +
               " h.");
    }
}

ExitCode Preview(const Options &options) {
    const std::time_t end = std::time(nullptr) + HoursOf(options) * kSecondsPerHour;
    std::cout << "Would pause indexing until "
              << (options.seconds == 0 ? "fileindexctl resume" : TimeText(end)) << ".\n";
    SayRounding(options);
    return kDone;
}

ExitCode Run(const Options &options) {
    if (options.isDryRun) {
        return Preview(options);
    }
    const int hours = HoursOf(options);
    if (!While("Telling the daemon", [&] { return fileindex::StatusMgr::Pause(hours); })) {
        return IsUnsaved() ? Fail("Cannot pause indexing")
                           : FailHalfWay("The pause is saved", kDaemonAdvice);
    }
    long long resumeTime = 0;
    if (hours == 0 || !fileindex::StatusMgr::GetPauseInfo(resumeTime)) {
        Say("Indexing is paused, until fileindexctl resume.");
    } else {
        Say("Indexing is paused until " + TimeText(resumeTime) + ".");
    }
    SayRounding(options);
    return kDone;
}

void ReadTimes(Options &options) {
    const std::time_t now = std::time(nullptr);
    std::time_t end = 0;
    if (!options.duration.empty() && !ReadDuration(options.seconds, options.duration)) {
        throw CLI::ValidationError("--for is a number with d, h or m, such as 8h or 1d12h, not '" +
                                   options.duration + "'");
    }
    if (!options.until.empty()) {
        if (!ReadMoment(end, options.until, now)) {
            throw CLI::ValidationError("--until is a time such as 07:30 or '2026-12-24 18:00', "
                                       "not '" +
                                       options.until + "'");
        }
        options.seconds = end - now;
    }
    const bool hasEnd = !options.duration.empty() || !options.until.empty();
    if (hasEnd && options.seconds <= 0) {
        throw CLI::ValidationError("That pause would be over at once");
    }
    if (options.seconds > MostHours(now) * kSecondsPerHour) {
        throw CLI::ValidationError("The service cannot count so far: use --forever");
    }
}

} // namespace

Action DeclarePause(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    CLI::Option *duration = app.add_option("--for", options->duration, "For so long: 8h, 90m, 2d");
    duration->type_name("TIME");
    CLI::Option *until =
        app.add_option("--until", options->until, "Until 07:30, or until a day and time");
    until->type_name("TIME")->excludes(duration);
    app.add_flag("--forever", options->isForever, "Until fileindexctl resume")
        ->excludes(duration)
        ->excludes(until);
    AddDryRunOption(app, options->isDryRun);
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
    return [options] { return Run(*options); };
}

} // namespace CTL
