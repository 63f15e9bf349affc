#include "output.h"

#include <algorithm>
#include <cstdlib>
#include <iostream>
#include <json/writer.h>
#include <string_view>
#include <unistd.h>

#include "text.h"

namespace CTL {

namespace {

constexpr char kGap[] = "  ";

bool IsTerminal() {
    return ::isatty(STDOUT_FILENO) == 1;
}

bool MayUseColour() {
    const char *none = std::getenv("NO_COLOR");
    const char *terminal = std::getenv("TERM");
    return IsTerminal() && (none == nullptr || *none == '\0') && terminal != nullptr &&
           std::string_view(terminal) != "dumb";
}

void PrintRow(const std::vector<std::string> &cells, const std::vector<std::size_t> &widths) {
    for (std::size_t column = 0; column + 1 < cells.size(); ++column) {
        std::cout << Padded(cells[column], widths[column]) << kGap;
    }
    std::cout << cells.back();
}

} // namespace

void Table::Add(const std::vector<std::string> &cells) {
    std::vector<std::string> row;
    row.reserve(cells.size());
    for (const std::string &cell : cells) {
        row.push_back(cell.empty() ? "-" : Shown(cell));
    }
    rows_.push_back(std::move(row));
}

void Table::Print() const {
    const bool hasHeadings = IsTerminal();
    std::vector<std::size_t> widths;
    for (std::size_t column = 0; column < headings_.size(); ++column) {
        std::size_t width = hasHeadings ? Columns(headings_[column]) : 0;
        for (const auto &row : rows_) {
            width = std::max(width, Columns(row[column]));
        }
        widths.push_back(width);
    }
    if (hasHeadings) {
        std::cout << (MayUseColour() ? "\033[1m" : "");
        PrintRow(headings_, widths);
        std::cout << (MayUseColour() ? "\033[0m\n" : "\n");
    }
    for (const auto &row : rows_) {
        PrintRow(row, widths);
        std::cout << '\n';
    }
}

void PrintJson(const Json::Value &value) {
    Json::StreamWriterBuilder builder;
    builder["indentation"] = "";
    builder["emitUTF8"] = true;
    std::cout << Json::writeString(builder, value) << '\n';
}

} // namespace CTL
