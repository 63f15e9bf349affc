#include "state/observed_share.h"

#include <algorithm>
#include <fileindex/index_rules.h>
#include <fileindex/status_mgr.h>

#include "core/progress_words.h"
#include "core/share_files.h"
#include "state/known_shares.h"

namespace CTL {

namespace fileindex = VANO::FILEINDEX;

void ObservedShare::Add(const fileindex::Folder &folder) {
    folders_.push_back(folder);
    isValid_.push_back(fileindex::CanPathBeIndexed(folder.path));
    fullPaths_.push_back(folder.full_path);
}

void ObservedShare::Prepare(std::vector<ObservedShare> &former) {
    isOutOfSpace_ = fileindex::StatusMgr::ShareIsNoSpace(name_);
    needsReindex_ = fileindex::StatusMgr::ShareIsNeedReindex(name_);
    const std::string directory = DirectoryOfShare(name_);
    if (directory.empty()) {
        return;
    }
    queue_ = fileindex::QueueIn(directory);
    for (ObservedShare &other : former) {
        if (other.counter_ && other.queue_ == queue_ && other.fullPaths_ == fullPaths_) {
            counter_ = std::move(other.counter_);
            return;
        }
    }
    counter_ = std::make_unique<QueueCounter>(queue_, fullPaths_);
}

bool ObservedShare::Look(Clock::time_point until) {
    isCounted_ = !counter_ || counter_->Look(until);
    return isCounted_;
}

double ObservedShare::Counted() const {
    return isCounted_ ? 1 : counter_ ? counter_->Counted() : 0;
}

FolderState ObservedShare::StateOf(std::size_t folder, const ShareState &share,
                                   bool isPaused) const {
    FolderState state;
    state.setting = folders_[folder].asJson();
    state.path = folders_[folder].path;
    state.isValid = isValid_[folder];
    if (share.pending) {
        state.pending = counter_->EventsOf(fullPaths_[folder]);
    }
    // In the order of StatusMgr::GetFolderStatus(), which would read the queue once a folder.
    if (!state.isValid) {
        state.status = fileindex::kProgressPaused;
    } else if (isOutOfSpace_) {
        state.status = fileindex::kProgressNoSpace;
    } else if (state.pending.value_or(0) == 0) {
        state.status = fileindex::kProgressFinished;
    } else {
        state.status = isPaused ? fileindex::kProgressPaused : fileindex::kProgressProcessing;
    }
    return state;
}

void ObservedShare::AddTo(ServiceState &state) const {
    ShareState share;
    share.name = name_;
    share.isOutOfSpace = isOutOfSpace_;
    share.needsReindex = needsReindex_;
    share.queueError = counter_ ? counter_->Error() : 0;
    if (counter_ && isCounted_ && share.queueError == 0) {
        share.pending = counter_->Events();
    }
    for (std::size_t folder = 0; folder < folders_.size(); ++folder) {
        state.folders.push_back(StateOf(folder, share, state.IsPaused()));
    }
    state.counted = std::min(state.counted, Counted());
    state.shares.push_back(std::move(share));
}

} // namespace CTL
