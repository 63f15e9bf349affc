#ifndef FILEINDEXCTL_DOCTOR_MACHINE_H
#define FILEINDEXCTL_DOCTOR_MACHINE_H

#include <fileindex/folder.h>
#include <string>
#include <vector>

#include "doctor/json_file.h"
#include "shares.h"

namespace CTL::DOCTOR {

constexpr char kSettingsDirectory[] = "/usr/vano/etc/fileindex";
constexpr char kFolderConf[] = "/usr/vano/etc/fileindex/folder.conf";
constexpr char kStatusConf[] = "/usr/vano/etc/fileindex/status.conf";
constexpr char kFolderLock[] = "/tmp/fileidx_cfg_folder.lock";
constexpr char kStatusLock[] = "/tmp/fileidx_cfg_status.lock";
constexpr char kMonitorDirectory[] = "/usr/vano/etc/vanotifyd";

// A share of the table, or one that a folder names.
struct KnownShare : Share {
    [[nodiscard]] std::string Queue() const;

    // The command line that has its folders indexed anew.
    [[nodiscard]] std::string ReindexCommand() const;
};

// What the checks look at, read once.
struct Machine {
    JsonFile folderFile;
    JsonFile statusFile;
    JsonFile shareTable;
    bool areFoldersKnown = false; // false when folder.conf cannot be loaded
    std::vector<VANO::FILEINDEX::Folder> folders;
    std::vector<KnownShare> shares; // in byte order of their names

    [[nodiscard]] bool HasFolders() const { return !folders.empty(); }
};

[[nodiscard]] Machine LookAtMachine();

} // namespace CTL::DOCTOR

#endif
