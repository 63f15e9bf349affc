#ifndef FILEINDEXCTL_TERMINAL_OUTPUT_H
#define FILEINDEXCTL_TERMINAL_OUTPUT_H

#include <json/value.h>
#include <string>
#include <vector>

#include "terminal/grid.h"

namespace CLI {
class App;
}

// Standard output: where the answers go.

namespace CTL {

enum class JsonMode { kOff, kShort, kPretty };

// The options --json[=short|pretty|off] and -j, which is pretty on a terminal and short elsewhere.
// `mode` must outlive the parsing.
void AddJsonOption(CLI::App &app, JsonMode &mode);

// Reading it gives names byte for byte, also those that are not UTF-8; no character that could
// drive a terminal stands in it as it is. Nothing for kOff.
void PrintJson(const Json::Value &value, JsonMode mode);

// Rows of text under headings.
class Table {
  public:
    explicit Table(const std::vector<std::string> &headings);

    // Where the terminal has no room for all, the cells under this heading are cut in their middle,
    // but not below `narrowest` columns. A table without such a heading is never cut.
    void MayCut(const std::string &heading, std::size_t narrowest) {
        grid_.MayCut(heading, narrowest);
    }

    // As many cells as there are headings; an empty one shows as "-".
    void Add(const std::vector<std::string> &cells);

    // To standard output: on a terminal under headings and no wider than it, elsewhere the rows
    // alone, whole.
    void Print() const;

  private:
    Grid grid_;
};

} // namespace CTL

#endif
