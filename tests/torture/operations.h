#ifndef FILEINDEX_TORTURE_OPERATIONS_H
#define FILEINDEX_TORTURE_OPERATIONS_H

// The operations that are tortured.

#include <functional>
#include <string>
#include <vector>

#include "testbed.h"

namespace VANO::TORTURE {

enum class Result {
    kDone,   // what an undisturbed run answers
    kFailed, // the failure value
    kWrong,  // any other answer
};

struct Operation {
    const char *name;
    Start start;
    std::function<Result()> run;
    bool writes = false;         // a settings file, a queue or a service
    bool queuesEvents = false;   // when it fails, a share may be marked for a re-index instead
    bool mayThrow = false;       // when there is no memory
    bool mayLackEvents = false;  // a path that cannot be resolved is deleted without an event
    bool mayLeaveStatus = false; // it changes status.conf on the side, and succeeds without that
};

const std::vector<Operation> &AllOperations();

} // namespace VANO::TORTURE

#endif
