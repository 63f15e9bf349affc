#ifndef FILEINDEXCTL_WATCH_GRID_H
#define FILEINDEXCTL_WATCH_GRID_H

#include <cstddef>
#include <string>
#include <vector>

#include "fit.h"

namespace CTL {

struct GridColumn {
    enum class Side { kLeft, kRight };

    std::string heading;
    Side side = Side::kLeft;
    std::size_t leastWidth = 0;
    std::vector<std::string> cells; // as Shown() gives them; as many in each column

    [[nodiscard]] std::size_t Width() const;
};

// Columns under headings that fit a screen: the first one gets what the others leave to it.
class Grid {
  public:
    explicit Grid(std::vector<GridColumn> columns) : columns_(std::move(columns)) {}

    // What the columns but the first need, the gaps included.
    [[nodiscard]] std::size_t WidthBesideFirst() const;

    // What the first column needs to be shown whole.
    [[nodiscard]] std::size_t WidthOfFirst() const { return columns_.front().Width(); }

    void Insert(std::size_t place, GridColumn column);
    void Remove(const std::string &heading);

    // The headings, then the rows; none wider than `screen`.
    [[nodiscard]] std::vector<std::string> Lines(std::size_t screen, const Style &style) const;

  private:
    [[nodiscard]] std::string Line(const std::vector<std::string> &cells, std::size_t screen,
                                   const Style &style) const;

    std::vector<GridColumn> columns_;
};

} // namespace CTL

#endif
