#ifndef FILEINDEX_CORE_QUEUE_READER_H
#define FILEINDEX_CORE_QUEUE_READER_H

#include <cstddef>
#include <memory>
#include <string_view>

#include "base/unique_fd.h"

namespace VANO::FILEINDEX {

class ShareFile;

// Reads a queue file line by line. Memory grows with the longest line alone, not with the file, and
// ends at kMaxEventBytes: a longer line is cut there and is then no event.
class QueueReader {
  public:
    // Opens a queue, which must be a regular file.
    explicit QueueReader(const ShareFile &queue);

    // Whether the queue could be opened; errno says why not.
    [[nodiscard]] bool IsOpen() const { return static_cast<bool>(file_); }

    // The next line without its newline; the last one may lack it. Valid until the next call.
    // False at the end of the file or at a read error.
    [[nodiscard]] bool NextLine(std::string_view &line);

  private:
    // What was read and not yet given out.
    [[nodiscard]] std::string_view Rest() const { return {buffer_.get() + begin_, end_ - begin_}; }
    [[nodiscard]] bool Fill();
    void Grow();
    [[nodiscard]] std::string_view CutLine();
    void SkipRestOfCutLine();

    UniqueFd file_;
    std::unique_ptr<char[]> buffer_;
    std::size_t firstSize_ = 0; // of the buffer
    std::size_t size_ = 0;
    std::size_t begin_ = 0;
    std::size_t end_ = 0;
    bool cut_ = false;
};

} // namespace VANO::FILEINDEX

#endif
