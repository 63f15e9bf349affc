#ifndef FILEINDEXCTL_STATE_QUEUE_PACE_H
#define FILEINDEXCTL_STATE_QUEUE_PACE_H

#include <cstdint>
#include <deque>
#include <optional>

namespace CTL {

// How far a queue has been worked off, told from how many events wait at one look after another.
class QueuePace {
  public:
    // `time` in seconds of a clock that never goes back.
    void Observe(double time, std::uint64_t pending);

    // From 0 to 1: the part done of the most that waited since the queue was last empty.
    [[nodiscard]] double Fraction() const;

    // When nothing will wait any more, at the pace of the last minute. None before a few seconds
    // have passed, and none where the queue does not become shorter.
    [[nodiscard]] std::optional<long long> SecondsLeft() const;

  private:
    struct Sample {
        double time;
        std::uint64_t pending;
    };

    std::deque<Sample> samples_; // of the window; empty when nothing waits
    std::uint64_t most_ = 0;
};

} // namespace CTL

#endif
