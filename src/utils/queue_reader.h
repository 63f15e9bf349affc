#ifndef FILEINDEX_UTILS_QUEUE_READER_H
#define FILEINDEX_UTILS_QUEUE_READER_H

#include <array>
#include <json/value.h>
#include <string>

#include "base/json_io.h"
#include "base/unique_fd.h"

namespace VANO::FILEINDEX {

// One event of a queue file: a line that is a JSON object with an "event" that converts to an
// unsigned integer and a string "path".
struct QueueEvent {
    unsigned int code;
    std::string path;
    std::string formerPath; // "path_old" of a moved item; empty when absent or no text
};

// Reads a queue file line by line. Memory grows with the longest line alone, not with the file, and
// ends at 64 MiB: a longer line is cut there and is then no event.
class QueueReader {
  public:
    // Opens a share's queue, a regular file; no symbolic link in the share is followed to it.
    explicit QueueReader(const std::string &path);

    // Whether the queue could be opened; errno says why not.
    [[nodiscard]] bool IsOpen() const { return static_cast<bool>(file_); }

    // The next line without its newline; the last one may lack it. False at the end of the file or
    // at a read error.
    [[nodiscard]] bool NextLine(std::string &line);

    // Whether a line is an event; `event` is unspecified when it is not.
    [[nodiscard]] bool ParseEvent(QueueEvent &event, const std::string &line);

  private:
    [[nodiscard]] bool Fill();

    JsonParser parser_;
    Json::Value parsed_;
    UniqueFd file_; // opened last, for errno
    std::array<char, std::size_t{64} * 1024> buffer_;
    std::size_t begin_ = 0;
    std::size_t end_ = 0;
};

} // namespace VANO::FILEINDEX

#endif
