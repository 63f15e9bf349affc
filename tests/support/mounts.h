#ifndef FILEINDEX_TESTS_MOUNTS_H
#define FILEINDEX_TESTS_MOUNTS_H

// Mounts for the length of a scope, inside the sandbox's own namespace.

#include <cstdlib>
#include <string>
#include <sys/mount.h>

#include "support/files.h"

namespace VANO::TESTS {

// Runs a shell command; true when it succeeded.
inline bool Shell(const std::string &command) {
    return std::system(("{ " + command + "; } >/tmp/shell.out 2>&1").c_str()) == 0;
}

// Something mounted for as long as the object lives.
class Mount {
  public:
    Mount(const std::string &source, const std::string &target, const char *type,
          unsigned long flags = 0, const std::string &options = "")
        : target_(target),
          mounted_(::mount(source.c_str(), target.c_str(), type, flags, options.c_str()) == 0) {}
    // By the mount program, which sets a loop device up for an image.
    Mount(const std::string &image, const std::string &target)
        : target_(target), mounted_(Shell("mount -o loop " + image + " " + target)) {}
    Mount(const Mount &) = delete;
    Mount &operator=(const Mount &) = delete;
    ~Mount() {
        if (mounted_) {
            ::umount2(target_.c_str(), MNT_DETACH);
        }
    }

    explicit operator bool() const { return mounted_; }

  private:
    std::string target_;
    bool mounted_;
};

// Puts one file over another: the way to replace a program of the system in a private namespace.
inline Mount Cover(const std::string &path, const std::string &with) {
    return {with, path, nullptr, MS_BIND};
}

// An empty file system of so many bytes (rounded up to pages) on a directory, made when missing.
inline Mount TinyVolume(const std::string &directory, std::size_t bytes) {
    MakeDirs(directory);
    return {"tiny", directory, "tmpfs", 0, "size=" + std::to_string(bytes)};
}

} // namespace VANO::TESTS

#endif
