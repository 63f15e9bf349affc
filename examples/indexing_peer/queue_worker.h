#ifndef INDEXING_PEER_QUEUE_WORKER_H
#define INDEXING_PEER_QUEUE_WORKER_H

#include <functional>
#include <json/value.h>
#include <string>

namespace peer {

struct Event {
    Json::UInt code = 0;
    std::string path;
    Json::Value data;
};

// What is done with a queue's lines. A line counts as done when its call has returned true; false
// stops the work, and every line of that queue file will come again.
struct QueueHandlers {
    std::function<bool(const std::string &queue, const Event &event)> onEvent;
    std::function<bool(const std::string &queue, const std::string &line)> onMalformed;
};

enum class QueueResult {
    kIdle,    // nothing waits, or another process holds the queue: look again later
    kDone,    // what waited has been worked off
    kStopped, // a handler said so
    kFailed,  // see the reason
};

// Takes a queue file over and works it off.
//
// A queue is a text file with one JSON object a line. Writers append to it under its flock(), and
// check after locking that the path still names the file they locked. So the taker locks the file,
// renames it to the same name with ".tmp" and keeps the lock until that is removed: nobody appends
// to a file that is being read, and a writer that was late starts a new queue. The ".tmp" is
// removed only after its last line is done. A process that dies before leaves it to be worked off
// first by the next one, so every event is handled at least once. The library looks for pending
// work in the ".tmp" too.
//
// Users can write beside the queue: symbolic links and anything but a regular file are refused.
[[nodiscard]] QueueResult WorkOffQueue(const std::string &queue, const QueueHandlers &handlers,
                                       std::string &reason);

} // namespace peer

#endif
