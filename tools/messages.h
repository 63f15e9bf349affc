#ifndef FILEINDEXCTL_MESSAGES_H
#define FILEINDEXCTL_MESSAGES_H

#include <string>
#include <vector>

#include "command.h"

// Everything here goes to standard error.

namespace CTL {

// A message of the tool.
void Say(const std::string &message);

// A further line of it: what to do next.
void Advise(const std::string &advice);

// Says what could not be done ("Cannot add /photos"), why, from the last errors of the library and
// of the platform, and what to do about it.
ExitCode Fail(const std::string &what);

// Where the settings did change and only the service did not follow: says so.
ExitCode FailHalfWay(const std::string &what, const std::string &advice);

// Paths for a message: "/a, /b and 3 more".
[[nodiscard]] std::string Named(const std::vector<std::string> &paths);

} // namespace CTL

#endif
