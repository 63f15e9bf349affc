#ifndef FILEINDEX_TORTURE_PEER_H
#define FILEINDEX_TORTURE_PEER_H

// The daemon's side of the queues: the worker of the example's indexing peer.

#include <string>
#include <vector>

namespace VANO::TORTURE {

struct QueuedEvent {
    std::string queue; // its file
    std::string line;  // without the newline

    bool operator==(const QueuedEvent &other) const {
        return queue == other.queue && line == other.line;
    }
};

// Works every queue of the machine off. `handled` receives the events, in order; what does not
// work is returned.
std::string WorkOffQueues(std::vector<QueuedEvent> &handled);

// The same, and that each of these events comes.
std::string CheckPeer(const std::vector<QueuedEvent> &expected);

} // namespace VANO::TORTURE

#endif
