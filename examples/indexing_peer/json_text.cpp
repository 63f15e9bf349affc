#include "json_text.h"

#include <algorithm>
#include <fstream>
#include <iterator>
#include <json/reader.h>
#include <json/writer.h>
#include <memory>

namespace peer {

bool ParseJson(Json::Value &value, std::string_view text) {
    // The JSON library takes the text to end there, and does not look at what follows.
    if (text.find('\0') != std::string_view::npos) {
        return false;
    }
    Json::CharReaderBuilder builder;
    Json::CharReaderBuilder::strictMode(&builder.settings_);
    builder["strictRoot"] = false;
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    try {
        return reader->parse(text.data(), text.data() + text.size(), &value, nullptr);
    } catch (const Json::Exception &) { // nested too deep
        return false;
    }
}

bool ParseJsonFile(Json::Value &value, const char *path) {
    std::ifstream file(path, std::ios::binary);
    return ParseJson(value, std::string(std::istreambuf_iterator<char>(file), {}));
}

std::string JsonLine(const Json::Value &value) {
    Json::StreamWriterBuilder builder;
    builder["indentation"] = "";
    builder["emitUTF8"] = true;
    return Json::writeString(builder, value);
}

std::string OneLine(const std::string &text) {
    const bool isPlain = std::none_of(text.begin(), text.end(), [](char c) {
        const auto byte = static_cast<unsigned char>(c);
        return byte < 0x20 || byte == 0x7F;
    });
    return isPlain ? text : JsonLine(text);
}

} // namespace peer
