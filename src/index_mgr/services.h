#ifndef FILEINDEX_INDEX_MGR_SERVICES_H
#define FILEINDEX_INDEX_MGR_SERVICES_H

namespace VANO::FILEINDEX {

// Starts the indexing daemon's service. False, with one line logged, when that fails.
[[nodiscard]] bool StartIndexingService();

// Stops the indexing daemon's service and switches Spotlight off, as the last folder setting is
// gone. Failures are logged only.
void StopIndexing();

// Switches the file-sharing service's Spotlight search on or off, unless it already is, and
// restarts that service to let it notice. Failures are logged only.
void SwitchSpotlight(bool on);

} // namespace VANO::FILEINDEX

#endif
