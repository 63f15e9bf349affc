#ifndef INDEXING_PEER_QUEUES_H
#define INDEXING_PEER_QUEUES_H

#include <string>
#include <vector>

namespace peer {

// The queue files of all shares, as the share table stands now.
[[nodiscard]] std::vector<std::string> QueuesOfAllShares();

} // namespace peer

#endif
