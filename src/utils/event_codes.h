#ifndef FILEINDEX_UTILS_EVENT_CODES_H
#define FILEINDEX_UTILS_EVENT_CODES_H

namespace VANO::FILEINDEX {

// Codes of the queue's events that this library writes or looks at.
constexpr int kEventMoved = 0x100; // written by the monitor, with "path_old"
constexpr int kEventReindexFolder = 0x10000;
constexpr int kEventSettingChanged = 0x20000;

} // namespace VANO::FILEINDEX

#endif
