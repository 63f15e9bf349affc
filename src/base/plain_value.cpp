#include "base/plain_value.h"

#include "base/plain_json.h"

namespace VANO::FILEINDEX {

namespace {

constexpr int kMaxDepth = 16; // far below what the JSON library refuses

bool TakeValue(Json::Value &value, PlainJson &json, int depth);

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
bool TakeMember(Json::Value &object, PlainJson &json, int depth) {
    std::string_view name;
    return json.TakeString(name) && json.Take(':') &&
           TakeValue(*object.demand(name.data(), name.data() + name.size()), json, depth);
}

bool TakeElement(Json::Value &array, PlainJson &json, int depth) {
    return TakeValue(array.append(Json::Value()), json, depth);
}

// An object or array: `take` takes one thing that stands between its commas.
bool TakeAll(Json::Value &container, PlainJson &json, int depth, char open, char close,
             bool (*take)(Json::Value &, PlainJson &, int)) {
    if (depth == kMaxDepth || !json.Take(open)) {
        return false;
    }
    if (json.Take(close)) {
        return true;
    }
    do {
        if (!take(container, json, depth + 1)) {
            return false;
        }
    } while (json.Take(','));
    return json.Take(close);
}

bool TakeValue(Json::Value &value, PlainJson &json, int depth) {
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
        return TakeAll(value, json, depth, '{', '}', TakeMember);
    case '[':
        value = Json::Value(Json::arrayValue);
        return TakeAll(value, json, depth, '[', ']', TakeElement);
    default:
        return TakeInteger(value, json);
    }
}

} // namespace

bool ReadPlainValue(Json::Value &value, std::string_view text) {
    PlainJson json(text);
    return TakeValue(value, json, 0) && json.AtEnd();
}

} // namespace VANO::FILEINDEX
