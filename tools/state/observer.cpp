#include "state/observer.h"

#include <algorithm>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <fileindex/status.h>
#include <fileindex/status_mgr.h>
#include <tuple>

#include "core/folder_cover.h"

namespace CTL {

namespace {

namespace fileindex = VANO::FILEINDEX;

// A folder that was removed, or whose share was, is noticed after that long.
constexpr std::chrono::seconds kSettingsLastFor{60};

std::vector<FileStamp> StampSettings() {
    return {FileStamp(fileindex::Folders().GetPath()), FileStamp(fileindex::Status().GetPath())};
}

ObservedShare &ShareOf(std::vector<ObservedShare> &shares, const std::string &path) {
    std::string name;
    (void)fileindex::GetShareNameByPath(name, path); // an empty path has an empty name
    const auto found = std::find_if(shares.begin(), shares.end(), [&](const ObservedShare &share) {
        return share.Name() == name;
    });
    return found != shares.end() ? *found : shares.emplace_back(name);
}

std::optional<long long> ReadResumeTime() {
    long long resumeTime = 0;
    return fileindex::StatusMgr::GetPauseInfo(resumeTime) ? std::optional<long long>(resumeTime)
                                                          : std::nullopt;
}

} // namespace

bool Observer::IsAsked(const std::string &path) const {
    return paths_.empty() ||
           std::any_of(paths_.begin(), paths_.end(), [&](const std::string &asked) {
               const auto [outer, inner] =
                   path.size() < asked.size() ? std::tie(path, asked) : std::tie(asked, path);
               return fileindex::IsSameOrBelow(inner, outer);
           });
}

bool Observer::ReadSettings() {
    stamps_ = StampSettings(); // before they are read: what changes meanwhile is seen later
    readAt_ = Clock::now();
    resumeTime_ = ReadResumeTime();
    std::vector<fileindex::Folder> folders;
    if (!fileindex::IndexMgr::List(folders)) {
        return false;
    }
    std::vector<ObservedShare> shares;
    for (const fileindex::Folder &folder : folders) {
        if (IsAsked(folder.path)) {
            ShareOf(shares, folder.path).Add(folder);
        }
    }
    for (ObservedShare &share : shares) {
        share.Prepare(shares_);
    }
    shares_ = std::move(shares);
    return true;
}

bool Observer::Look(Clock::time_point until) {
    if (Clock::now() >= readAt_ + kSettingsLastFor || !(stamps_ == StampSettings())) {
        (void)ReadSettings(); // somebody may be writing them: the next look tries again
    }
    now_ = std::time(nullptr);
    daemon_ = AskDaemonState();
    bool isCounted = true;
    for (ObservedShare &share : shares_) {
        isCounted = share.Look(until) && isCounted;
    }
    return isCounted;
}

ServiceState Observer::State() const {
    ServiceState state;
    state.now = now_;
    state.daemon = daemon_;
    state.resumeTime = resumeTime_;
    for (const ObservedShare &share : shares_) {
        share.AddTo(state);
    }
    return state;
}

} // namespace CTL
