#include "core/queue_reader.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "core/event.h"
#include "core/share_files.h"

namespace VANO::FILEINDEX {

namespace {

// Ends a line that was cut: no JSON object ends so.
constexpr std::string_view kCutMark = "...";

constexpr std::size_t kLeastBufferBytes = 1024;
constexpr std::size_t kUsualBufferBytes = std::size_t{64} * 1024;
constexpr std::size_t kMaxBufferBytes = kMaxEventBytes + 1; // one more tells that a line is longer

// With room for the mark.
std::unique_ptr<char[]> MakeBuffer(std::size_t size) {
    return std::unique_ptr<char[]>(new char[size + kCutMark.size()]);
}

} // namespace

QueueReader::QueueReader(const ShareFile &queue) : file_(queue.Open(O_RDONLY)) {
    struct stat info {};
    if (file_ && (::fstat(file_.Get(), &info) != 0 || !S_ISREG(info.st_mode))) {
        file_ = UniqueFd();
        errno = EINVAL;
    }
    // A byte more than there seem to be, so that one read finds the end.
    const auto wanted = static_cast<std::size_t>(info.st_size) + 1;
    firstSize_ = std::clamp(wanted, kLeastBufferBytes, kUsualBufferBytes);
}

// Doubles the buffer, up to what the longest line needs.
void QueueReader::Grow() {
    size_ = size_ == 0 ? firstSize_ : std::min(2 * size_, kMaxBufferBytes);
    std::unique_ptr<char[]> larger = MakeBuffer(size_);
    std::copy_n(buffer_.get(), end_, larger.get());
    buffer_ = std::move(larger);
}

// Reads more behind the rest, which moves to the front.
bool QueueReader::Fill() {
    std::copy(buffer_.get() + begin_, buffer_.get() + end_, buffer_.get());
    end_ -= begin_;
    begin_ = 0;
    if (end_ == size_) {
        Grow();
    }
    ssize_t got = 0;
    do {
        got = ::read(file_.Get(), buffer_.get() + end_, size_ - end_);
    } while (got < 0 && errno == EINTR);
    end_ += got > 0 ? static_cast<std::size_t>(got) : 0;
    return got > 0;
}

// The line's first part with the mark, which takes the place of its next byte and of what was not
// read yet.
std::string_view QueueReader::CutLine() {
    char *const line = buffer_.get() + begin_;
    kCutMark.copy(line + kMaxEventBytes, kCutMark.size());
    begin_ = end_;
    cut_ = true;
    return {line, kMaxEventBytes + kCutMark.size()};
}

void QueueReader::SkipRestOfCutLine() {
    while (cut_ && (begin_ != end_ || Fill())) {
        const std::size_t newline = Rest().find('\n');
        cut_ = newline == std::string_view::npos;
        begin_ = cut_ ? end_ : begin_ + newline + 1;
    }
}

bool QueueReader::NextLine(std::string_view &line) {
    SkipRestOfCutLine();
    std::size_t newline = Rest().find('\n');
    while (newline == std::string_view::npos) {
        const std::size_t searched = Rest().size();
        if (searched > kMaxEventBytes) {
            line = CutLine();
            return true;
        }
        if (!Fill()) {
            line = Rest();
            begin_ = end_;
            return !line.empty();
        }
        newline = Rest().find('\n', searched);
    }
    line = Rest().substr(0, newline);
    begin_ += newline + 1;
    return true;
}

} // namespace VANO::FILEINDEX
