#include "watch/share_text.h"

#include <cmath>

#include "time_text.h"

namespace CTL {

std::string PercentText(const Progress &progress) {
    return std::to_string(static_cast<int>(std::floor(progress.Fraction() * 100))) + " %";
}

std::string OutlookText(const ServiceState &service, const ShareState &share,
                        const Progress &progress) {
    if (share.queueError != 0) {
        return "cannot be read";
    }
    if (!share.pending) {
        return service.counted < 1 ? "counting" : "unknown share";
    }
    if (*share.pending == 0) {
        return "finished";
    }
    if (share.isOutOfSpace) {
        return "out of space";
    }
    if (service.IsPaused()) {
        return "paused";
    }
    if (service.daemon == DaemonState::kStopped) {
        return "daemon stopped";
    }
    const std::optional<long long> left = progress.SecondsLeft();
    return left ? DurationText(*left) + " left" : "";
}

} // namespace CTL
