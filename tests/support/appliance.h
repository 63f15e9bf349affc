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

constexpr char kSettingsDirectory[] = "/usr/vano/etc/fileindex";
constexpr char kFolderFile[] = "/usr/vano/etc/fileindex/folder.conf";
constexpr char kFolderLock[] = "/tmp/fileidx_cfg_folder.lock";
constexpr char kStatusFile[] = "/usr/vano/etc/fileindex/status.conf";
constexpr char kStatusLock[] = "/tmp/fileidx_cfg_status.lock";
constexpr char kShareTable[] = "/usr/vano/etc/shares.json";
constexpr char kMonitorDirectory[] = "/usr/vano/etc/vanotifyd";
constexpr char kDaemonSocket[] = "/var/run/fileindexd.sock";
constexpr char kQueueName[] = "VANO@file_index_queue";

constexpr char kPhotos[] = "/volume1/photos"; // the share that most tests have
constexpr char kPhotoQueue[] = "/volume1/photos/@eaDir/VANO@file_index_queue";
constexpr char kPhotoTaken[] = "/volume1/photos/@eaDir/VANO@file_index_queue.tmp";
constexpr char kPhotoDatabase[] = "/volume1/photos/@eaDir/VANO@.fileindexdb";

constexpr int kReindexEvent = 65536;
constexpr int kSettingEvent = 131072;

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
