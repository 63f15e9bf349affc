#include "watch/service_text.h"

#include <algorithm>
#include <cmath>

#include "state/folder_view.h"
#include "terminal/text.h"
#include "terminal/times.h"

namespace CTL {

namespace {

constexpr std::size_t kNarrowestPath = 20;

} // namespace

std::vector<HeadLine> HeadOf(const ServiceState &service) {
    std::vector<HeadLine> head{
        {"Daemon:   ", NameOf(service.daemon), ColourOf(service.daemon)},
        {"Indexing: ", PauseTextOf(service), service.IsPaused() ? Colour::kBold : Colour::kPlain}};
    for (const std::string &note : NotesOf(service)) {
        head.push_back({"Note:     ", note, Colour::kBad});
    }
    return head;
}

Grid FoldersOf(const ServiceState &service, std::size_t screen) {
    Grid grid({{"PATH"}, {"STATE"}, {"TYPES"}, {"VALID"}, {"PENDING", GridColumn::Side::kRight}});
    grid.MayCut("PATH", 1);
    for (const FolderState &folder : service.folders) {
        const std::string types = TypesOf(folder.setting);
        grid.Add({Shown(folder.path), StatusTextOf(folder), types.empty() ? "-" : types,
                  folder.isValid ? "yes" : "no", PendingText(folder.pending)});
    }
    // A path that is cut says less than what the state and `show` tell all the same.
    const std::size_t wanted = std::min(grid.WidthOfFirst(), kNarrowestPath);
    for (const char *surplus : {"VALID", "TYPES"}) {
        if (grid.WidthBesideFirst() + wanted > screen) {
            grid.Remove(surplus);
        }
    }
    return grid;
}

std::string PercentText(const QueuePace &progress) {
    return std::to_string(static_cast<int>(std::floor(progress.Fraction() * 100))) + " %";
}

std::string OutlookText(const ServiceState &service, const ShareState &share,
                        const QueuePace &progress) {
    if (share.queueError != 0) {
        return "cannot be read";
    }
    if (!share.pending) {
        return service.counted < 1 ? "counting" : "unknown share";
    }
    if (*share.pending == 0) {
        return "finished";
    }
    if (share.isOutOfSpace) {
        return "out of space";
    }
    if (service.IsPaused()) {
        return "paused";
    }
    if (service.daemon == DaemonState::kStopped) {
        return "daemon stopped";
    }
    const std::optional<long long> left = progress.SecondsLeft();
    return left ? DurationText(*left) + " left" : "";
}

} // namespace CTL
