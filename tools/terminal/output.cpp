#include "terminal/output.h"

#include <CLI/CLI.hpp>
#include <iostream>
#include <json/writer.h>
#include <unistd.h>

#include "terminal/terminal.h"
#include "terminal/text.h"

namespace CTL {

namespace {

// What CLI11 reads into a JsonMode: the number of the one that `word` names.
std::string JsonModeNumber(const std::string &word) {
    const std::pair<const char *, JsonMode> modes[] = {
        {"off", JsonMode::kOff}, {"short", JsonMode::kShort}, {"pretty", JsonMode::kPretty}};
    for (const auto &[name, mode] : modes) {
        if (word == name) {
            return std::to_string(static_cast<int>(mode));
        }
    }
    throw CLI::ValidationError("must be short, pretty or off, not '" + word + "'");
}

} // namespace

void AddJsonOption(CLI::App &app, JsonMode &mode) {
    // A flag, so that the word after a plain --json is not taken for its value.
    CLI::Option *json =
        app.add_flag("--json{short}", mode, "Print JSON: on one line (short), indented, or not");
    json->transform(JsonModeNumber)->type_name("short|pretty|off");
    app.add_flag_callback(
           "-j",
           [&mode] { mode = IsTerminal(STDOUT_FILENO) ? JsonMode::kPretty : JsonMode::kShort; },
           "Print JSON: pretty on a terminal, short elsewhere")
        ->excludes(json);
}

void PrintJson(const Json::Value &value, JsonMode mode) {
    if (mode == JsonMode::kOff) {
        return;
    }
    Json::StreamWriterBuilder builder;
    builder["indentation"] = mode == JsonMode::kPretty ? "  " : "";
    builder["enableYAMLCompatibility"] = mode == JsonMode::kPretty; // "key": value
    builder["emitUTF8"] = true;
    std::cout << ShownJson(Json::writeString(builder, value)) << '\n';
}

Table::Table(const std::vector<std::string> &headings) : grid_({}) {
    for (const std::string &heading : headings) {
        grid_.Insert(grid_.Size(), {heading});
    }
}

void Table::Add(const std::vector<std::string> &cells) {
    std::vector<std::string> row;
    row.reserve(cells.size());
    for (const std::string &cell : cells) {
        row.push_back(cell.empty() ? "-" : Shown(cell));
    }
    grid_.Add(row);
}

void Table::Print() const {
    const bool isTerminal = IsTerminal(STDOUT_FILENO);
    for (const std::string &line :
         isTerminal ? grid_.Lines(LineWidth(STDOUT_FILENO), StyleOfOutput()) : grid_.Rows()) {
        std::cout << line << '\n';
    }
}

} // namespace CTL
