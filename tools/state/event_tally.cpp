#include "state/event_tally.h"

#include <algorithm>
#include <string_view>

namespace CTL {

FolderMap::FolderMap(const std::vector<std::string> &fullPaths) {
    for (std::size_t i = 0; i < fullPaths.size(); ++i) {
        if (!fullPaths[i].empty()) {
            folders_.emplace(fullPaths[i], i);
        }
    }
}

void FolderMap::AddContaining(std::vector<std::size_t> &folders, const std::string &path) const {
    if (folders_.empty()) {
        return;
    }
    std::string_view above = path;
    for (;;) {
        const auto found = folders_.find(above);
        if (found != folders_.end()) {
            folders.push_back(found->second);
        }
        const std::size_t slash = above.rfind('/');
        if (slash == std::string_view::npos) {
            return;
        }
        above = above.substr(0, slash);
    }
}

void EventTally::Add(const std::vector<std::size_t> &containing) {
    ++all_;
    for (const std::size_t folder : containing) {
        byFolder_.resize(std::max(byFolder_.size(), folder + 1));
        ++byFolder_[folder];
    }
}

void EventTally::Add(const EventTally &other) {
    all_ += other.all_;
    byFolder_.resize(std::max(byFolder_.size(), other.byFolder_.size()));
    for (std::size_t folder = 0; folder < other.byFolder_.size(); ++folder) {
        byFolder_[folder] += other.byFolder_[folder];
    }
}

std::uint64_t EventTally::Of(std::size_t folder) const {
    return folder < byFolder_.size() ? byFolder_[folder] : 0;
}

void EventCounter::Count(EventTally &tally, std::string_view line) {
    if (!parser_.Parse(event_, line)) {
        return;
    }
    containing_.clear();
    folders_.AddContaining(containing_, event_.path);
    if (!event_.formerPath.empty()) {
        folders_.AddContaining(containing_, event_.formerPath);
        std::sort(containing_.begin(), containing_.end());
        containing_.erase(std::unique(containing_.begin(), containing_.end()), containing_.end());
    }
    tally.Add(containing_);
}

} // namespace CTL
