#ifndef FILEINDEX_UTILS_H
#define FILEINDEX_UTILS_H

// Every free function of the library.

#include <fileindex/daemon_socket.h>
#include <fileindex/event_queue.h>
#include <fileindex/index_rules.h>
#include <fileindex/migration.h>
#include <fileindex/notification.h>
#include <fileindex/share_path.h>

#endif
