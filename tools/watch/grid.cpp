#include "watch/grid.h"

#include <algorithm>

#include "colour.h"
#include "text.h"

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

void Grid::Insert(std::size_t place, GridColumn column) {
    columns_.insert(columns_.begin() + static_cast<std::ptrdiff_t>(place), std::move(column));
}

void Grid::Remove(const std::string &heading) {
    columns_.erase(
        std::remove_if(columns_.begin(), columns_.end(),
                       [&](const GridColumn &column) { return column.heading == heading; }),
        columns_.end());
}

std::string Grid::Line(const std::vector<std::string> &cells, std::size_t screen,
                       const Style &style) const {
    const std::size_t others = WidthBesideFirst();
    const std::size_t first = std::min(WidthOfFirst(), screen > others ? screen - others : 1);
    std::string line = Aligned(Fit(cells.front(), first, style), first, columns_.front().side);
    for (std::size_t i = 1; i < cells.size(); ++i) {
        line += std::string(kGap, ' ') + Aligned(cells[i], columns_[i].Width(), columns_[i].side);
    }
    return Fit(WithoutFinalBlanks(line), screen, style);
}

std::vector<std::string> Grid::Lines(std::size_t screen, const Style &style) const {
    std::vector<std::string> cells;
    cells.reserve(columns_.size());
    for (const GridColumn &column : columns_) {
        cells.push_back(column.heading);
    }
    std::vector<std::string> lines{
        Coloured(Line(cells, screen, style), Colour::kBold, style.hasColour)};
    for (std::size_t row = 0; row < columns_.front().cells.size(); ++row) {
        cells.clear();
        for (const GridColumn &column : columns_) {
            cells.push_back(column.cells[row]);
        }
        lines.push_back(Line(cells, screen, style));
    }
    return lines;
}

} // namespace CTL
