#ifndef FILEINDEXCTL_OUTPUT_H
#define FILEINDEXCTL_OUTPUT_H

#include <json/value.h>
#include <string>
#include <vector>

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
    explicit Table(std::vector<std::string> headings) : headings_(std::move(headings)) {}

    // As many cells as there are headings; an empty one shows as "-".
    void Add(const std::vector<std::string> &cells);

    // To standard output, in aligned columns; the headings on a terminal only.
    void Print() const;

  private:
    std::vector<std::string> headings_;
    std::vector<std::vector<std::string>> rows_;
};

} // namespace CTL

#endif
