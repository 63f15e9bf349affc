#ifndef FILEINDEXCTL_DOCTOR_PROCESS_H
#define FILEINDEXCTL_DOCTOR_PROCESS_H

#include <string>
#include <sys/types.h>

namespace CTL::DOCTOR {

// A process, fit for a terminal: "smbd (PID 123)"; "an unknown process" for one that has ended or
// that this user may not see.
[[nodiscard]] std::string ProcessName(pid_t pid);

// The letter of its state, as /proc/PID/stat has it; 0 when it cannot be told.
[[nodiscard]] char ProcessState(pid_t pid);

} // namespace CTL::DOCTOR

#endif
