#ifndef FILEINDEXCTL_STATE_QUEUE_COUNTER_H
#define FILEINDEXCTL_STATE_QUEUE_COUNTER_H

#include <chrono>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "core/event.h"
#include "core/folder_set.h"
#include "state/queue_file.h"

// Counting what waits in a queue again and again, without reading again what has been counted.
// Nothing is locked and nothing stays open, so writers, the daemon and an unmount see nothing of
// it.

namespace CTL {

using Clock = std::chrono::steady_clock;
using VANO::FILEINDEX::EventCounts;

// Reads the lines of queue files and counts their events; a line that is no event adds nothing.
class EventCounter {
  public:
    explicit EventCounter(std::vector<std::string> fullPaths) : folders_(std::move(fullPaths)) {}

    void Count(EventCounts &counts, std::string_view line) {
        if (parser_.Parse(event_, line)) {
            folders_.Count(counts, event_);
        }
    }

    // What was counted at or below a folder.
    [[nodiscard]] std::uint64_t CountOf(const EventCounts &counts,
                                        const std::string &folder) const {
        return counts.Of(folders_.Find(folder));
    }

  private:
    VANO::FILEINDEX::FolderSet folders_;
    VANO::FILEINDEX::EventParser parser_;
    VANO::FILEINDEX::QueueEvent event_{};
};

// How far one file has been counted, and what was found.
class FileCount {
  public:
    [[nodiscard]] bool IsOf(const QueueFile &file) const;

    // Counts on. Starts again where the file is another one, or no longer begins with what has been
    // counted. False when `until` came before the end.
    [[nodiscard]] bool Follow(const QueueFile &file, EventCounter &counter,
                              Clock::time_point until);

    void AddTo(EventCounts &sum) const;
    [[nodiscard]] off_t Bytes() const { return offset_; }

  private:
    [[nodiscard]] bool Continues(const QueueFile &file) const;
    void Take(std::string_view chunk, EventCounter &counter);
    void Append(std::string_view part);

    QueueFile::Identity identity_{};
    off_t offset_ = 0;
    std::string counted_;    // the last bytes before the offset
    std::string unfinished_; // the last line, as long as its end is not there
    bool isCut_ = false;     // it was too long to be an event
    EventCounts tally_;
    EventCounts unfinishedTally_; // a last line counts without its end too
    bool isUnfinishedKnown_ = true;
};

// The queue of a share: its file, and the one that the daemon has taken over.
class QueueCounter {
  public:
    // `folders` are full paths.
    QueueCounter(std::string path, const std::vector<std::string> &folders);

    // Counts what there is now. False when `until` came before the end; the next call goes on.
    [[nodiscard]] bool Look(Clock::time_point until);

    // How many events wait, and how many of them at or below a folder.
    [[nodiscard]] std::uint64_t Events() const { return sum_.All(); }
    [[nodiscard]] std::uint64_t EventsOf(const std::string &folder) const {
        return counter_.CountOf(sum_, folder);
    }

    // Why the queue cannot be read, as errno has it; 0 when it can.
    [[nodiscard]] int Error() const { return error_; }

    // From 0 to 1: how much of the queue has been counted.
    [[nodiscard]] double Counted() const { return counted_; }

  private:
    std::string path_;
    EventCounter counter_;
    FileCount queue_;
    FileCount taken_;
    EventCounts sum_;
    int error_ = 0;
    double counted_ = 0;
};

} // namespace CTL

#endif
