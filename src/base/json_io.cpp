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

// Comments, trailing commas, and whatever stands behind a zero byte. The JSON library's settings
// refuse some of these in some places only, so all are found here. (Its lax numbers and raw control
// characters in strings stay: they take nothing away from what the text means.)
bool HasLibraryExtension(std::string_view text) {
    bool inString = false;
    bool afterComma = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (inString) {
            i += c == '\\' ? 1 : 0;
            inString = c != '"';
            continue;
        }
        if (c == '/' || c == '\0' || (afterComma && (c == '}' || c == ']'))) {
            return true;
        }
        inString = c == '"';
        if (c != ' ' && c != '\t' && c != '\n' && c != '\r') {
            afterComma = c == ',';
        }
    }
    return false;
}

std::string WriteWithLibrary(const Json::Value &value) {
    std::ostringstream text;
    text.exceptions(std::ios::badbit); // without memory it would just end early
    const std::unique_ptr<Json::StreamWriter> writer(WriterSettings().newStreamWriter());
    writer->write(value, &text);
    return text.str();
}

} // namespace

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
        reader_.reset(ReaderSettings().newCharReader()); // as dear as reading an event
    }
    Json::Value parsed;
    try {
        if (!reader_->parse(text.data(), text.data() + text.size(), &parsed, nullptr)) {
            return false;
        }
    } catch (const Json::Exception &) {
        return false; // nested too deep
    }
    if (HasLibraryExtension(text)) {
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
    std::string text;
    if (!WritePlainValue(text, value)) {
        text = WriteWithLibrary(value);
    }
    return text;
}

std::string JsonToMessageText(const Json::Value &value) {
    return value.isString() ? value.asString() : JsonToString(value);
}

} // namespace VANO::FILEINDEX
