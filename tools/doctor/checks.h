#ifndef FILEINDEXCTL_DOCTOR_CHECKS_H
#define FILEINDEXCTL_DOCTOR_CHECKS_H

#include "doctor/finding.h"
#include "doctor/machine.h"

namespace CTL::DOCTOR {

// A check looks at one concern. It changes nothing: it makes no file and takes no lock. It finds
// something in any case, if only that all is well.
struct Check {
    const char *name;
    const char *title;
    Findings (*look)(const Machine &machine);
};

// One file each, named as the check.
Findings CheckSettings(const Machine &machine);
Findings CheckLocks(const Machine &machine);
Findings CheckShares(const Machine &machine);
Findings CheckFolders(const Machine &machine);
Findings CheckDaemon(const Machine &machine);
Findings CheckQueues(const Machine &machine);
Findings CheckMonitor(const Machine &machine);
Findings CheckSpotlight(const Machine &machine);
Findings CheckRoom(const Machine &machine);

} // namespace CTL::DOCTOR

#endif
