#include "base/json_io.h"

#include <cerrno>
#include <json/reader.h>
#include <json/writer.h>
#include <sstream>

#include "base/file_io.h"
#include "base/plain_value.h"

namespace VANO::FILEINDEX {

namespace {

const Json::CharReaderBuilder &ReaderSettings() {
    static const Json::CharReaderBuilder settings = [] {
        Json::CharReaderBuilder builder;
        builder["collectComments"] = false;
        builder["failIfExtra"] = true;
        return builder;
    }();
    return settings;
}

const Json::StreamWriterBuilder &WriterSettings() {
    static const Json::StreamWriterBuilder settings = [] {
        Json::StreamWriterBuilder builder;
        builder["indentation"] = "";
        builder["commentStyle"] = "None";
        builder["emitUTF8"] = true;
        return builder;
    }();
    return settings;
}

} // namespace

std::optional<JsonExtension> FindJsonExtension(std::string_view text) {
    bool inString = false;
    bool afterComma = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (inString) {
            i += c == '\\' ? 1 : 0;
            inString = c != '"';
            continue;
        }
        if (c == '/') {
            return JsonExtension{i, "a comment, which JSON does not have"};
        }
        if (c == '\0') {
            return JsonExtension{i, "a zero byte"};
        }
        if (afterComma && (c == '}' || c == ']')) {
            return JsonExtension{i, "a comma with nothing after it"};
        }
        inString = c == '"';
        if (c != ' ' && c != '\t' && c != '\n' && c != '\r') {
            afterComma = c == ',';
        }
    }
    return std::nullopt;
}

JsonParser::JsonParser() = default;
JsonParser::~JsonParser() = default;

bool JsonParser::Parse(Json::Value &value, std::string_view text) {
    Json::Value parsed;
    if (!ReadPlainValue(parsed, text)) {
        return ParseWithLibrary(value, text);
    }
    value.swap(parsed);
    return true;
}

bool JsonParser::ParseWithLibrary(Json::Value &value, std::string_view text) {
    if (reader_ == nullptr) {
        reader_.reset(ReaderSettings().newCharReader()); // costs as much as parsing an event
    }
    Json::Value parsed;
    try {
        if (!reader_->parse(text.data(), text.data() + text.size(), &parsed, nullptr)) {
            return false;
        }
    } catch (const Json::Exception &) {
        return false; // nested too deep
    }
    if (FindJsonExtension(text)) {
        return false;
    }
    value.swap(parsed);
    return true;
}

bool JsonFromString(Json::Value &value, std::string_view text) {
    return JsonParser().Parse(value, text);
}

bool JsonFromFile(Json::Value &value, const std::string &path) {
    std::string text;
    return ReadFile(text, path, kMaxJsonFileBytes) && JsonFromString(value, text);
}

bool JsonToFile(const Json::Value &value, const std::string &path) {
    const std::string text = JsonToString(value);
    if (text.size() > kMaxJsonFileBytes) {
        errno = EFBIG;
        return false;
    }
    return WriteFile(path, text);
}

std::string JsonToString(const Json::Value &value) {
    std::ostringstream text;
    text.exceptions(std::ios::badbit); // without memory it would just end early
    const std::unique_ptr<Json::StreamWriter> writer(WriterSettings().newStreamWriter());
    writer->write(value, &text);
    return text.str();
}

std::string JsonToMessageText(const Json::Value &value) {
    return value.isString() ? value.asString() : JsonToString(value);
}

} // namespace VANO::FILEINDEX
