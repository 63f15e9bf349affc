#ifndef FILEINDEX_UTILS_SERVICE_NAMES_H
#define FILEINDEX_UTILS_SERVICE_NAMES_H

namespace VANO::FILEINDEX {

constexpr char kIndexingService[] = "fileindexd";
constexpr char kFileSharingService[] = "samba";
// The flag with which the indexing service is started and stopped.
constexpr int kAlsoAtBoot = 1;

} // namespace VANO::FILEINDEX

#endif
