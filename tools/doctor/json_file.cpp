#include "doctor/json_file.h"

#include <algorithm>
#include <cerrno>
#include <json/reader.h>
#include <unistd.h>

#include "base/file_io.h"
#include "base/json_io.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::JsonFromString;
using VANO::FILEINDEX::kMaxJsonFileBytes;
using VANO::FILEINDEX::ReadFile;

struct Place {
    std::size_t offset;
    std::string what;
};

// What no JSON reader takes; throws where the nesting is too deep. Only this reader of the library
// tells places otherwise than in a text for people.
std::optional<Place> FindError(const std::string &text) {
    Json::Features features; // comments are what FindJsonExtension() explains
    features.strictRoot_ = false;
    Json::Reader reader(features);
    Json::Value value;
    if (!reader.parse(text, value, false)) {
        const Json::Reader::StructuredError error = reader.getStructuredErrors().front();
        return Place{static_cast<std::size_t>(error.offset_start), Shown(error.message)};
    }
    const auto end = static_cast<std::size_t>(value.getOffsetLimit());
    const std::size_t extra = text.find_first_not_of(" \t\r\n", end);
    return extra == std::string::npos
               ? std::nullopt
               : std::optional<Place>(Place{extra, "Extra text after the value"});
}

JsonMistake FindMistake(const std::string &text) {
    const auto extension = VANO::FILEINDEX::FindJsonExtension(text);
    std::optional<Place> place;
    if (extension) {
        place = Place{extension->offset, extension->what};
    }
    try {
        const std::optional<Place> error = FindError(text);
        place = error && (!place || error->offset < place->offset) ? error : place;
    } catch (const Json::Exception &) {
        return {0, 0, "it is nested too deep"};
    }
    if (!place) {
        return {};
    }
    const auto at = text.begin() + static_cast<std::ptrdiff_t>(place->offset);
    const std::size_t newline =
        place->offset == 0 ? std::string::npos : text.rfind('\n', place->offset - 1);
    return {static_cast<std::size_t>(std::count(text.begin(), at, '\n')) + 1,
            newline == std::string::npos ? place->offset + 1 : place->offset - newline,
            place->what};
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
    if (mistake.line > 0) {
        finding.details["line"] = Json::UInt64(mistake.line);
        finding.details["column"] = Json::UInt64(mistake.column);
    }
    return finding;
}

Finding MistakeOf(const VANO::PLATFORM::StoreFault &fault, const std::string &prefix) {
    if (fault.kind == VANO::PLATFORM::StoreFault::Kind::kUnreadable) {
        const int error = ::access(fault.file.c_str(), R_OK) == 0 ? 0 : errno;
        return error == EACCES ? Unreadable(prefix + "-unreadable", fault.file, error)
                               : Error(prefix + "-unreadable", fault.file,
                                       Shown(fault.file) + " cannot be read: " + fault.reason);
    }
    const std::optional<Finding> mistake = MistakeOf(ReadJsonFile(fault.file), prefix);
    return mistake ? *mistake
                   : Error(prefix + "-shape", fault.file,
                           Shown(fault.file) + " cannot be used: " + Shown(fault.reason));
}

} // namespace CTL::DOCTOR
