#ifndef INDEXING_PEER_JSON_TEXT_H
#define INDEXING_PEER_JSON_TEXT_H

#include <json/value.h>
#include <string>
#include <string_view>

namespace peer {

// Exactly one JSON value; false for anything else. Nothing throws.
[[nodiscard]] bool ParseJson(Json::Value &value, std::string_view text);

// The value that a file holds; false for one that is missing or holds no JSON.
[[nodiscard]] bool ParseJsonFile(Json::Value &value, const char *path);

// One line, names as they are.
[[nodiscard]] std::string JsonLine(const Json::Value &value);

// Text from elsewhere on a line of its own: as it is, or as a JSON string where it holds characters
// that would break the line or move the terminal's cursor.
[[nodiscard]] std::string OneLine(const std::string &text);

} // namespace peer

#endif
