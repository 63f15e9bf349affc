#include "base/plain_value.h"

#include <algorithm>

#include "base/plain_json.h"

namespace VANO::FILEINDEX {

namespace {

bool TakeValue(Json::Value &value, PlainJson &json);

bool TakeWord(Json::Value &value, PlainJson &json, std::string_view word, Json::Value meaning) {
    value.swap(meaning);
    return json.TakeExactly(word);
}

bool TakeString(Json::Value &value, PlainJson &json) {
    std::string_view text;
    if (!json.TakeString(text)) {
        return false;
    }
    value = Json::Value(text.data(), text.data() + text.size());
    return true;
}

bool TakeInteger(Json::Value &value, PlainJson &json) {
    std::int64_t number = 0;
    if (!json.TakeInteger(number)) {
        return false;
    }
    value = Json::Value(static_cast<Json::Int64>(number));
    return true;
}

// Of members with the same name the last one counts.
bool TakeMember(Json::Value &object, PlainJson &json) {
    std::string_view name;
    return json.TakeString(name) && json.Take(':') &&
           TakeValue(*object.demand(name.data(), name.data() + name.size()), json);
}

bool TakeValue(Json::Value &value, PlainJson &json) {
    switch (json.Next()) {
    case '"':
        return TakeString(value, json);
    case 't':
        return TakeWord(value, json, "true", true);
    case 'f':
        return TakeWord(value, json, "false", false);
    case 'n':
        return TakeWord(value, json, "null", Json::Value());
    case '{':
        value = Json::Value(Json::objectValue);
        return json.TakeBetween('{', '}', [&] { return TakeMember(value, json); });
    case '[':
        value = Json::Value(Json::arrayValue);
        return json.TakeBetween('[', ']',
                                [&] { return TakeValue(value.append(Json::Value()), json); });
    default:
        return TakeInteger(value, json);
    }
}

bool PutValue(std::string &text, const Json::Value &value, int depth);

bool IsEscaped(char c) {
    return static_cast<unsigned char>(c) < ' ' || c == '"' || c == '\\';
}

bool PutString(std::string &text, const char *begin, const char *end) {
    text += '"';
    text.append(begin, end);
    text += '"';
    return std::none_of(begin, end, IsEscaped);
}

bool PutString(std::string &text, const Json::Value &value) {
    const char *begin = nullptr;
    const char *end = nullptr;
    return value.getString(&begin, &end) && PutString(text, begin, end);
}

bool PutObject(std::string &text, const Json::Value &object, int depth) {
    text += '{';
    for (auto member = object.begin(); member != object.end(); ++member) {
        text += member != object.begin() ? "," : "";
        const char *end = nullptr;
        const char *const name = member.memberName(&end);
        if (!PutString(text, name, end)) {
            return false;
        }
        text += ':';
        if (!PutValue(text, *member, depth)) {
            return false;
        }
    }
    text += '}';
    return true;
}

bool PutArray(std::string &text, const Json::Value &array, int depth) {
    text += '[';
    Json::ArrayIndex count = 0;
    for (const Json::Value &element : array) {
        text += count++ != 0 ? "," : "";
        if (!PutValue(text, element, depth)) {
            return false;
        }
    }
    text += ']';
    return count == array.size(); // else it has holes
}

bool PutValue(std::string &text, const Json::Value &value, int depth) {
    switch (value.type()) {
    case Json::nullValue:
        text += "null";
        return true;
    case Json::booleanValue:
        text += value.asBool() ? "true" : "false";
        return true;
    case Json::intValue:
        text += std::to_string(value.asLargestInt());
        return true;
    case Json::uintValue:
        text += std::to_string(value.asLargestUInt());
        return true;
    case Json::stringValue:
        return PutString(text, value);
    case Json::arrayValue:
        return depth < kMaxPlainDepth && PutArray(text, value, depth + 1);
    case Json::objectValue:
        return depth < kMaxPlainDepth && PutObject(text, value, depth + 1);
    default:
        return false;
    }
}

} // namespace

bool ReadPlainValue(Json::Value &value, std::string_view text) {
    PlainJson json(text);
    return TakeValue(value, json) && json.AtEnd();
}

bool WritePlainValue(std::string &text, const Json::Value &value) {
    return PutValue(text, value, 0);
}

} // namespace VANO::FILEINDEX
