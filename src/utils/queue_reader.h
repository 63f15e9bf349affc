#ifndef FILEINDEX_UTILS_QUEUE_READER_H
#define FILEINDEX_UTILS_QUEUE_READER_H

#include <cstddef>
#include <json/value.h>
#include <memory>
#include <string>
#include <string_view>

#include "base/json_io.h"
#include "base/unique_fd.h"
#include "utils/event_line.h"

namespace VANO::FILEINDEX {

class MetadataEntry;

// Reads a queue file line by line. Memory grows with the longest line alone, not with the file, and
// ends at 64 MiB: a longer line is cut there and is then no event.
class QueueReader {
  public:
    // Opens a share's queue, a regular file; no symbolic link in the share is followed to it.
    explicit QueueReader(const std::string &path);
    explicit QueueReader(const MetadataEntry &queue);

    // Whether the queue could be opened; errno says why not.
    [[nodiscard]] bool IsOpen() const { return static_cast<bool>(file_); }

    // The next line without its newline; the last one may lack it. It stands until the next call.
    // False at the end of the file or at a read error.
    [[nodiscard]] bool NextLine(std::string_view &line);

    // Whether a line is an event; `event` is unspecified when it is not. Its paths stand as long as
    // the line, and until the next call.
    [[nodiscard]] bool ParseEvent(QueueEvent &event, std::string_view line);

  private:
    // What was read and not yet given out.
    [[nodiscard]] std::string_view Rest() const { return {buffer_.get() + begin_, end_ - begin_}; }
    [[nodiscard]] bool Fill();
    void Grow();
    [[nodiscard]] std::string_view CutLine();
    void SkipRestOfCutLine();
    [[nodiscard]] bool ReadEventWithLibrary(QueueEvent &event, std::string_view line);

    JsonParser parser_;
    Json::Value parsed_;
    std::string formerPath_;
    UniqueFd file_; // opened last, for errno
    std::unique_ptr<char[]> buffer_;
    std::size_t size_ = 0;
    std::size_t begin_ = 0;
    std::size_t end_ = 0;
    bool cut_ = false;
};

} // namespace VANO::FILEINDEX

#endif
