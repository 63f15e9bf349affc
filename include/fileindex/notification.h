#ifndef FILEINDEX_NOTIFICATION_H
#define FILEINDEX_NOTIFICATION_H

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// Tells the administrators that a share ran out of space for its index, through the system's
/// notification tool; returns when the tool has ended.
///
/// @return whether the tool ran and reported success. Nothing is logged.
FILEINDEX_API bool NotifyNoSpace();

} // namespace VANO::FILEINDEX

#endif
