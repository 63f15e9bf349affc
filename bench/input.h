#ifndef FILEINDEX_BENCH_INPUT_H
#define FILEINDEX_BENCH_INPUT_H

// What the benchmarks work on, made up but realistic, and the same in every run.

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace VANO::BENCH {

constexpr std::size_t kShareCount = 20;
constexpr std::size_t kMaxFolders = 1000;

// The shares by name. The first one sorts first.
const std::vector<std::string> &ShareNames();

// The share paths of `count` indexed folders, evenly spread over all shares: the same list is the
// beginning of every longer one. 60 to 120 bytes each, also as full paths on a volume named as
// "/volume1"; some are not ASCII. None lies below another.
std::vector<std::string> FolderPaths(std::size_t count);

// The lines of a share's event queue, one after another: mostly files that were created, changed,
// moved or deleted, and now and then a setting that changed or a folder to index again.
class EventLines {
  public:
    // Events happen below these folders, given by their full paths.
    explicit EventLines(std::vector<std::string> folders);

    // Appends the next line with its newline.
    void AppendTo(std::string &text);

  private:
    std::uint64_t Random();
    void AppendFile(std::string &text);

    std::vector<std::string> folders_;
    std::uint64_t state_;
};

} // namespace VANO::BENCH

#endif
