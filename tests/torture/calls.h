#ifndef FILEINDEX_TORTURE_CALLS_H
#define FILEINDEX_TORTURE_CALLS_H

// What can go wrong with which system call.

#include <string>
#include <vector>

#include "tracer.h"

namespace VANO::TORTURE {

struct CallFault {
    Action action = Action::kFail;
    int error = 0; // 0 for a short read or write

    bool operator==(const CallFault &other) const {
        return action == other.action && error == other.error;
    }
};

// Every failure that is plausible for the call; none for the calls that cannot fail.
std::vector<CallFault> FaultsOf(const SystemCall &call);

bool IsOneOf(const SystemCall &call, std::initializer_list<long> numbers);

// "openat", "#451"
std::string NameOf(const SystemCall &call);

// "ENOSPC", "short"
std::string NameOf(const CallFault &fault);

// The file that the call is about, as well as that can be told while it is stopped.
std::string SubjectOf(const SystemCall &call);

} // namespace VANO::TORTURE

#endif
