#include "base/plain_value.h"

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

} // namespace

bool ReadPlainValue(Json::Value &value, std::string_view text) {
    PlainJson json(text);
    return TakeValue(value, json) && json.AtEnd();
}

} // namespace VANO::FILEINDEX
