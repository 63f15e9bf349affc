#ifndef FILEINDEX_CORE_EVENT_H
#define FILEINDEX_CORE_EVENT_H

#include <cstddef>
#include <json/value.h>
#include <string>
#include <string_view>

#include "base/json_io.h"

// One event of a queue file: a line that is a JSON object.

namespace VANO::FILEINDEX {

// Codes of the events that are written or looked at here.
constexpr int kEventMoved = 0x100; // written by the monitor, with "path_old"
constexpr int kEventReindexFolder = 0x10000;
constexpr int kEventSettingChanged = 0x20000;

// A longer line is no event, and none is written. Far beyond any real one: it bounds the memory
// that a line written by a share's user can take.
constexpr std::size_t kMaxEventBytes = std::size_t{1024} * 1024;

struct QueueEvent {
    unsigned int code;
    std::string_view path;
    std::string_view formerPath; // where a moved item was; empty when absent, and for other codes
};

// Reads events one after another: lines with an "event" that converts to an unsigned integer and a
// string "path".
class EventParser {
  public:
    // Whether a line is an event; `event` is unspecified when it is not. Its paths are valid as
    // long as the line, and until the next call.
    [[nodiscard]] bool Parse(QueueEvent &event, std::string_view line);

  private:
    [[nodiscard]] bool ParseWithLibrary(QueueEvent &event, std::string_view line);

    JsonParser parser_;
    Json::Value parsed_;
    std::string formerPath_;
};

// Reads an event as it is usually written, at a fraction of the JSON library's cost. The paths are
// parts of the line. False when the line is no event, or one that only the JSON library can tell:
// `event` is unspecified then.
[[nodiscard]] bool ReadPlainEvent(QueueEvent &event, std::string_view line);

// The line of an event, with its newline.
[[nodiscard]] std::string EventLine(int code, const std::string &fullPath, const Json::Value &data);

} // namespace VANO::FILEINDEX

#endif
