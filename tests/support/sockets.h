#ifndef FILEINDEX_TESTS_SOCKETS_H
#define FILEINDEX_TESTS_SOCKETS_H

// Sockets of the file tree, and what runs into them.

#include <string>
#include <sys/socket.h>

namespace VANO::TESTS {

// A socket that is bound to a path, in place of what lay there, and listens if it is one that can.
// The socket of a backlog of 0 takes one connection in that nobody has accepted.
int ListenAt(const std::string &path, int type = SOCK_STREAM, int backlog = 64);

// A connection to it; -1 with `errno` when nobody listens.
int ConnectTo(const std::string &path, int flags = 0);

// What was sent until the other end was closed, or on a socket that does not wait so far.
std::string ReadToEnd(int fd);

// A command as it goes over the daemon's socket: a length, the text, a zero byte.
std::string CommandBytes(const std::string &text);

} // namespace VANO::TESTS

#endif
