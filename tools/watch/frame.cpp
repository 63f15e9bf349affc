#include "watch/frame.h"

#include <algorithm>

#include "terminal/text.h"
#include "watch/service_text.h"

namespace CTL {

namespace {

using Lines = std::vector<std::string>;
using Side = GridColumn::Side;

constexpr std::size_t kGap = 2;
constexpr std::size_t kWidestBar = 30;
constexpr std::size_t kNarrowestBar = 8; // its heading
constexpr std::size_t kWidestShare = 20;
// So that the columns do not jump when a number or a word becomes longer.
constexpr std::size_t kPercentWidth = 4;
constexpr std::size_t kOutlookWidth = 14;

Lines HeadOn(const ScreenSize &size, const ServiceState &service, const Style &style) {
    Lines lines;
    for (const HeadLine &line : HeadOf(service)) {
        const std::string plain = Fit(line.label + line.text, size.columns, style);
        const std::size_t start = std::min(plain.size(), line.label.size());
        lines.push_back(plain.substr(0, start) +
                        Coloured(plain.substr(start), line.colour, style.hasColour));
    }
    return lines;
}

GridColumn BarsOf(const WatchedState &state, std::size_t width, const Style &style) {
    GridColumn bars{"PROGRESS", Side::kLeft, width};
    for (std::size_t i = 0; i < state.service.shares.size(); ++i) {
        const bool isWaiting = state.service.shares[i].pending.value_or(0) > 0;
        bars.cells.push_back(isWaiting ? Bar(state.progress[i].Fraction(), width, style) : "");
    }
    return bars;
}

Lines SharesOf(const WatchedState &state, const ScreenSize &size, const Style &style) {
    Grid grid({{"SHARE"},
               {"PENDING", Side::kRight},
               {"", Side::kRight, kPercentWidth},
               {"", Side::kLeft, kOutlookWidth}});
    grid.MayCut("SHARE", 1);
    for (std::size_t i = 0; i < state.service.shares.size(); ++i) {
        const ShareState &share = state.service.shares[i];
        const bool isWaiting = share.pending.value_or(0) > 0;
        grid.Add({Fit(Shown(share.name), kWidestShare, style), PendingText(share.pending),
                  isWaiting ? PercentText(state.progress[i]) : "",
                  OutlookText(state.service, share, state.progress[i])});
    }
    const std::size_t taken = grid.WidthOfFirst() + grid.WidthBesideFirst() + kGap;
    if (size.columns >= taken + kNarrowestBar) {
        grid.Insert(2, BarsOf(state, std::min(size.columns - taken, kWidestBar), style));
    }
    return grid.Lines(size.columns, style);
}

// At most `room` lines; the last one says how many rows are left out.
void Append(Lines &frame, const Lines &block, std::size_t room, const char *what) {
    const std::size_t kept = block.size() <= room ? block.size() : room - 1;
    frame.insert(frame.end(), block.begin(), block.begin() + static_cast<std::ptrdiff_t>(kept));
    if (kept < block.size()) {
        frame.push_back("and " + std::to_string(block.size() - kept) + " more " + what);
    }
}

} // namespace

std::vector<std::string> FrameOf(const WatchedState &state, const ScreenSize &size,
                                 const Style &style) {
    constexpr std::size_t kLeastOfBlock = 3; // heading, one row, how many more
    Lines frame = HeadOn(size, state.service, style);
    if (state.service.folders.empty()) {
        frame.insert(frame.end(), {"", Fit("No folder is indexed.", size.columns, style)});
    } else {
        const Lines shares = SharesOf(state, size, style);
        const Lines folders = FoldersOf(state.service, size.columns).Lines(size.columns, style);
        const std::size_t taken = frame.size() + 2; // and the lines between the blocks
        const std::size_t room = std::max(size.rows, taken + 2 * kLeastOfBlock) - taken;
        const std::size_t forFolders = std::min(folders.size(), std::max(kLeastOfBlock, room / 2));
        const std::size_t forShares = std::min(shares.size(), room - forFolders);
        frame.emplace_back();
        Append(frame, shares, forShares, "shares");
        frame.emplace_back();
        Append(frame, folders, room - forShares, "folders");
    }
    frame.resize(std::min(frame.size(), size.rows));
    return frame;
}

} // namespace CTL
