#ifndef FILEINDEX_CORE_SHARE_FILES_H
#define FILEINDEX_CORE_SHARE_FILES_H

#include <memory>
#include <string>
#include <sys/stat.h>

#include "base/unique_fd.h"

// Where a share's index data and events lie, and how they are reached.

namespace VANO::FILEINDEX {

// For a share that lies in `directory`. Nothing is looked up or made.
[[nodiscard]] std::string MetadataDirIn(const std::string &directory);
[[nodiscard]] std::string DatabaseIn(const std::string &directory);
[[nodiscard]] std::string QueueIn(const std::string &directory);

// One entry that lies, or is to lie, in a share's metadata directory, which is held open.
//
// The share's directory is the administrator's and may be a symbolic link. What lies in it can be
// put there by users: neither the metadata directory nor the entry is followed when it is a link.
// Whoever swaps one of them for a link between two calls leads nothing astray.
class ShareFile {
  public:
    // The path of something directly in a metadata directory.
    explicit ShareFile(const std::string &path);

    // Beside a queue: the one that the daemon took over.
    [[nodiscard]] ShareFile TakenOver() const;

    [[nodiscard]] const std::string &Path() const { return path_; }

    // Opens the entry without waiting for anybody. Not open, with errno set, on failure.
    [[nodiscard]] UniqueFd Open(int flags, mode_t mode = 0) const;

    // False, with errno set, on failure. A symbolic link is looked at itself.
    [[nodiscard]] bool Stat(struct stat &info) const;
    [[nodiscard]] bool MakeDirectory(mode_t mode) const;

    // Whether the entry is there and a regular file.
    [[nodiscard]] bool IsFile() const;

    // Why the metadata directory could not be opened, as errno has it; 0 when it could.
    [[nodiscard]] int Failure() const { return directory_->failure; }

  private:
    struct Directory {
        UniqueFd fd;
        int failure;
    };

    ShareFile(std::string path, std::shared_ptr<const Directory> directory)
        : path_(std::move(path)), directory_(std::move(directory)) {}

    [[nodiscard]] const char *Name() const { return path_.c_str() + path_.rfind('/') + 1; }
    [[nodiscard]] bool IsReachable() const; // sets errno when not

    std::string path_;
    std::shared_ptr<const Directory> directory_;
};

} // namespace VANO::FILEINDEX

#endif
