#ifndef FILEINDEX_BASE_LOG_H
#define FILEINDEX_BASE_LOG_H

#include <string>

namespace VANO::FILEINDEX {

// Writes "<unit>:<line> <message>" to the system log at error priority.
//
// Unit and line are part of the message that support tools match on: where a number is fixed it is
// written at the call and does not move with the code; elsewhere it is __LINE__. errno is kept.
void LogError(const char *unit, int line, const char *format, ...)
    __attribute__((format(printf, 3, 4)));

// The system's text for the present errno: the reason that a message gives.
[[nodiscard]] std::string ErrnoText();

} // namespace VANO::FILEINDEX

#endif
