#include "state/queue_pace.h"

#include <algorithm>
#include <cmath>

namespace CTL {

namespace {

constexpr double kWindow = 60;
constexpr double kShortestSpan = 3;
constexpr double kLongestEstimate = 1e9; // beyond any sense; keeps the number a number

} // namespace

void QueuePace::Observe(double time, std::uint64_t pending) {
    if (pending == 0) {
        samples_.clear();
        most_ = 0;
        return;
    }
    samples_.push_back({time, pending});
    // The first sample is the last one that is at least a window old.
    while (samples_.size() > 2 && samples_[1].time <= time - kWindow) {
        samples_.pop_front();
    }
    most_ = std::max(most_, pending);
}

double QueuePace::Fraction() const {
    if (samples_.empty()) {
        return 1;
    }
    return static_cast<double>(most_ - samples_.back().pending) / static_cast<double>(most_);
}

std::optional<long long> QueuePace::SecondsLeft() const {
    if (samples_.empty()) {
        return std::nullopt;
    }
    const Sample &first = samples_.front();
    const Sample &last = samples_.back();
    const double span = last.time - first.time;
    if (span < kShortestSpan || last.pending >= first.pending) {
        return std::nullopt;
    }
    const double pace = static_cast<double>(first.pending - last.pending) / span;
    return std::llround(std::min(static_cast<double>(last.pending) / pace, kLongestEstimate));
}

} // namespace CTL
