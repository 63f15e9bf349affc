#include "status/pending_folders.h"

#include <algorithm>

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

// Without a zero byte in the folder, that it ends where a component does is told first: it mostly
// settles the matter.
bool IsIn(std::string_view path, std::string_view folder) {
    return path.size() >= folder.size() &&
           (path.size() == folder.size() || path[folder.size()] == '/') &&
           path.substr(0, folder.size()) == folder;
}

} // namespace

PendingFolders::PendingFolders(std::vector<std::string> fullPaths) {
    std::sort(fullPaths.begin(), fullPaths.end(), ComesBefore);
    fullPaths.erase(std::unique(fullPaths.begin(), fullPaths.end()), fullPaths.end());
    for (std::string &path : fullPaths) {
        std::size_t parent = entries_.size() - 1; // kNone for the first
        while (parent != kNone && !IsIn(path, entries_[parent].path)) {
            parent = entries_[parent].parent;
        }
        entries_.push_back({std::move(path), parent, false});
    }
}

std::size_t PendingFolders::LastUpTo(std::string_view fullPath) const {
    const auto after = std::upper_bound(
        entries_.begin(), entries_.end(), fullPath,
        [](std::string_view path, const Entry &entry) { return ComesBefore(path, entry.path); });
    return static_cast<std::size_t>(after - entries_.begin()) - 1;
}

void PendingFolders::AddEvent(std::string_view fullPath) {
    // A folder that is alone needs no search.
    std::size_t index = entries_.size() > 1 ? LastUpTo(fullPath) : entries_.size() - 1;
    while (index != kNone && !IsIn(fullPath, entries_[index].path)) {
        index = entries_[index].parent;
    }
    // The parents of a pending folder are pending already.
    while (index != kNone && !entries_[index].isPending) {
        entries_[index].isPending = true;
        index = entries_[index].parent;
    }
}

std::size_t PendingFolders::Find(const std::string &fullPath) const {
    const std::size_t index = LastUpTo(fullPath);
    return index != kNone && entries_[index].path == fullPath ? index : kNone;
}

bool PendingFolders::Holds(const std::string &fullPath) const {
    return Find(fullPath) != kNone;
}

bool PendingFolders::IsPending(const std::string &fullPath) const {
    const std::size_t index = Find(fullPath);
    return index != kNone && entries_[index].isPending;
}

} // namespace VANO::FILEINDEX
