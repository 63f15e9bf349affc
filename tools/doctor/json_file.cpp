#include "doctor/json_file.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <json/reader.h>
#include <memory>

#include "base/file_io.h"
#include "base/json_io.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::JsonFromString;
using VANO::FILEINDEX::kMaxJsonFileBytes;
using VANO::FILEINDEX::ReadFile;

constexpr std::size_t kBytesBefore = 40; // of the quoted line, on each side of the mistake
constexpr std::size_t kBytesAfter = 20;

struct Place {
    std::size_t offset;
    const char *what;
};

// What the JSON library takes and the settings' rules do not.
std::optional<Place> FindExtension(const std::string &text) {
    bool inString = false;
    bool afterComma = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (inString) {
            i += c == '\\' ? 1 : 0;
            inString = c != '"';
            continue;
        }
        if (c == '/') {
            return Place{i, "a comment, which JSON does not have"};
        }
        if (c == '\0') {
            return Place{i, "a zero byte"};
        }
        if (afterComma && (c == '}' || c == ']')) {
            return Place{i, "a comma with nothing after it"};
        }
        inString = c == '"';
        if (c != ' ' && c != '\t' && c != '\n' && c != '\r') {
            afterComma = c == ',';
        }
    }
    return std::nullopt;
}

void PlaceAt(JsonMistake &mistake, const std::string &text, std::size_t offset) {
    const auto end = text.begin() + static_cast<std::ptrdiff_t>(offset);
    mistake.line = static_cast<std::size_t>(std::count(text.begin(), end, '\n')) + 1;
    const std::size_t newline = offset == 0 ? std::string::npos : text.rfind('\n', offset - 1);
    mistake.column = newline == std::string::npos ? offset + 1 : offset - newline;
}

// The first of the JSON library's complaints: "* Line 3, Column 7\n  What it is\n...".
bool ReadComplaint(JsonMistake &mistake, const std::string &complaints) {
    if (std::sscanf(complaints.c_str(), "* Line %zu, Column %zu", // NOLINT(cert-err34-c)
                    &mistake.line, &mistake.column) != 2) {
        mistake.line = 0;
        return false;
    }
    const std::size_t begin = complaints.find("\n  ");
    if (begin != std::string::npos) {
        const std::size_t end = complaints.find('\n', begin + 3);
        mistake.what = Shown(complaints.substr(begin + 3, end - begin - 3));
    }
    return true;
}

bool IsInsideCharacter(char c) {
    return (static_cast<unsigned char>(c) & 0xC0U) == 0x80U;
}

std::string LineOf(const std::string &text, std::size_t number) {
    std::size_t begin = 0;
    for (std::size_t line = 1; line < number; ++line) {
        const std::size_t newline = text.find('\n', begin);
        if (newline == std::string::npos) {
            return {};
        }
        begin = newline + 1;
    }
    return text.substr(begin, text.find('\n', begin) - begin);
}

void Quote(JsonMistake &mistake, const std::string &text) {
    const std::string line = LineOf(text, mistake.line);
    const std::size_t at = std::min(mistake.column - 1, line.size());
    std::size_t begin = at > kBytesBefore ? at - kBytesBefore : 0;
    std::size_t end = std::min(at + kBytesAfter, line.size());
    while (begin < at && begin > 0 && IsInsideCharacter(line[begin])) {
        ++begin;
    }
    while (end < line.size() && IsInsideCharacter(line[end])) {
        ++end;
    }
    const std::string before = (begin > 0 ? "..." : "") + Shown(line.substr(begin, at - begin));
    mistake.quote = {before + Shown(line.substr(at, end - at)) + (end < line.size() ? "..." : ""),
                     std::string(Columns(before), ' ') + "^"};
}

JsonMistake FindMistake(const std::string &text) {
    JsonMistake mistake;
    Json::CharReaderBuilder builder;
    builder["failIfExtra"] = true;
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    Json::Value value;
    std::string complaints;
    try {
        (void)reader->parse(text.data(), text.data() + text.size(), &value, &complaints);
    } catch (const Json::Exception &) {
        mistake.what = "it is nested too deep";
        return mistake;
    }
    if (!ReadComplaint(mistake, complaints)) {
        const std::optional<Place> place = FindExtension(text);
        if (place) {
            PlaceAt(mistake, text, place->offset);
            mistake.what = place->what;
        }
    }
    if (mistake.line > 0 && mistake.column > 0) {
        Quote(mistake, text);
    }
    return mistake;
}

std::string PlaceOf(const JsonMistake &mistake) {
    return mistake.line == 0 ? ""
                             : ": line " + std::to_string(mistake.line) + ", column " +
                                   std::to_string(mistake.column);
}

} // namespace

JsonFile ReadJsonFile(const std::string &path) {
    JsonFile file;
    file.path = path;
    std::string text;
    if (!ReadFile(text, path, kMaxJsonFileBytes)) {
        file.error = errno;
        file.state =
            file.error == ENOENT ? JsonFile::State::kMissing : JsonFile::State::kUnreadable;
        return file;
    }
    if (!JsonFromString(file.value, text)) {
        file.state = JsonFile::State::kMalformed;
        file.mistake = FindMistake(text);
        return file;
    }
    file.state = JsonFile::State::kGood;
    return file;
}

std::optional<Finding> MistakeOf(const JsonFile &file, const std::string &prefix) {
    if (file.state == JsonFile::State::kUnreadable) {
        return Unreadable(prefix + "-unreadable", file.path, file.error);
    }
    if (file.state != JsonFile::State::kMalformed) {
        return std::nullopt;
    }
    const JsonMistake &mistake = file.mistake;
    Finding finding = Error(prefix + "-malformed", file.path,
                            Shown(file.path) + " is not JSON" + PlaceOf(mistake));
    finding.why = mistake.what;
    finding.quote = mistake.quote;
    if (mistake.line > 0) {
        finding.details["line"] = Json::UInt64(mistake.line);
        finding.details["column"] = Json::UInt64(mistake.column);
    }
    return finding;
}

} // namespace CTL::DOCTOR
