#ifndef FILEINDEXCTL_DOCTOR_EVIDENCE_H
#define FILEINDEXCTL_DOCTOR_EVIDENCE_H

#include <fileindex/folder.h>
#include <string>
#include <vector>

#include "doctor/json_file.h"
#include "state/known_shares.h"

namespace CTL::DOCTOR {

constexpr char kSettingsDirectory[] = "/usr/vano/etc/fileindex";
constexpr char kFolderConf[] = "/usr/vano/etc/fileindex/folder.conf";
constexpr char kStatusConf[] = "/usr/vano/etc/fileindex/status.conf";
constexpr char kFolderLock[] = "/tmp/fileidx_cfg_folder.lock";
constexpr char kStatusLock[] = "/tmp/fileidx_cfg_status.lock";
constexpr char kMonitorDirectory[] = "/usr/vano/etc/vanotifyd";

// What the checks look at, read once.
struct Evidence {
    JsonFile folderFile;
    JsonFile statusFile;
    JsonFile shareTable;
    bool areFoldersKnown = false; // false when folder.conf cannot be loaded
    std::vector<VANO::FILEINDEX::Folder> folders;
    std::vector<KnownShare> shares; // in byte order of their names

    [[nodiscard]] bool HasFolders() const { return !folders.empty(); }
};

[[nodiscard]] Evidence GatherEvidence();

// The command line that has the folders of a share indexed anew.
[[nodiscard]] std::string ReindexCommand(const KnownShare &share);

} // namespace CTL::DOCTOR

#endif
