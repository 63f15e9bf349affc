#ifndef FILEINDEXCTL_STATUS_OBSERVER_H
#define FILEINDEXCTL_STATUS_OBSERVER_H

#include <ctime>
#include <optional>
#include <string>
#include <vector>

#include "status/file_stamp.h"
#include "status/observed_share.h"
#include "status/service.h"

namespace CTL {

// Looks at the service again and again. Each look costs little: the queues are counted on, and the
// settings read again only when their files have changed, or after a while, since the library
// writes a line to the system log about each folder that has trouble.
class Observer {
  public:
    // `paths` are share paths: of the folders, those are observed that lie at or below one of them
    // or contain it. Without any, all.
    explicit Observer(std::vector<std::string> paths) : paths_(std::move(paths)) {}

    // False when the settings cannot be read; the last error of the library says why. What was read
    // before stays.
    [[nodiscard]] bool ReadSettings();

    // False when `until` came before the queues were counted; the next look goes on.
    [[nodiscard]] bool Look(Clock::time_point until);

    // What the last look saw.
    [[nodiscard]] ServiceState State() const;

    // Whether there is no folder to be observed.
    [[nodiscard]] bool IsIdle() const { return shares_.empty(); }

  private:
    [[nodiscard]] bool IsAsked(const std::string &path) const;

    const std::vector<std::string> paths_;
    std::vector<ObservedShare> shares_;
    std::optional<long long> resumeTime_;
    std::vector<FileStamp> stamps_; // of the settings files when they were read
    Clock::time_point readAt_;
    std::time_t now_ = 0;
    DaemonState daemon_ = DaemonState::kUnknown;
};

} // namespace CTL

#endif
