#ifndef FILEINDEX_DAEMON_SOCKET_H
#define FILEINDEX_DAEMON_SOCKET_H

#include <json/value.h>
#include <string>

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// Sends one command to the indexing daemon over its socket "/var/run/fileindexd.sock".
///
/// The message is a 4-byte length in host byte order, counting what follows, then the JSON text
/// {"type": command, "data": data} with a terminating zero byte. The daemon's answer is not read.
/// SIGPIPE is ignored in the whole process from the first call on. Threads may call at the same
/// time.
///
/// A daemon that accepts no more holds the call for about a second. One that does not read holds a
/// piece of at most 1024 bytes for about a second; the call then steps back a byte and tries again,
/// so a message larger than the socket's buffer (some 200 KB) can wait very long.
///
/// @param command the command's name.
/// @param data    its parameters, any JSON value.
/// @return true when the whole message was handed to the socket. False otherwise, with nothing
///         logged: no daemon listening is the common case.
FILEINDEX_API bool SendCammandToDaemon(const std::string &command, const Json::Value &data);

} // namespace VANO::FILEINDEX

#endif
