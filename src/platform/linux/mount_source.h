#ifndef VANO_PLATFORM_MOUNT_SOURCE_H
#define VANO_PLATFORM_MOUNT_SOURCE_H

#include <string>

namespace VANO::PLATFORM {

// What the file system that holds the open file is mounted from, usually a block device's path;
// empty when that cannot be told.
std::string MountSourceOf(int fd);

} // namespace VANO::PLATFORM

#endif
