#ifndef FILEINDEXCTL_STATUS_FILE_STAMP_H
#define FILEINDEXCTL_STATUS_FILE_STAMP_H

#include <string>
#include <sys/stat.h>
#include <tuple>

namespace CTL {

// What changes when a file is written, replaced, made or removed.
class FileStamp {
  public:
    explicit FileStamp(const std::string &path) { exists_ = ::stat(path.c_str(), &info_) == 0; }

    friend bool operator==(const FileStamp &left, const FileStamp &right) {
        return left.Key() == right.Key();
    }

  private:
    [[nodiscard]] std::tuple<bool, dev_t, ino_t, off_t, time_t, long> Key() const {
        return {exists_,       info_.st_dev,         info_.st_ino,
                info_.st_size, info_.st_mtim.tv_sec, info_.st_mtim.tv_nsec};
    }

    struct stat info_ {}; // zeroes when there is no file
    bool exists_ = false;
};

} // namespace CTL

#endif
