#include "state/queue_counter.h"

#include <algorithm>
#include <string_view>

#include "core/paths.h"

namespace CTL {

namespace {

constexpr std::size_t kChunkBytes = std::size_t{64} * 1024;
constexpr std::size_t kRememberedBytes = 256;

} // namespace

bool FileCount::IsOf(const QueueFile &file) const {
    return file.IsOpen() && offset_ > 0 && identity_ == file.WhichFile();
}

// A file that was emptied and filled again, or a new one that got the number of the old one, may be
// as long as the old one: the last bytes tell them apart.
bool FileCount::Continues(const QueueFile &file) const {
    const auto bytes = static_cast<off_t>(counted_.size());
    return IsOf(file) && file.Size() >= offset_ &&
           file.ReadAt(offset_ - bytes, counted_.size()) == counted_;
}

bool FileCount::Follow(const QueueFile &file, EventCounter &counter, Clock::time_point until) {
    if (!Continues(file)) {
        *this = FileCount();
        identity_ = file.WhichFile();
    }
    bool isAtEnd = !file.IsOpen() || file.Size() == offset_;
    for (bool isTimeLeft = true; !isAtEnd && isTimeLeft; isTimeLeft = Clock::now() < until) {
        const std::string chunk = file.ReadAt(offset_, kChunkBytes);
        isAtEnd = chunk.empty();
        Take(chunk, counter);
    }
    if (isAtEnd && !isUnfinishedKnown_) {
        unfinishedTally_ = EventCounts();
        counter.Count(unfinishedTally_, unfinished_);
        isUnfinishedKnown_ = true;
    }
    return isAtEnd;
}

void FileCount::AddTo(EventCounts &sum) const {
    sum.Add(tally_);
    sum.Add(unfinishedTally_);
}

void FileCount::Take(std::string_view chunk, EventCounter &counter) {
    isUnfinishedKnown_ = false;
    offset_ += static_cast<off_t>(chunk.size());
    counted_ += chunk;
    counted_.erase(0, counted_.size() - std::min(counted_.size(), kRememberedBytes));
    for (std::size_t end = chunk.find('\n'); end != std::string_view::npos;
         end = chunk.find('\n')) {
        Append(chunk.substr(0, end));
        counter.Count(tally_, unfinished_);
        unfinished_.clear();
        isCut_ = false;
        chunk.remove_prefix(end + 1);
    }
    Append(chunk);
}

void FileCount::Append(std::string_view part) {
    isCut_ = isCut_ || unfinished_.size() + part.size() > VANO::FILEINDEX::kMaxEventBytes;
    if (isCut_) {
        unfinished_.clear(); // an empty line is no event
    } else {
        unfinished_ += part;
    }
}

QueueCounter::QueueCounter(std::string path, const std::vector<std::string> &folders)
    : path_(std::move(path)), counter_(folders) {}

bool QueueCounter::Look(Clock::time_point until) {
    // In this order a file that is being taken over is met twice, and not missed.
    QueueFile queue(path_);
    const QueueFile taken(path_ + VANO::FILEINDEX::kTakenQueueSuffix);
    if (queue.IsOpen() && taken.IsOpen() && queue.WhichFile() == taken.WhichFile()) {
        queue = QueueFile();
    }
    if (queue_.IsOf(taken)) {
        taken_ = std::move(queue_);
        queue_ = FileCount();
    }
    const bool isTakenDone = taken_.Follow(taken, counter_, until);
    const bool isQueueDone = queue_.Follow(queue, counter_, until);
    sum_ = EventCounts();
    queue_.AddTo(sum_);
    taken_.AddTo(sum_);
    error_ = queue.Error() != 0 ? queue.Error() : taken.Error();
    const auto all = static_cast<double>(queue.Size() + taken.Size());
    const auto done = static_cast<double>(queue_.Bytes() + taken_.Bytes());
    counted_ = all > done ? done / all : 1;
    return isTakenDone && isQueueDone;
}

} // namespace CTL
