#ifndef FILEINDEX_MIGRATION_H
#define FILEINDEX_MIGRATION_H

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// Brings the services into line with the folder settings of the previous release: without folders
/// the daemon's service is stopped; otherwise it is started, Spotlight switched on, every share
/// with folders watched by the change monitor and every folder queued for a new index. Changes no
/// settings file; running it again does all of it again.
///
/// @return false at the first failing step, which is logged; what was done before stays.
FILEINDEX_API bool Updater_zem60_beta2();

} // namespace VANO::FILEINDEX

#endif
