#ifndef FILEINDEX_TESTS_APPLIANCE_H
#define FILEINDEX_TESTS_APPLIANCE_H

// The appliance that tests, fuzz targets and torture run on: where its files lie, and how it is put
// together.
//
//     EmptyAppliance();
//     PutShares({{"photos", kPhotos}}, {"2016"});   // for the plain-Linux provider
//     PutFile(QueueOf(kPhotos), EventLine("/volume1/photos/2016/a.jpg"));

#include <map>
#include <string>
#include <vector>

namespace VANO::TESTS {

inline constexpr char kSettingsDirectory[] = "/usr/vano/etc/fileindex";
inline constexpr char kFolderFile[] = "/usr/vano/etc/fileindex/folder.conf";
inline constexpr char kFolderLock[] = "/tmp/fileidx_cfg_folder.lock";
inline constexpr char kStatusFile[] = "/usr/vano/etc/fileindex/status.conf";
inline constexpr char kStatusLock[] = "/tmp/fileidx_cfg_status.lock";
inline constexpr char kShareTable[] = "/usr/vano/etc/shares.json";
inline constexpr char kMonitorDirectory[] = "/usr/vano/etc/vanotifyd";
inline constexpr char kDaemonSocket[] = "/var/run/fileindexd.sock";
inline constexpr char kQueueName[] = "VANO@file_index_queue";

inline constexpr char kPhotos[] = "/volume1/photos"; // the share that most tests have
inline constexpr char kPhotoQueue[] = "/volume1/photos/@eaDir/VANO@file_index_queue";
inline constexpr char kPhotoTaken[] = "/volume1/photos/@eaDir/VANO@file_index_queue.tmp";
inline constexpr char kPhotoDatabase[] = "/volume1/photos/@eaDir/VANO@.fileindexdb";

inline constexpr int kReindexEvent = 65536;
inline constexpr int kSettingEvent = 131072;

// Inside a share's directory: the queue, and the one that the daemon has taken over.
std::string QueueOf(const std::string &directory);
std::string TakenOf(const std::string &directory);
std::string DatabaseOf(const std::string &directory);

// A line of a queue.
std::string EventLine(const std::string &path, int code = kSettingEvent);

// No settings, no lock files, no daemon, and nothing on the volumes.
void EmptyAppliance();

// The share table of the plain-Linux provider, by name; each directory is made, with these folders
// and the one for metadata.
void PutShares(const std::map<std::string, std::string> &directories,
               const std::vector<std::string> &folders = {});

// A program of the appliance.
void PutProgram(const std::string &path, const std::string &shellText);

} // namespace VANO::TESTS

#endif
