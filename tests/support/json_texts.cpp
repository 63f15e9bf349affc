#include "support/json_texts.h"

#include <cstdlib>

namespace VANO::TESTS {

std::size_t TextCount() {
    constexpr std::size_t kUsual = 200'000;
    const char *const wanted = std::getenv("FILEINDEX_TEXTS");
    return wanted != nullptr ? std::strtoul(wanted, nullptr, 10) : kUsual;
}

// Not a standard distribution: those differ between standard libraries.
std::size_t JsonTexts::Below(std::size_t bound) {
    return random_() % bound;
}

std::string_view JsonTexts::Pick(std::initializer_list<std::string_view> texts) {
    return texts.begin()[Below(texts.size())];
}

std::string JsonTexts::Space() {
    using namespace std::string_view_literals;
    return Chance(odd_ ? 15 : 3) ? std::string(Pick({" ", "\t", "\r", " \t \r", "  ", "\v"sv}))
                                 : std::string();
}

std::string JsonTexts::Character() {
    using namespace std::string_view_literals;
    if (!odd_ || !Chance(10)) {
        return std::string(
            Pick({"a", "b", "/", ",", "}", "]", "{", "[", ":", "ü", "写", " ", "7"}));
    }
    return std::string(Pick(
        {"\\\"",    "\\\\",         "\\/",   "\\b", "\\n",  "\\u00fc", "\\u0000", "\\ud83d\\ude00",
         "\\ud83d", "\\udc00x",     "\\u12", "\\x", "\x01", "\t",      "\0"sv,    "\xff",
         "\xc3",    "\xed\xa0\x80", "\x7f",  "'",   "\\",   "//",      "/*",      "\xef\xbb\xbf"}));
}

std::string JsonTexts::String() {
    std::string text = "\"";
    for (std::size_t length = Below(Chance(20) ? 100 : 8); length > 0; --length) {
        text += Character();
    }
    return text + "\"";
}

std::string JsonTexts::Number() {
    if (!odd_ || Chance(40)) {
        return std::to_string(Below(Chance(50) ? 10 : 1'000'000'000));
    }
    return std::string(Pick({"-1",
                             "-0",
                             "0",
                             "00",
                             "007",
                             "-007",
                             "--1",
                             "-",
                             "+1",
                             "1.5",
                             "-1.5e3",
                             "1e400",
                             "1e-400",
                             "1.",
                             ".5",
                             "1e",
                             "0x10",
                             "NaN",
                             "Infinity",
                             "-Infinity",
                             "65536.0",
                             "6.5536e4",
                             "4294967295",
                             "4294967296",
                             "4294967295.5",
                             "99999999999999999",
                             "999999999999999999",
                             "1000000000000000000",
                             "-999999999999999999",
                             "-9223372036854775808",
                             "9223372036854775807",
                             "9223372036854775808",
                             "18446744073709551615",
                             "18446744073709551616",
                             "123456789012345678901234567890",
                             "1 2",
                             "- 1",
                             "1-",
                             "1a"}));
}

std::string JsonTexts::Value(int depth) {
    const std::size_t kind = Below(depth < 3 ? 10 : 7);
    if (kind < 3) {
        return String();
    }
    if (kind < 5) {
        return Number();
    }
    if (kind < 7) {
        return std::string(Pick({"true", "false", "null", odd_ ? "tru" : "true",
                                 odd_ ? "True" : "false", odd_ ? "nullx" : "null"}));
    }
    std::string inside;
    for (std::size_t count = Below(4); count > 0; --count) {
        inside += inside.empty() ? "" : ",";
        inside +=
            kind == 7 ? Member(String(), Value(depth + 1)) : Space() + Value(depth + 1) + Space();
    }
    if (odd_ && Chance(2)) { // deeper than anything reads
        const std::size_t levels = 10 + Below(1200);
        return std::string(levels, '[') + inside + std::string(levels, ']');
    }
    return kind == 7 ? Object(inside) : "[" + Space() + inside + "]";
}

std::string JsonTexts::Member(const std::string &name, const std::string &value) {
    return Space() + name + Space() + ":" + Space() + value + Space();
}

std::string JsonTexts::Object(const std::string &members) {
    return "{" + Space() + members + "}";
}

std::string JsonTexts::EventMember() {
    switch (Below(odd_ ? 7 : 5)) {
    case 0:
    case 1:
        return Member("\"path\"", odd_ && Chance(10) ? Value(0) : String());
    case 2:
    case 3:
        return Member("\"event\"", odd_ && Chance(10) ? Value(0) : Number());
    case 4:
        return Member("\"path_old\"", odd_ && Chance(20) ? Value(0) : String());
    case 5:
        return Member(std::string(Pick({"\"\"", "\"Path\"", "\"path \"", "\"\\u0070ath\"",
                                        "\"event_\"", "'path'", "path", "1"})),
                      Value(0));
    default:
        return Member("\"data\"", Value(0));
    }
}

std::string JsonTexts::Event() {
    odd_ = Chance(50);
    std::string members = Member("\"event\"", Number()) + "," + Member("\"path\"", String());
    if (Chance(30)) {
        members.clear();
    }
    for (std::size_t count = Below(3); count > 0; --count) {
        members += (members.empty() ? "" : ",") + EventMember();
    }
    const std::string text = Space() + Object(members) + Space();
    return odd_ && Chance(60) ? Damaged(text) : text;
}

std::string JsonTexts::Folder() {
    std::string members = Member("\"path\"", String()) + "," + Member("\"name\"", String());
    for (const char *type : {"\"document\"", "\"audio\"", "\"video\"", "\"photo\""}) {
        members += "," + Member(type, odd_ && Chance(10) ? Value(0) : "true");
    }
    return Object(members);
}

std::string JsonTexts::Settings() {
    odd_ = Chance(50);
    std::string members;
    for (std::size_t count = Below(6); count > 0; --count) {
        members +=
            (members.empty() ? "" : ",") + Member(String(), Chance(50) ? Folder() : Value(0));
    }
    const std::string text = Space() + (Chance(90) ? Object(members) : Value(0)) + Space();
    return odd_ && Chance(60) ? Damaged(text) : text;
}

// One to three bytes or pieces are changed.
std::string JsonTexts::Damaged(std::string text) {
    using namespace std::string_view_literals;
    for (std::size_t count = 1 + Below(3); count > 0 && !text.empty(); --count) {
        const std::size_t at = Below(text.size());
        switch (Below(6)) {
        case 0:
            text[at] = static_cast<char>(Below(256));
            break;
        case 1:
            text.erase(at, 1 + Below(3));
            break;
        case 2:
            text.insert(at, text.substr(Below(text.size()), 1 + Below(12)));
            break;
        case 3:
            text.resize(at);
            break;
        case 4:
            text.insert(at, Pick({"{",    "}",    "[",  "]",    ",",    ":",           "\"",
                                  "\\",   "0",    "-",  ".",    "e",    "/",           "//x\n",
                                  "/**/", "\0"sv, "\n", "null", "true", "\xef\xbb\xbf"}));
            break;
        default:
            text.insert(Chance(50) ? 0 : text.size(),
                        Pick({"{}", " ", "\xef\xbb\xbf", "\0"sv, "x", ",", "\"", "1", "\0{}"sv}));
        }
    }
    return text;
}

} // namespace VANO::TESTS
