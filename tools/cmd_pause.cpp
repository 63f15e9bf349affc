#include <ctime>
#include <fileindex/error_handler.h>
#include <fileindex/status_mgr.h>
#include <limits>
#include <memory>

#include "command.h"
#include "messages.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

constexpr char kFooter[] = R"(Examples:
  fileindexctl pause
  fileindexctl pause --hours 8)";

constexpr long long kSecondsPerHour = 3600;

struct Options {
    int hours = 0;
};

// The library keeps the end of a pause in 32 bits.
int MostHours() {
    const long long left = std::numeric_limits<std::int32_t>::max() - std::time(nullptr);
    return static_cast<int>(left / kSecondsPerHour);
}

std::string TimeText(std::time_t time) {
    std::tm local{};
    char text[64] = "";
    if (::localtime_r(&time, &local) != nullptr) {
        (void)std::strftime(text, sizeof(text), "%Y-%m-%d %H:%M", &local);
    }
    return text;
}

ExitCode Run(const Options &options) {
    if (!fileindex::StatusMgr::Pause(options.hours)) {
        if (fileindex::ErrorHandler::GetError() != fileindex::FILEINDEX_ERR_NONE) {
            return Fail("Cannot pause indexing");
        }
        return FailHalfWay("The pause is saved",
                           "The daemon could not be told: is fileindexd running?");
    }
    long long resumeTime = 0;
    if (options.hours == 0 || !fileindex::StatusMgr::GetPauseInfo(resumeTime)) {
        Say("Indexing is paused, until fileindexctl resume.");
    } else {
        Say("Indexing is paused until " + TimeText(resumeTime) + ".");
    }
    return kDone;
}

} // namespace

Action DeclarePause(CLI::App &app) {
    const auto options = std::make_shared<Options>();
    app.add_option("--hours", options->hours, "For so many hours; 0, or not given: without end")
        ->type_name("N")
        ->check(CLI::Range(0, MostHours()));
    app.footer(kFooter);
    return [options] { return Run(*options); };
}

} // namespace CTL
