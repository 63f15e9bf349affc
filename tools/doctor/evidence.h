#ifndef FILEINDEXCTL_DOCTOR_EVIDENCE_H
#define FILEINDEXCTL_DOCTOR_EVIDENCE_H

#include <fileindex/folder.h>
#include <platform/diagnosis.h>
#include <string>
#include <vector>

#include "doctor/json_file.h"
#include "state/known_shares.h"

namespace CTL::DOCTOR {

// What the checks look at, read once.
struct Evidence {
    JsonFile folderFile;
    JsonFile statusFile;
    bool areFoldersKnown = false; // false when folder.conf cannot be loaded
    std::vector<VANO::FILEINDEX::Folder> folders;
    bool areSharesListed = false; // false where the platform lists none
    std::string shareTable;       // the file of that list
    std::vector<VANO::PLATFORM::StoreFault> shareFaults;
    std::vector<KnownShare> shares; // in byte order of their names

    [[nodiscard]] bool HasFolders() const { return !folders.empty(); }
};

[[nodiscard]] Evidence GatherEvidence();

// The command line that has the folders of a share indexed anew.
[[nodiscard]] std::string ReindexCommand(const KnownShare &share);

// Of what cannot be told without the folders.
[[nodiscard]] Finding FoldersUnknown();

} // namespace CTL::DOCTOR

#endif
