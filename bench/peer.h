#ifndef FILEINDEX_BENCH_PEER_H
#define FILEINDEX_BENCH_PEER_H

#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <thread>

#include "base/unique_fd.h"

namespace VANO::BENCH {

// The indexing daemon's side of the command socket, no more than it takes: accepts one connection
// after another, reads it to its end and counts it when it held one complete command.
class Peer {
  public:
    Peer(); // listens from here on
    ~Peer();
    Peer(const Peer &) = delete;
    Peer &operator=(const Peer &) = delete;

    // Waits until `count` connections have come since the last call. False when they do not come,
    // or are more, or one held anything but a complete command.
    bool Received(std::size_t count);

  private:
    void Serve();

    FILEINDEX::UniqueFd listener_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::size_t complete_ = 0;
    std::size_t broken_ = 0;
    std::thread thread_; // last: uses all of them
};

} // namespace VANO::BENCH

#endif
