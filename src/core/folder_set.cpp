#include "core/folder_set.h"

#include <algorithm>

#include "core/event.h"

namespace VANO::FILEINDEX {

namespace {

// The order of "<a>/" and "<b>/": what lies in a folder follows it directly.
bool ComesBefore(std::string_view a, std::string_view b) {
    const std::size_t common = std::min(a.size(), b.size());
    const int order = a.substr(0, common).compare(b.substr(0, common));
    if (order != 0 || a.size() == b.size()) {
        return order < 0;
    }
    const auto nextOf = [common](std::string_view path) {
        return static_cast<unsigned char>(path.size() == common ? '/' : path[common]);
    };
    return nextOf(a) != nextOf(b) ? nextOf(a) < nextOf(b) : a.size() < b.size();
}

// That the folder ends where a component does is told first: it mostly settles the matter.
bool IsIn(std::string_view path, std::string_view folder) {
    return path.size() >= folder.size() &&
           (path.size() == folder.size() || path[folder.size()] == '/') &&
           path.substr(0, folder.size()) == folder;
}

} // namespace

void EventCounts::Add(const EventCounts &other) {
    all_ += other.all_;
    byFolder_.resize(std::max(byFolder_.size(), other.byFolder_.size()));
    for (std::size_t folder = 0; folder < other.byFolder_.size(); ++folder) {
        byFolder_[folder] += other.byFolder_[folder];
    }
}

std::uint64_t EventCounts::Of(std::size_t folder) const {
    return folder < byFolder_.size() ? byFolder_[folder] : 0;
}

void EventCounts::CountIn(std::size_t folder) {
    if (folder >= byFolder_.size()) {
        byFolder_.resize(folder + 1);
    }
    ++byFolder_[folder];
}

FolderSet::FolderSet(std::vector<std::string> fullPaths) {
    std::sort(fullPaths.begin(), fullPaths.end(), ComesBefore);
    fullPaths.erase(std::unique(fullPaths.begin(), fullPaths.end()), fullPaths.end());
    for (std::string &path : fullPaths) {
        if (path.empty()) {
            continue;
        }
        std::size_t parent = entries_.size() - 1; // kNone for the first
        while (parent != kNone && !IsIn(path, entries_[parent].path)) {
            parent = entries_[parent].parent;
        }
        entries_.push_back({std::move(path), parent});
    }
}

std::size_t FolderSet::LastUpTo(std::string_view fullPath) const {
    const auto after = std::upper_bound(
        entries_.begin(), entries_.end(), fullPath,
        [](std::string_view path, const Entry &entry) { return ComesBefore(path, entry.path); });
    return static_cast<std::size_t>(after - entries_.begin()) - 1;
}

std::size_t FolderSet::InnermostAround(std::string_view fullPath) const {
    // A folder that is alone needs no search.
    std::size_t index = entries_.size() > 1 ? LastUpTo(fullPath) : entries_.size() - 1;
    while (index != kNone && !IsIn(fullPath, entries_[index].path)) {
        index = entries_[index].parent;
    }
    return index;
}

void FolderSet::Count(EventCounts &counts, const QueueEvent &event) const {
    ++counts.all_;
    for (std::size_t index = InnermostAround(event.path); index != kNone;
         index = entries_[index].parent) {
        counts.CountIn(index);
    }
    if (event.formerPath.empty()) {
        return;
    }
    // A folder that holds both paths was counted, and so were all around it.
    for (std::size_t index = InnermostAround(event.formerPath);
         index != kNone && !IsIn(event.path, entries_[index].path);
         index = entries_[index].parent) {
        counts.CountIn(index);
    }
}

std::size_t FolderSet::Find(const std::string &fullPath) const {
    const std::size_t index = LastUpTo(fullPath);
    return index != kNone && entries_[index].path == fullPath ? index : kNone;
}

} // namespace VANO::FILEINDEX
