#ifndef FILEINDEXCTL_OUTPUT_H
#define FILEINDEXCTL_OUTPUT_H

#include <json/value.h>
#include <string>
#include <vector>

namespace CTL {

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

// To standard output, on one line, names byte for byte.
void PrintJson(const Json::Value &value);

} // namespace CTL

#endif
