#include "watch/frame.h"

#include <algorithm>

#include "colour.h"
#include "folder_view.h"
#include "text.h"
#include "watch/grid.h"
#include "watch/share_text.h"

namespace CTL {

namespace {

using Lines = std::vector<std::string>;
using Side = GridColumn::Side;

constexpr std::size_t kGap = 2;
constexpr std::size_t kWidestBar = 30;
constexpr std::size_t kNarrowestBar = 8; // its heading
constexpr std::size_t kWidestShare = 20;
constexpr std::size_t kNarrowestPath = 20;
// So that the columns do not jump when a number or a word becomes longer.
constexpr std::size_t kNumberWidth = 7;
constexpr std::size_t kOutlookWidth = 14;

void AddFitted(Lines &lines, const char *label, const std::string &text, Colour colour,
               const ScreenSize &size, const Style &style) {
    const std::string plain = Fit(label + text, size.columns, style);
    const std::size_t start = std::min(plain.size(), std::string(label).size());
    lines.push_back(plain.substr(0, start) +
                    Coloured(plain.substr(start), colour, style.hasColour));
}

Lines HeadOf(const ServiceState &service, const ScreenSize &size, const Style &style) {
    Lines lines;
    AddFitted(lines, "Daemon:   ", NameOf(service.daemon), ColourOf(service.daemon), size, style);
    AddFitted(lines, "Indexing: ", PauseTextOf(service),
              service.IsPaused() ? Colour::kBold : Colour::kPlain, size, style);
    for (const std::string &note : NotesOf(service)) {
        AddFitted(lines, "Note:     ", note, Colour::kBad, size, style);
    }
    return lines;
}

GridColumn BarsOf(const WatchedState &state, std::size_t width, const Style &style) {
    GridColumn bars{"PROGRESS", Side::kLeft, width, {}};
    for (std::size_t i = 0; i < state.service.shares.size(); ++i) {
        const bool isWaiting = state.service.shares[i].pending.value_or(0) > 0;
        bars.cells.push_back(isWaiting ? Bar(state.progress[i].Fraction(), width, style) : "");
    }
    return bars;
}

Lines SharesOf(const WatchedState &state, const ScreenSize &size, const Style &style) {
    GridColumn names{"SHARE", Side::kLeft, 0, {}};
    GridColumn pending{"PENDING", Side::kRight, kNumberWidth, {}};
    GridColumn percents{"", Side::kRight, 4, {}};
    GridColumn outlooks{"", Side::kLeft, kOutlookWidth, {}};
    for (std::size_t i = 0; i < state.service.shares.size(); ++i) {
        const ShareState &share = state.service.shares[i];
        const bool isWaiting = share.pending.value_or(0) > 0;
        names.cells.push_back(Fit(Shown(share.name), kWidestShare, style));
        pending.cells.push_back(CountText(share.pending));
        percents.cells.push_back(isWaiting ? PercentText(state.progress[i]) : "");
        outlooks.cells.push_back(OutlookText(state.service, share, state.progress[i]));
    }
    Grid grid({names, pending, percents, outlooks});
    const std::size_t taken = grid.WidthOfFirst() + grid.WidthBesideFirst() + kGap;
    if (size.columns >= taken + kNarrowestBar) {
        grid.Insert(2, BarsOf(state, std::min(size.columns - taken, kWidestBar), style));
    }
    return grid.Lines(size.columns, style);
}

Lines FoldersOf(const ServiceState &service, const ScreenSize &size, const Style &style) {
    GridColumn paths{"PATH", Side::kLeft, 0, {}};
    GridColumn states{"STATE", Side::kLeft, 0, {}};
    GridColumn types{"TYPES", Side::kLeft, 0, {}};
    GridColumn valid{"VALID", Side::kLeft, 0, {}};
    GridColumn pending{"PENDING", Side::kRight, kNumberWidth, {}};
    for (const FolderState &folder : service.folders) {
        paths.cells.push_back(Shown(folder.path));
        states.cells.push_back(StatusTextOf(folder));
        types.cells.push_back(TypesOf(folder.setting));
        valid.cells.emplace_back(folder.isValid ? "yes" : "no");
        pending.cells.push_back(CountText(folder.pending));
    }
    Grid grid({paths, states, types, valid, pending});
    // A path that is cut says less than what the state and `status` tell all the same.
    const std::size_t wanted = std::min(grid.WidthOfFirst(), kNarrowestPath);
    for (const char *surplus : {"VALID", "TYPES"}) {
        if (grid.WidthBesideFirst() + wanted > size.columns) {
            grid.Remove(surplus);
        }
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
    Lines frame = HeadOf(state.service, size, style);
    if (state.service.folders.empty()) {
        frame.insert(frame.end(), {"", Fit("No folder is indexed.", size.columns, style)});
    } else {
        const Lines shares = SharesOf(state, size, style);
        const Lines folders = FoldersOf(state.service, size, style);
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
