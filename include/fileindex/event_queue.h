#ifndef FILEINDEX_EVENT_QUEUE_H
#define FILEINDEX_EVENT_QUEUE_H

#include <json/value.h>
#include <string>

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// Appends an event to the queue file of the share that holds a path, under the queue's own lock.
///
/// A pending re-index (65536) of the same path already covers any event: nothing is written. An
/// event that cannot be queued marks the share as needing a new index instead. A queue that stays
/// locked through three attempts drops the event.
///
/// @param event    the event code: 65536 re-index the folder, 131072 the folder's setting changed.
/// @param fullPath the absolute path that the event is about.
/// @param data     the event's parameters.
/// @return false when the event was replaced by the mark; failures are logged, those of the lock
///         and of the write only when LOG_LEVEL is 7.
FILEINDEX_API bool AddCustomEvent(const int &event, const std::string &fullPath,
                                  const Json::Value &data);

} // namespace VANO::FILEINDEX

#endif
