#ifndef FILEINDEX_BASE_PLAIN_VALUE_H
#define FILEINDEX_BASE_PLAIN_VALUE_H

#include <json/value.h>
#include <string_view>

namespace VANO::FILEINDEX {

// Reads a whole text that is plain (see PlainJson) into the value that the JSON library would make
// of it, at a fraction of its cost. False when only the JSON library can tell what the text is;
// `value` is unspecified then.
[[nodiscard]] bool ReadPlainValue(Json::Value &value, std::string_view text);

} // namespace VANO::FILEINDEX

#endif
