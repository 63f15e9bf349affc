#ifndef FILEINDEX_CORE_FOLDER_SET_H
#define FILEINDEX_CORE_FOLDER_SET_H

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace VANO::FILEINDEX {

struct QueueEvent;

// How many events there are in all, and at or below each folder of a set.
class EventCounts {
  public:
    void Add(const EventCounts &other);

    [[nodiscard]] std::uint64_t All() const { return all_; }
    [[nodiscard]] std::uint64_t Of(std::size_t folder) const;

  private:
    friend class FolderSet;

    void CountIn(std::size_t folder);

    std::uint64_t all_ = 0;
    std::vector<std::uint64_t> byFolder_; // shorter than the set where the rest has none
};

// Folders by full path, to be told which of them hold an event. They may lie in one another; an
// event costs a binary search, however many there are. A folder whose path is empty or has a zero
// byte holds nothing: it cannot be indexed.
class FolderSet {
  public:
    static constexpr std::size_t kNone = static_cast<std::size_t>(-1);

    explicit FolderSet(std::vector<std::string> fullPaths);

    // Under which number the folder is counted; kNone when it is not in the set.
    [[nodiscard]] std::size_t Find(const std::string &fullPath) const;

    // Counts one event. A move counts where the item was and where it is, once in a folder that
    // holds both.
    void Count(EventCounts &counts, const QueueEvent &event) const;

  private:
    struct Entry {
        std::string path;
        std::size_t parent; // the innermost of the others that it lies in
    };

    // The last entry that does not come after the path. Every folder that holds the path is that
    // entry or one of its parents.
    [[nodiscard]] std::size_t LastUpTo(std::string_view fullPath) const;
    [[nodiscard]] std::size_t InnermostAround(std::string_view fullPath) const;

    std::vector<Entry> entries_;
};

} // namespace VANO::FILEINDEX

#endif
