#ifndef FILEINDEX_TESTS_PLATFORM_FUSE_SERVER_H
#define FILEINDEX_TESTS_PLATFORM_FUSE_SERVER_H

#include <string>
#include <thread>

namespace VANO::TESTS {

// An empty user-space file system, served by a thread.
class FuseServer {
  public:
    explicit FuseServer(const std::string &target);
    FuseServer(const FuseServer &) = delete;
    FuseServer &operator=(const FuseServer &) = delete;
    ~FuseServer();

    [[nodiscard]] bool IsMounted() const { return thread_.joinable(); }

  private:
    void Serve() const;

    std::string target_;
    int device_ = -1;
    std::thread thread_;
};

} // namespace VANO::TESTS

#endif
