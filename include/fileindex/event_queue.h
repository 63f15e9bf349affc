#ifndef FILEINDEX_EVENT_QUEUE_H
#define FILEINDEX_EVENT_QUEUE_H

#include <json/value.h>
#include <string>

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// Appends an event to the queue file of the share that holds a path, under the queue's own lock.
///
/// A pending re-index (65536) of the same path already covers any event: nothing is written. An
/// event that cannot be queued marks the share for re-indexing instead, under the status lock. A
/// queue that stays locked through three attempts, with a pause of 0 to 9 ms after each, drops the
/// event.
///
/// Costs a scan of the share's queue file and of the one that the daemon took over.
///
/// @param event    the event code: 65536 re-index the folder, 131072 the folder's setting changed.
/// @param fullPath the absolute path that the event is about.
/// @param data     the event's parameters.
/// @return false when the event could not be queued, whether the share could be marked or not. True
///         otherwise: also for an event that is covered, dropped, or only partly written.
///
/// Logged are a path in no share, an unknown share, a queue that cannot be read and a mark that
/// cannot be set; a lock that stays busy or fails and a short write only when LOG_LEVEL is 7; a
/// queue that cannot be opened for writing never.
FILEINDEX_API bool AddCustomEvent(const int &event, const std::string &fullPath,
                                  const Json::Value &data);

} // namespace VANO::FILEINDEX

#endif
