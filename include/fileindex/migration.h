#ifndef FILEINDEX_MIGRATION_H
#define FILEINDEX_MIGRATION_H

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// Applies the folder settings of the previous release to the services: without folders the
/// daemon's service is stopped; otherwise it is started, Spotlight is switched on, the change
/// monitor watches every share with folders, and every folder is queued for re-indexing. Changes no
/// settings file; running it again does all of it again.
///
/// @return false at the first failing step, which is logged; what was done before stays.
FILEINDEX_API bool Updater_zem60_beta2();

} // namespace VANO::FILEINDEX

#endif
