#ifndef FILEINDEX_CORE_PATHS_H
#define FILEINDEX_CORE_PATHS_H

// Every fixed path, and every fixed name of another party.

namespace VANO::FILEINDEX {

constexpr char kSettingsDirectory[] = "/usr/vano/etc/fileindex";
constexpr char kFolderConfPath[] = "/usr/vano/etc/fileindex/folder.conf";
constexpr char kFolderLockPath[] = "/tmp/fileidx_cfg_folder.lock";
constexpr char kStatusConfPath[] = "/usr/vano/etc/fileindex/status.conf";
constexpr char kStatusLockPath[] = "/tmp/fileidx_cfg_status.lock";
constexpr char kDaemonSocketPath[] = "/var/run/fileindexd.sock";
constexpr char kNotifyToolPath[] = "/usr/vano/bin/vanozemnotify";
constexpr char kRemoveToolPath[] = "/bin/rm";

// Inside each share:
constexpr char kMetadataDirName[] = "@eaDir";
constexpr char kIndexDbName[] = "VANO@.fileindexdb";
constexpr char kEventQueueName[] = "VANO@file_index_queue";
// Behind a queue file's path: the queue that the daemon took over.
constexpr char kTakenQueueSuffix[] = ".tmp";

constexpr char kIndexingService[] = "fileindexd";
constexpr char kFileSharingService[] = "samba";
// The flag with which the indexing service is started and stopped.
constexpr int kAlsoAtBoot = 1;

// Under which the change monitor knows the indexing daemon.
constexpr char kMonitorConsumer[] = "fileindex";

} // namespace VANO::FILEINDEX

#endif
