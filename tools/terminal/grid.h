#ifndef FILEINDEXCTL_TERMINAL_GRID_H
#define FILEINDEXCTL_TERMINAL_GRID_H

#include <cstddef>
#include <limits>
#include <string>
#include <vector>

#include "terminal/fit.h"

namespace CTL {

struct GridColumn {
    enum class Side { kLeft, kRight };
    static constexpr std::size_t kWhole = std::numeric_limits<std::size_t>::max();

    std::string heading;
    Side side = Side::kLeft;
    std::size_t leastWidth = 0;
    std::size_t narrowest = kWhole;   // down to which its cells are cut where there is no room
    std::vector<std::string> cells{}; // as Shown() gives them; as many in each column

    [[nodiscard]] std::size_t Width() const;
};

// Columns under headings.
class Grid {
  public:
    explicit Grid(std::vector<GridColumn> columns) : columns_(std::move(columns)) {}

    [[nodiscard]] std::size_t Size() const { return columns_.size(); } // columns

    // What the columns but the first need, the gaps included.
    [[nodiscard]] std::size_t WidthBesideFirst() const;

    // What the first column needs to be shown whole.
    [[nodiscard]] std::size_t WidthOfFirst() const { return columns_.front().Width(); }

    void Add(const std::vector<std::string> &row);
    void Insert(std::size_t place, GridColumn column);
    void Remove(const std::string &heading);
    void MayCut(const std::string &heading, std::size_t narrowest);

    // For people: the headings, then the rows. None is wider than `screen`, unless no column may be
    // cut; of those that may the widest gives way first.
    [[nodiscard]] std::vector<std::string> Lines(std::size_t screen, const Style &style) const;

    // For programs: the rows alone, whole.
    [[nodiscard]] std::vector<std::string> Rows() const;

  private:
    [[nodiscard]] std::vector<std::size_t> WidthsOn(std::size_t screen) const;
    [[nodiscard]] bool MayBeCut() const;

    std::vector<GridColumn> columns_;
};

} // namespace CTL

#endif
