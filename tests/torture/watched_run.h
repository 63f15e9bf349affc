#ifndef FILEINDEX_TORTURE_WATCHED_RUN_H
#define FILEINDEX_TORTURE_WATCHED_RUN_H

#include <vector>

#include "trial.h"

namespace VANO::TORTURE {

// The system calls of the undisturbed operation. Throws when something does not hold even then.
std::vector<SystemCall> CallsOf(const Trial &trial);

// Whether `call` is the one that `wanted` was in another run: by its number among its like, for
// making the random name of a temporary file takes one call more now and then.
bool IsSameCall(const SystemCall &call, const SystemCall &wanted);

} // namespace VANO::TORTURE

#endif
