#include "terminal/text.h"

#include <algorithm>
#include <cstdio>
#include <utf8proc.h>

namespace CTL {

namespace {

struct Decoded {
    utf8proc_int32_t character = -1; // -1 for a byte that is not UTF-8
    std::size_t bytes = 1;
};

Decoded DecodeAt(const std::string &text, std::size_t position) {
    Decoded decoded;
    const auto *begin = reinterpret_cast<const utf8proc_uint8_t *>(text.data()) + position;
    const utf8proc_ssize_t bytes = utf8proc_iterate(
        begin, static_cast<utf8proc_ssize_t>(text.size() - position), &decoded.character);
    if (bytes > 0) {
        decoded.bytes = static_cast<std::size_t>(bytes);
    } else {
        decoded.character = -1;
    }
    return decoded;
}

bool ChangesDirection(utf8proc_int32_t character) {
    return character == 0x061C || character == 0x200E || character == 0x200F ||
           (character >= 0x202A && character <= 0x202E) ||
           (character >= 0x2066 && character <= 0x2069);
}

bool NeedsEscape(utf8proc_int32_t character) {
    switch (utf8proc_category(character)) {
    case UTF8PROC_CATEGORY_CC:
    case UTF8PROC_CATEGORY_ZL:
    case UTF8PROC_CATEGORY_ZP:
        return true;
    default:
        return character == '\\' || ChangesDirection(character);
    }
}

std::string Hex(const char *format, unsigned value) {
    char buffer[16];
    (void)std::snprintf(buffer, sizeof(buffer), format, value);
    return buffer;
}

std::string Escape(utf8proc_int32_t character) {
    switch (character) {
    case '\\':
        return "\\\\";
    case '\n':
        return "\\n";
    case '\t':
        return "\\t";
    default:
        return Hex(character < 0x80 ? "\\x%02x" : "\\u%04x", static_cast<unsigned>(character));
    }
}

} // namespace

std::string Shown(const std::string &text) {
    std::string shown;
    for (std::size_t position = 0; position < text.size();) {
        const Decoded decoded = DecodeAt(text, position);
        if (decoded.character < 0) {
            shown += Hex("\\x%02x", static_cast<unsigned char>(text[position]));
        } else if (NeedsEscape(decoded.character)) {
            shown += Escape(decoded.character);
        } else {
            shown.append(text, position, decoded.bytes);
        }
        position += decoded.bytes;
    }
    return shown;
}

std::string ShownJson(const std::string &json) {
    constexpr utf8proc_int32_t kDelete = 0x7f; // below it the writer's own line breaks are too
    std::string shown;
    for (std::size_t position = 0; position < json.size();) {
        const Decoded decoded = DecodeAt(json, position);
        if (decoded.character >= kDelete && NeedsEscape(decoded.character)) {
            shown += Hex("\\u%04x", static_cast<unsigned>(decoded.character));
        } else {
            shown.append(json, position, decoded.bytes);
        }
        position += decoded.bytes;
    }
    return shown;
}

std::size_t Columns(const std::string &shown) {
    std::size_t columns = 0;
    for (std::size_t position = 0; position < shown.size();) {
        const Decoded decoded = DecodeAt(shown, position);
        columns += decoded.character < 0
                       ? 1
                       : static_cast<std::size_t>(utf8proc_charwidth(decoded.character));
        position += decoded.bytes;
    }
    return columns;
}

std::string Padded(const std::string &shown, std::size_t columns) {
    const std::size_t taken = Columns(shown);
    return taken < columns ? shown + std::string(columns - taken, ' ') : shown;
}

std::string Wrapped(const std::string &shown, std::size_t columns, std::size_t indent) {
    std::string text;
    std::size_t taken = 0;
    for (std::size_t position = 0; position < shown.size();) {
        // A word with the spaces before it.
        const std::size_t begin = std::min(shown.find_first_not_of(' ', position), shown.size());
        const std::size_t end = std::min(shown.find(' ', begin), shown.size());
        const std::string word = shown.substr(begin, end - begin);
        if (taken + (begin - position) + Columns(word) > columns && taken > indent) {
            text += '\n' + std::string(indent, ' ');
            taken = indent;
        } else {
            text.append(begin - position, ' ');
            taken += begin - position;
        }
        text += word;
        taken += Columns(word);
        position = end;
    }
    return text;
}

std::string Count(std::size_t number, const std::string &noun) {
    return std::to_string(number) + " " + noun + (number == 1 ? "" : "s");
}

} // namespace CTL
