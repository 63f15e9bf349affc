#ifndef FILEINDEX_UTILS_EVENT_LINE_H
#define FILEINDEX_UTILS_EVENT_LINE_H

#include <string_view>

namespace VANO::FILEINDEX {

// One event of a queue file: a line that is a JSON object with an "event" that converts to an
// unsigned integer and a string "path". The paths belong to whoever read the event.
struct QueueEvent {
    unsigned int code;
    std::string_view path;
    std::string_view formerPath; // "path_old" of a moved item; empty when absent or no text
};

// Reads an event as it is usually written, at a fraction of the JSON library's cost. The paths are
// parts of the line. False when the line is no event, or one that only the JSON library can tell:
// `event` is unspecified then.
[[nodiscard]] bool ReadPlainEvent(QueueEvent &event, std::string_view line);

} // namespace VANO::FILEINDEX

#endif
