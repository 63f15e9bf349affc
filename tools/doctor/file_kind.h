#ifndef FILEINDEXCTL_DOCTOR_FILE_KIND_H
#define FILEINDEXCTL_DOCTOR_FILE_KIND_H

#include <string>
#include <sys/stat.h>

#include "doctor/finding.h"

namespace CTL::DOCTOR {

// What stands at a path itself: a symbolic link is not followed.
struct FileLook {
    struct stat info {};
    int error; // the errno of lstat()

    explicit FileLook(const std::string &path);
    [[nodiscard]] bool Exists() const { return error == 0; }
    [[nodiscard]] bool IsRegular() const { return Exists() && S_ISREG(info.st_mode); }
};

// "a directory", "a symbolic link".
[[nodiscard]] std::string KindOf(mode_t mode);

// The directory itself, after symbolic links: 0, or the errno that says why there is none.
[[nodiscard]] int DirectoryError(const std::string &path);

// What is odd about the owner and the mode of something that root alone should change.
void FindOddOwner(Findings &findings, const std::string &path, const struct stat &info,
                  const char *goodMode);

// Temporary files that a writer who was killed has left in a directory beside the files whose names
// begin with `prefix` and end with `suffix`. Those of a writer at work are left alone.
void FindStrayFiles(Findings &findings, const std::string &directory, const std::string &prefix,
                    const std::string &suffix);

// The names in a directory, sorted; without "." and "..". Empty when it cannot be read.
[[nodiscard]] std::vector<std::string> NamesIn(const std::string &directory);

} // namespace CTL::DOCTOR

#endif
