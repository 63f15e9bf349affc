#ifndef INDEXING_PEER_STOP_SIGNAL_H
#define INDEXING_PEER_STOP_SIGNAL_H

#include "owned_fd.h"

namespace peer {

// SIGTERM and SIGINT as something to poll: from now on they end nothing by themselves.
class StopSignal {
  public:
    StopSignal();

    // Readable once such a signal has come.
    [[nodiscard]] int Get() const { return fd_.Get(); }
    [[nodiscard]] bool HasCome() const;

  private:
    OwnedFd fd_;
};

} // namespace peer

#endif
