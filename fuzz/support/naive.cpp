#include "support/naive.h"

#include <algorithm>
#include <cstring>
#include <json/reader.h>
#include <json/writer.h>

namespace VANO::FUZZ {

namespace {

// The text with each string cut to a quotation mark and without white space.
std::string SkeletonOf(std::string_view text) {
    std::string skeleton;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (std::strchr(" \t\r\n", text[i]) != nullptr && text[i] != '\0') {
            continue;
        }
        skeleton += text[i];
        if (text[i] == '"') {
            for (++i; i < text.size() && text[i] != '"'; ++i) {
                i += text[i] == '\\' ? 1U : 0U;
            }
        }
    }
    return skeleton;
}

// What the JSON library lets pass in some places whatever its settings are.
bool HoldsExtension(std::string_view text) {
    const std::string skeleton = SkeletonOf(text);
    return skeleton.find(",}") != std::string::npos || skeleton.find(",]") != std::string::npos ||
           skeleton.find('/') != std::string::npos || skeleton.find('\0') != std::string::npos;
}

Json::CharReader *NewReader() {
    Json::CharReaderBuilder builder;
    builder["collectComments"] = false;
    builder["allowComments"] = false;
    builder["allowTrailingCommas"] = false;
    builder["failIfExtra"] = true;
    return builder.newCharReader();
}

} // namespace

std::optional<Json::Value> Parse(std::string_view text) {
    static Json::CharReader &reader = *NewReader();
    Json::Value value;
    try {
        if (!reader.parse(text.data(), text.data() + text.size(), &value, nullptr) ||
            HoldsExtension(text)) {
            return std::nullopt;
        }
    } catch (const Json::Exception &) { // nested too deep
        return std::nullopt;
    }
    return value;
}

std::string Text(const Json::Value &value) {
    static const Json::StreamWriterBuilder settings = [] {
        Json::StreamWriterBuilder builder;
        builder["indentation"] = "";
        builder["commentStyle"] = "None";
        builder["emitUTF8"] = true;
        return builder;
    }();
    return Json::writeString(settings, value);
}

std::string StringOf(const Json::Value &value) {
    return value.isString() ? value.asString() : std::string();
}

std::vector<std::string> Lines(const std::string &text) {
    std::vector<std::string> lines;
    for (std::size_t begin = 0; begin < text.size();) {
        const std::size_t end = std::min(text.find('\n', begin), text.size());
        lines.push_back(text.substr(begin, end - begin));
        begin = end + 1;
    }
    return lines;
}

std::optional<Event> ParseEvent(std::string_view line) {
    const std::optional<Json::Value> value = Parse(line);
    if (!value || !value->isObject() || !value->isMember("event") || !value->isMember("path") ||
        !(*value)["event"].isConvertibleTo(Json::uintValue) || !(*value)["path"].isString()) {
        return std::nullopt;
    }
    const Json::Value former = value->get("path_old", "");
    return Event{(*value)["event"].asUInt(), (*value)["path"].asString(),
                 former.isConvertibleTo(Json::stringValue) ? former.asString() : ""};
}

bool Lies(const std::string &path, const std::string &folder) {
    const std::string text = path + "/";
    const std::string prefix = folder + "/";
    return text.size() >= prefix.size() &&
           std::strncmp(text.c_str(), prefix.c_str(), prefix.size()) == 0;
}

} // namespace VANO::FUZZ
