#include "core/event.h"

#include <algorithm>
#include <limits>

#include "base/plain_json.h"

namespace VANO::FILEINDEX {

namespace {

bool SkipValue(PlainJson &json);

bool SkipMember(PlainJson &json) {
    std::string_view name;
    return json.TakeString(name) && json.Take(':') && SkipValue(json);
}

bool SkipValue(PlainJson &json) {
    std::string_view text;
    std::int64_t number = 0;
    switch (json.Next()) {
    case '"':
        return json.TakeString(text);
    case 't':
        return json.TakeExactly("true");
    case 'f':
        return json.TakeExactly("false");
    case 'n':
        return json.TakeExactly("null");
    case '{':
        return json.TakeBetween('{', '}', [&] { return SkipMember(json); });
    case '[':
        return json.TakeBetween('[', ']', [&] { return SkipValue(json); });
    default:
        return json.TakeInteger(number);
    }
}

bool TakeCode(unsigned int &code, PlainJson &json) {
    std::int64_t number = 0;
    if (!json.TakeInteger(number) || number < 0 ||
        number > std::numeric_limits<unsigned int>::max()) {
        return false;
    }
    code = static_cast<unsigned int>(number);
    return true;
}

// What is known of an event so far. Of members with the same name the last one counts.
struct Draft {
    QueueEvent &event;
    bool hasCode = false;
    bool hasPath = false;

    // A name that is written otherwise, with white space behind it, is the JSON library's.
    [[nodiscard]] bool TakeMember(PlainJson &json) {
        if (json.TakeExactly(R"("path":)")) {
            return hasPath = json.TakeString(event.path);
        }
        if (json.TakeExactly(R"("event":)")) {
            return hasCode = TakeCode(event.code, json);
        }
        if (json.TakeExactly(R"("path_old":)")) {
            return json.TakeString(event.formerPath);
        }
        std::string_view name;
        return json.TakeString(name) && name != "path" && name != "event" && name != "path_old" &&
               json.Take(':') && SkipValue(json);
    }
};

// A JSON string. What must be escaped is left to the JSON library.
std::string Quoted(const std::string &text) {
    const bool isPlain = std::none_of(text.begin(), text.end(), [](char c) {
        return static_cast<unsigned char>(c) < ' ' || c == '"' || c == '\\';
    });
    return isPlain ? '"' + text + '"' : JsonToString(text);
}

std::string_view TextOf(const Json::Value &string) {
    const char *begin = nullptr;
    const char *end = nullptr;
    (void)string.getString(&begin, &end);
    return {begin, static_cast<std::size_t>(end - begin)};
}

} // namespace

bool ReadPlainEvent(QueueEvent &event, std::string_view line) {
    event = {};
    Draft draft{event};
    PlainJson json(line);
    if (!json.Take('{')) {
        return false;
    }
    do {
        if (!draft.TakeMember(json)) {
            return false;
        }
    } while (json.Take(','));
    if (event.code != kEventMoved) {
        event.formerPath = {};
    }
    return json.Take('}') && json.AtEnd() && draft.hasCode && draft.hasPath;
}

bool EventParser::Parse(QueueEvent &event, std::string_view line) {
    return line.size() <= kMaxEventBytes &&
           (ReadPlainEvent(event, line) || ParseWithLibrary(event, line));
}

// Decides every line that is not plain.
bool EventParser::ParseWithLibrary(QueueEvent &event, std::string_view line) {
    if (!parser_.ParseWithLibrary(parsed_, line) || !parsed_.isObject()) {
        return false;
    }
    const Json::Value &object = parsed_; // looking a member up must not make it
    const Json::Value &path = object["path"];
    const Json::Value &formerPath = object["path_old"];
    if (!object.isMember("event") || !object["event"].isConvertibleTo(Json::uintValue) ||
        !path.isString()) {
        return false;
    }
    event.code = object["event"].asUInt();
    event.path = TextOf(path);
    const bool isMove = event.code == kEventMoved;
    formerPath_ = isMove && formerPath.isConvertibleTo(Json::stringValue) ? formerPath.asString()
                                                                          : std::string();
    event.formerPath = formerPath_;
    return true;
}

// The members in the JSON library's order; as one value they would be copied and walked through.
std::string EventLine(int code, const std::string &fullPath, const Json::Value &data) {
    return R"({"data":)" + JsonToString(data) + R"(,"event":)" + std::to_string(code) +
           R"(,"path":)" + Quoted(fullPath) + "}\n";
}

} // namespace VANO::FILEINDEX
