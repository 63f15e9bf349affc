#include "utils/event_line.h"

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
    return json.Take('}') && json.AtEnd() && draft.hasCode && draft.hasPath;
}

} // namespace VANO::FILEINDEX
