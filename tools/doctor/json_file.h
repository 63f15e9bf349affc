#ifndef FILEINDEXCTL_DOCTOR_JSON_FILE_H
#define FILEINDEXCTL_DOCTOR_JSON_FILE_H

#include <cstddef>
#include <json/value.h>
#include <optional>
#include <platform/diagnosis.h>
#include <string>
#include <vector>

#include "doctor/finding.h"

namespace CTL::DOCTOR {

// Where a text stops being JSON. Lines and columns count from 1, columns in bytes.
struct JsonMistake {
    std::size_t line = 0; // 0 when the place cannot be told
    std::size_t column = 0;
    std::string what;
};

// A file that should hold JSON, by the library's own rules. Whatever stands in its place, looking
// neither blocks nor takes memory without end.
struct JsonFile {
    enum class State { kMissing, kUnreadable, kMalformed, kGood };

    std::string path;
    State state = State::kMissing;
    int error = 0; // kUnreadable: the errno
    JsonMistake mistake;
    Json::Value value;
};

[[nodiscard]] JsonFile ReadJsonFile(const std::string &path);

// What is wrong with a file that is unreadable or malformed; none otherwise. `prefix` begins the
// finding's code: "<prefix>-unreadable", "<prefix>-malformed".
[[nodiscard]] std::optional<Finding> MistakeOf(const JsonFile &file, const std::string &prefix);

// The same of a file that the platform cannot use: "<prefix>-shape" where it is JSON.
[[nodiscard]] Finding MistakeOf(const VANO::PLATFORM::StoreFault &fault, const std::string &prefix);

} // namespace CTL::DOCTOR

#endif
