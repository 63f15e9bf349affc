#ifndef FILEINDEXCTL_STATE_QUEUE_EVENT_H
#define FILEINDEXCTL_STATE_QUEUE_EVENT_H

#include <json/value.h>
#include <string>
#include <string_view>

#include "base/json_io.h"

namespace CTL {

// What an event of a queue file is about, as full paths.
struct QueueEvent {
    std::string path;
    std::string formerPath; // where a moved item was; empty for everything else
};

// Reads the lines of queue files, one after another.
class QueueEventParser {
  public:
    // False when the line is no event: no JSON object with an "event" that is an unsigned integer
    // and a string "path". `event` is then unspecified.
    [[nodiscard]] bool Parse(QueueEvent &event, std::string_view line);

  private:
    VANO::FILEINDEX::JsonParser parser_;
    Json::Value parsed_;
};

} // namespace CTL

#endif
