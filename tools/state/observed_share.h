#ifndef FILEINDEXCTL_STATE_OBSERVED_SHARE_H
#define FILEINDEXCTL_STATE_OBSERVED_SHARE_H

#include <fileindex/folder.h>
#include <memory>
#include <string>
#include <vector>

#include "state/queue_counter.h"
#include "state/service_state.h"

namespace CTL {

// A share and those of its folders that are observed.
class ObservedShare {
  public:
    explicit ObservedShare(std::string name) : name_(std::move(name)) {}

    [[nodiscard]] const std::string &Name() const { return name_; }

    void Add(const VANO::FILEINDEX::Folder &folder);

    // To be called when all folders are there: asks for the share's marks and its queue. Takes over
    // what `former` has counted where it can go on with that.
    void Prepare(std::vector<ObservedShare> &former);

    // False when `until` came before the queue was counted.
    [[nodiscard]] bool Look(Clock::time_point until);

    // From 0 to 1: how much of the queue has been counted.
    [[nodiscard]] double Counted() const;

    // Adds the share and its folders.
    void AddTo(ServiceState &state) const;

  private:
    [[nodiscard]] FolderState StateOf(std::size_t folder, const ShareState &share,
                                      bool isPaused) const;

    std::string name_;
    bool isOutOfSpace_ = false;
    bool needsReindex_ = false;
    std::vector<VANO::FILEINDEX::Folder> folders_;
    std::vector<bool> isValid_;             // of the folders
    std::vector<std::string> fullPaths_;    // of the folders
    std::string queue_;                     // empty when the share is gone
    std::unique_ptr<QueueCounter> counter_; // none then
    bool isCounted_ = false;
};

} // namespace CTL

#endif
