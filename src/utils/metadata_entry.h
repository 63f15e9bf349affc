#ifndef FILEINDEX_UTILS_METADATA_ENTRY_H
#define FILEINDEX_UTILS_METADATA_ENTRY_H

#include <string>
#include <sys/stat.h>

#include "base/unique_fd.h"

namespace VANO::FILEINDEX {

// What lies, or is to lie, in a share's metadata directory: a location that share_location.h gives.
//
// Users can write to a share, so no symbolic link is followed from the share's directory on: that
// directory, the metadata directory and the entry itself must each be what they are called. The
// metadata directory stays open meanwhile; whoever swaps one of the three for a link between two
// calls leads nothing astray.
class MetadataEntry {
  public:
    explicit MetadataEntry(const std::string &location);

    // Opens the entry without waiting for anybody. Not open, with errno set, on failure.
    [[nodiscard]] UniqueFd Open(int flags, mode_t mode = 0) const;

    // False, with errno set, on failure.
    [[nodiscard]] bool Stat(struct stat &info) const;
    [[nodiscard]] bool MakeDirectory(mode_t mode) const;

    // Whether something stands in the way: what is no directory, a symbolic link at most, or a
    // failure that keeps from seeing the way. A way that is not there is not obstructed.
    [[nodiscard]] bool IsObstructed() const;

  private:
    std::string name_;
    UniqueFd directory_;
    int failure_ = 0; // why the directory is not open
};

} // namespace VANO::FILEINDEX

#endif
