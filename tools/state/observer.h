#ifndef FILEINDEXCTL_STATE_OBSERVER_H
#define FILEINDEXCTL_STATE_OBSERVER_H

#include <ctime>
#include <optional>
#include <string>
#include <sys/stat.h>
#include <tuple>
#include <vector>

#include "state/observed_share.h"
#include "state/service_state.h"

namespace CTL {

// What changes when a file is written, replaced, made or removed.
class FileStamp {
  public:
    explicit FileStamp(const std::string &path) { exists_ = ::stat(path.c_str(), &info_) == 0; }

    friend bool operator==(const FileStamp &left, const FileStamp &right) {
        return left.Key() == right.Key();
    }

  private:
    [[nodiscard]] std::tuple<bool, dev_t, ino_t, off_t, time_t, long> Key() const {
        return {exists_,       info_.st_dev,         info_.st_ino,
                info_.st_size, info_.st_mtim.tv_sec, info_.st_mtim.tv_nsec};
    }

    struct stat info_ {}; // zeroes when there is no file
    bool exists_ = false;
};

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
