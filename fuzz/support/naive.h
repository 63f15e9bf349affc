#ifndef FILEINDEX_FUZZ_NAIVE_H
#define FILEINDEX_FUZZ_NAIVE_H

// What the library is compared with: the plainest way to the same answers, straight from the JSON
// library, without the product's readers and without its short cuts.

#include <json/value.h>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace VANO::FUZZ {

// Exactly one JSON value without comments and trailing commas; none otherwise.
std::optional<Json::Value> Parse(std::string_view text);

// Compact, on one line, names byte for byte.
std::string Text(const Json::Value &value);

// The string of that value, or "".
std::string StringOf(const Json::Value &value);

// The lines of a file; the last one may lack its newline, and an empty rest is none.
std::vector<std::string> Lines(const std::string &text);

struct Event {
    unsigned code;
    std::string path;
    std::string formerPath;
};

// A line of a queue; none for a malformed one.
std::optional<Event> ParseEvent(std::string_view line);

// Whether `path` is `folder` or lies below it: both get a trailing "/", then it is a prefix test
// that ends at a zero byte.
bool Lies(const std::string &path, const std::string &folder);

} // namespace VANO::FUZZ

#endif
