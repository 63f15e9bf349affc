#include "support/json_grammar.h"

#include <array>
#include <limits>
#include <utility>

#include "support/naive.h"

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t *data, std::size_t size, std::size_t maxSize);

namespace VANO::FUZZ {

namespace {

constexpr std::size_t kDeepest = 1100; // just beyond what the JSON library reads

// Names, values and paths of the library's documents, and what is easily mistaken for them.
constexpr std::array kWords = {
    "",         "/",           "/photos",    "/photos/a",  "/photos/2016",
    "/music",   "/a",          "/a/a",       "photos",     "xphotos/a",
    "/photos/", "/Фото/a",     "/nowhere/a", "music",      "path",
    "name",     "document",    "audio",      "video",      "photo",
    "event",    "path_old",    "data",       "type",       "folder_path",
    "status",   "is_valid",    "additional", "DESC",       "ASC",
    "total",    "offset",      "limit",      "sort_by",    "sort_direction",
    "no_space", "resume_time", "share_name", "pause",      "need_reindex",
    "resume",   "encrypted",   "read_only",  "encryption", "/volume1/photos",
    "upsert",   "delete",      "reindex",    "update",     "/volume1/photos/a",
    "get",      "command",     "folders",    "steps",      "/volume1/music/2016",
    "Ünï",      "ßtraße",      "\xff\xfe",   "..",         "/volume2/Photos",
    ".",        "/..",         "#recycle",   "@eaDir",     "/volume1/photos/2016/b"};

} // namespace

std::size_t JsonGrammar::Below(std::size_t count) {
    return std::uniform_int_distribution<std::size_t>(0, count - 1)(random_);
}

std::string JsonGrammar::MutateBytes(std::string bytes, std::size_t maxSize) {
    const std::size_t size = std::min(bytes.size(), maxSize);
    bytes.resize(maxSize);
    bytes.resize(LLVMFuzzerMutate(reinterpret_cast<std::uint8_t *>(bytes.data()), size, maxSize));
    return bytes;
}

std::string JsonGrammar::NewText() {
    std::string text = kWords[Below(kWords.size())];
    if (OnceIn(4)) {
        text += kWords[Below(kWords.size())];
    }
    if (OnceIn(16)) {
        text.insert(Below(text.size() + 1), 1, static_cast<char>(Below(256)));
    }
    return text;
}

Json::Value JsonGrammar::NewValue() {
    switch (Below(8)) {
    case 0:
        return Json::Value(static_cast<Json::ValueType>(Below(Json::objectValue + 1)));
    case 1:
        return OnceIn(2);
    case 2:
        return static_cast<int>(Below(4)) - 1;
    case 3: { // event codes, and the ends of the number types
        constexpr std::array<Json::Int64, 7> kNumbers = {
            256, 65536, 131072, 0x7fffffff, 0x80000000, 0xffffffff, 0x100000000};
        return kNumbers[Below(kNumbers.size())];
    }
    case 4:
        return OnceIn(2) ? Json::Value(std::numeric_limits<Json::Int64>::min())
                         : Json::Value(std::numeric_limits<Json::UInt64>::max());
    case 5: {
        constexpr std::array kReals = {0.5, -0.0, 65536.0, 4294967296.5, 1e308, 5e-324, 256.75};
        return kReals[Below(kReals.size())];
    }
    default:
        return NewText();
    }
}

void JsonGrammar::Collect(std::vector<Place> &places, const Place &place) {
    places.push_back(place);
    Json::Value &value = *place.value;
    for (auto member = value.begin(); member != value.end(); ++member) {
        Collect(places, {&*member, &value, value.isObject() ? member.name() : std::string()});
    }
}

JsonGrammar::Place JsonGrammar::Pick(Json::Value &document) {
    std::vector<Place> places;
    Collect(places, {&document, nullptr, {}});
    return places[Below(places.size())];
}

void JsonGrammar::ChangeMembers(Json::Value &value) {
    if (value.isArray() && !value.empty() && OnceIn(2)) {
        Json::Value removed;
        const auto index = static_cast<Json::ArrayIndex>(Below(value.size()));
        value.removeIndex(index, &removed);
        if (OnceIn(2)) { // moved to the end, or twice as often there
            value.append(removed);
        }
    } else if (value.isArray()) {
        value.append(value.empty() || OnceIn(2)
                         ? NewValue()
                         : Json::Value(value[static_cast<Json::ArrayIndex>(Below(value.size()))]));
    } else if (!value.empty() && OnceIn(3)) {
        const auto names = value.getMemberNames();
        value.removeMember(names[Below(names.size())]);
    } else {
        value[NewText()] = NewValue();
    }
}

void JsonGrammar::ChangeValue(Json::Value &value) {
    if ((value.isArray() || value.isObject()) && !OnceIn(8)) {
        ChangeMembers(value);
    } else if (value.isString() && OnceIn(3)) {
        value = MutateBytes(value.asString(), value.asString().size() + 8);
    } else if (value.isString() && OnceIn(2)) {
        std::string text = value.asString();
        value = text.insert(Below(text.size() + 1), NewText());
    } else {
        value = NewValue();
    }
}

void JsonGrammar::Nest(Json::Value &value) {
    const std::size_t depth = OnceIn(32) ? Below(kDeepest) : 1;
    const bool inArray = OnceIn(2);
    for (std::size_t i = 0; i < depth; ++i) {
        Json::Value outer(inArray ? Json::arrayValue : Json::objectValue);
        (inArray ? outer[0] : outer[NewText()]).swap(value);
        value.swap(outer);
    }
}

void JsonGrammar::Rename(const Place &place) {
    Json::Value moved;
    moved.swap(*place.value);
    Json::Value &parent = *place.parent;
    parent.removeMember(place.key);
    parent[NewText()].swap(moved);
}

void JsonGrammar::Change(Json::Value &document) {
    const Place place = Pick(document);
    switch (Below(8)) {
    case 0:
        Nest(*place.value);
        break;
    case 1:
        if (place.parent != nullptr && place.parent->isObject()) {
            Rename(place);
            break;
        }
        [[fallthrough]];
    case 2: {
        const Json::Value copy = *Pick(document).value;
        *place.value = copy;
        break;
    }
    default:
        ChangeValue(*place.value);
    }
}

// Writes a character in another way that JSON has for it.
std::string JsonGrammar::Escape(std::string text) {
    static constexpr std::array<std::pair<char, const char *>, 3> kForms = {
        {{'/', "\\/"}, {'/', "\\u002f"}, {'p', "\\u0070"}}};
    const auto &[character, form] = kForms[Below(kForms.size())];
    const std::size_t at = text.find(character, Below(text.size() + 1));
    return at == std::string::npos ? text : text.replace(at, 1, form);
}

// Puts something beside a bracket, comma or colon that a reader may take for JSON and should not.
std::string JsonGrammar::Spoil(std::string text) {
    static const std::array<std::string, 8> kSpoilers = {
        ",", "/**/", "//\n", std::string(1, '\0'), "}", " x", "\xEF\xBB\xBF", "\v"};
    std::vector<std::size_t> places{0, text.size()};
    for (std::size_t i = text.find_first_of("{}[],:"); i != std::string::npos;
         i = text.find_first_of("{}[],:", i + 1)) {
        places.push_back(i);
        places.push_back(i + 1);
    }
    return text.insert(places[Below(places.size())], kSpoilers[Below(kSpoilers.size())]);
}

std::string JsonGrammar::Mutate(const std::string &text, std::size_t maxSize) {
    std::optional<Json::Value> document = Parse(text);
    if (!document || OnceIn(16)) {
        return MutateBytes(text, maxSize);
    }
    for (std::size_t changes = 1 + Below(3); changes > 0; --changes) {
        Change(*document);
    }
    std::string changed = Text(*document);
    if (OnceIn(8)) {
        changed = Escape(changed);
    }
    if (OnceIn(16)) {
        changed = Spoil(changed);
    }
    return changed.size() <= maxSize ? changed : MutateBytes(text, maxSize);
}

std::string JsonGrammar::Cross(const std::string &text, const std::string &other,
                               std::size_t maxSize) {
    std::optional<Json::Value> document = Parse(text);
    std::optional<Json::Value> source = Parse(other);
    if (!document || !source) {
        return MutateBytes(text, maxSize);
    }
    const Json::Value part = *Pick(*source).value;
    *Pick(*document).value = part;
    std::string crossed = Text(*document);
    return crossed.size() <= maxSize ? crossed : MutateBytes(text, maxSize);
}

} // namespace VANO::FUZZ
