#ifndef FILEINDEX_BASE_JSON_IO_H
#define FILEINDEX_BASE_JSON_IO_H

#include <cstddef>
#include <json/value.h>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace Json {
class CharReader;
}

namespace VANO::FILEINDEX {

// The largest text that is read from or written to a settings file. Far beyond any real one; it
// keeps a file that grew by accident from taking the caller's memory. Nothing larger is written.
constexpr std::size_t kMaxJsonFileBytes = std::size_t{64} * 1024 * 1024;

// Reads JSON texts, one after another. A text is exactly one value of any type, by the rules of the
// JSON library, with white space around it and nothing else: no comments, no trailing commas.
// Nesting beyond the JSON library's limit makes a text invalid too. Nothing throws.
class JsonParser {
  public:
    JsonParser();
    ~JsonParser();
    JsonParser(const JsonParser &) = delete;
    JsonParser &operator=(const JsonParser &) = delete;

    // False when `text` is not valid; `value` then keeps what it held.
    [[nodiscard]] bool Parse(Json::Value &value, std::string_view text);

    // The same, for a text that a faster reader has refused already.
    [[nodiscard]] bool ParseWithLibrary(Json::Value &value, std::string_view text);

  private:
    std::unique_ptr<Json::CharReader> reader_;
};

// What the JSON library takes in some places and this reader refuses: comments, trailing commas,
// and whatever stands behind a zero byte. (The library's lax numbers and raw control characters in
// strings are taken: they take nothing away from what the text means.)
struct JsonExtension {
    std::size_t offset;
    const char *what; // "a comma with nothing after it"
};
[[nodiscard]] std::optional<JsonExtension> FindJsonExtension(std::string_view text);

// One text through a parser of its own.
[[nodiscard]] bool JsonFromString(Json::Value &value, std::string_view text);

// The text of a regular file. False, with `value` untouched, when it cannot be read or is not
// valid.
[[nodiscard]] bool JsonFromFile(Json::Value &value, const std::string &path);

// Makes the text of `value` the whole content of `path`, as WriteFile() does. False on any failure.
[[nodiscard]] bool JsonToFile(const Json::Value &value, const std::string &path);

// Compact, on a single line, without a newline after it. Bytes beyond ASCII are written as they
// are, so that names which are not valid UTF-8 come back byte for byte.
[[nodiscard]] std::string JsonToString(const Json::Value &value);

// How a list element reads in a message: the plain text of a string, compact JSON otherwise.
[[nodiscard]] std::string JsonToMessageText(const Json::Value &value);

} // namespace VANO::FILEINDEX

#endif
