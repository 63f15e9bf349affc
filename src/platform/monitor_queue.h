#ifndef VANO_MONITOR_QUEUE_H
#define VANO_MONITOR_QUEUE_H

#include <json/value.h>
#include <string>

// The client side of the file-change monitor, provided by another library.

namespace VANO::VANOTIFYD {

enum _tag_monitor_queue_type_ : int {
    MONITOR_QUEUE_TYPE_FILE = 1, ///< events are appended to a queue file
};

/// What one consumer wants to be told of, and the queue that is to receive it.
///
/// The description is an object with "queue", the queue's location, and "config", an array of
/// {"path": full path, "mask": inotify event bits, "ignore": [directory names]}.
class __attribute__((visibility("default"))) MonitorQueue {
  public:
    explicit MonitorQueue(const Json::Value &description);
    ~MonitorQueue();

    /// Creates or replaces the configuration of that consumer and queue so that it equals `queue`.
    static bool Upsert(const MonitorQueue &queue, const std::string &consumer,
                       _tag_monitor_queue_type_ type);

    /// Removes the configuration that feeds the queue location `queue` for that consumer.
    static bool Delete(const std::string &queue, const std::string &consumer,
                       _tag_monitor_queue_type_ type);

    Json::Value description;
};

} // namespace VANO::VANOTIFYD

#endif
