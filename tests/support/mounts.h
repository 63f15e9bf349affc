#ifndef FILEINDEX_TESTS_MOUNTS_H
#define FILEINDEX_TESTS_MOUNTS_H

// Mounts for the length of a scope, inside the sandbox's own namespace.

#include <cstddef>
#include <string>

namespace VANO::TESTS {

// An empty file system of so many bytes (rounded up to pages) on a directory, made when missing.
class TinyVolume {
  public:
    TinyVolume(std::string directory, std::size_t bytes);
    ~TinyVolume();
    TinyVolume(const TinyVolume &) = delete;
    TinyVolume &operator=(const TinyVolume &) = delete;

  private:
    std::string directory_;
};

// A file or directory mounted over another one, which must exist.
class BindMount {
  public:
    BindMount(const std::string &source, std::string target);
    ~BindMount();
    BindMount(const BindMount &) = delete;
    BindMount &operator=(const BindMount &) = delete;

  private:
    std::string target_;
};

} // namespace VANO::TESTS

#endif
