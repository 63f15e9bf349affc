#include "terminal/grid.h"

#include <algorithm>
#include <numeric>

#include "terminal/terminal.h"
#include "terminal/text.h"

namespace CTL {

namespace {

constexpr std::size_t kGap = 2;

std::string Aligned(const std::string &cell, std::size_t width, GridColumn::Side side) {
    const std::size_t taken = Columns(cell);
    const std::string blank(taken < width ? width - taken : 0, ' ');
    return side == GridColumn::Side::kRight ? blank + cell : cell + blank;
}

std::string WithoutFinalBlanks(std::string line) {
    line.erase(line.find_last_not_of(' ') + 1);
    return line;
}

} // namespace

std::size_t GridColumn::Width() const {
    std::size_t width = std::max(leastWidth, Columns(heading));
    for (const std::string &cell : cells) {
        width = std::max(width, Columns(cell));
    }
    return width;
}

std::size_t Grid::WidthBesideFirst() const {
    std::size_t width = 0;
    for (std::size_t i = 1; i < columns_.size(); ++i) {
        width += kGap + columns_[i].Width();
    }
    return width;
}

void Grid::Add(const std::vector<std::string> &row) {
    for (std::size_t i = 0; i < columns_.size(); ++i) {
        columns_[i].cells.push_back(row[i]);
    }
}

void Grid::Insert(std::size_t place, GridColumn column) {
    columns_.insert(columns_.begin() + static_cast<std::ptrdiff_t>(place), std::move(column));
}

void Grid::Remove(const std::string &heading) {
    columns_.erase(
        std::remove_if(columns_.begin(), columns_.end(),
                       [&](const GridColumn &column) { return column.heading == heading; }),
        columns_.end());
}

void Grid::MayCut(const std::string &heading, std::size_t narrowest) {
    for (GridColumn &column : columns_) {
        if (column.heading == heading) {
            column.narrowest = narrowest;
        }
    }
}

bool Grid::MayBeCut() const {
    return std::any_of(columns_.begin(), columns_.end(), [](const GridColumn &column) {
        return column.narrowest != GridColumn::kWhole;
    });
}

std::vector<std::size_t> Grid::WidthsOn(std::size_t screen) const {
    std::vector<std::size_t> widths;
    widths.reserve(columns_.size());
    for (const GridColumn &column : columns_) {
        widths.push_back(column.Width());
    }
    std::size_t taken = std::accumulate(widths.begin(), widths.end(), kGap * (columns_.size() - 1));
    const auto canGive = [&](std::size_t i) { return widths[i] > columns_[i].narrowest; };
    for (; taken > screen; --taken) {
        std::size_t widest = 0;
        for (std::size_t i = 1; i < widths.size(); ++i) {
            if (canGive(i) && (!canGive(widest) || widths[i] > widths[widest])) {
                widest = i;
            }
        }
        if (!canGive(widest)) {
            break;
        }
        --widths[widest];
    }
    return widths;
}

std::vector<std::string> Grid::Lines(std::size_t screen, const Style &style) const {
    const std::vector<std::size_t> widths = WidthsOn(screen);
    const std::size_t longest = MayBeCut() ? screen : GridColumn::kWhole;
    const auto lineOf = [&](const auto &cellOf) {
        std::string line;
        for (std::size_t i = 0; i < columns_.size(); ++i) {
            const std::string cell = Fit(cellOf(columns_[i]), widths[i], style);
            line +=
                (i == 0 ? "" : std::string(kGap, ' ')) + Aligned(cell, widths[i], columns_[i].side);
        }
        return Fit(WithoutFinalBlanks(line), longest, style);
    };
    std::vector<std::string> lines{
        Coloured(lineOf([](const GridColumn &column) { return column.heading; }), Colour::kBold,
                 style.hasColour)};
    for (std::size_t row = 0; row < columns_.front().cells.size(); ++row) {
        lines.push_back(lineOf([row](const GridColumn &column) { return column.cells[row]; }));
    }
    return lines;
}

std::vector<std::string> Grid::Rows() const {
    Grid bare(*this);
    for (GridColumn &column : bare.columns_) {
        column.heading.clear();
    }
    std::vector<std::string> lines = bare.Lines(GridColumn::kWhole, {});
    lines.erase(lines.begin());
    return lines;
}

} // namespace CTL
