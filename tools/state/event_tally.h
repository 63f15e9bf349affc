#ifndef FILEINDEXCTL_STATE_EVENT_TALLY_H
#define FILEINDEXCTL_STATE_EVENT_TALLY_H

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "state/queue_event.h"

namespace CTL {

// Folders by full path, to be asked which of them a path lies in.
class FolderMap {
  public:
    // A folder is known by its place in `fullPaths`. An empty path, and one that stands there
    // twice, contains nothing.
    explicit FolderMap(const std::vector<std::string> &fullPaths);

    // Adds the folders that are `path` or that it lies below, by whole path components.
    void AddContaining(std::vector<std::size_t> &folders, const std::string &path) const;

  private:
    std::map<std::string, std::size_t, std::less<>> folders_;
};

// How many events there are in all, and at or below each folder. A move counts where the item came
// from and where it went.
class EventTally {
  public:
    void Add(const std::vector<std::size_t> &containing); // one event
    void Add(const EventTally &other);

    [[nodiscard]] std::uint64_t All() const { return all_; }
    [[nodiscard]] std::uint64_t Of(std::size_t folder) const;

  private:
    std::uint64_t all_ = 0;
    std::vector<std::uint64_t> byFolder_; // shorter than the folders where the rest has none
};

// Adds the lines of queue files to tallies.
class EventCounter {
  public:
    explicit EventCounter(const std::vector<std::string> &folders) : folders_(folders) {}

    // A line that is no event adds nothing.
    void Count(EventTally &tally, std::string_view line);

  private:
    FolderMap folders_;
    QueueEventParser parser_;
    QueueEvent event_; // this and the next are kept for their room
    std::vector<std::size_t> containing_;
};

} // namespace CTL

#endif
