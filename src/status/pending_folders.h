#ifndef FILEINDEX_STATUS_PENDING_FOLDERS_H
#define FILEINDEX_STATUS_PENDING_FOLDERS_H

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace VANO::FILEINDEX {

// Tells, of some folders, which have events at or below them. Folders may lie in one another; an
// event costs a binary search, however many there are. A folder whose path
// has a zero byte is never asked about: it cannot be indexed.
class PendingFolders {
  public:
    explicit PendingFolders(std::vector<std::string> fullPaths);

    void AddEvent(std::string_view fullPath);

    [[nodiscard]] bool Holds(const std::string &fullPath) const;
    [[nodiscard]] bool IsPending(const std::string &fullPath) const;

  private:
    static constexpr std::size_t kNone = static_cast<std::size_t>(-1);

    struct Entry {
        std::string path;
        std::size_t parent; // the innermost of the others that it lies in
        bool isPending;
    };

    // The last entry that does not come after the path. Every folder that holds the path is that
    // entry or one of its parents.
    [[nodiscard]] std::size_t LastUpTo(std::string_view fullPath) const;
    [[nodiscard]] std::size_t Find(const std::string &fullPath) const;

    std::vector<Entry> entries_;
};

} // namespace VANO::FILEINDEX

#endif
