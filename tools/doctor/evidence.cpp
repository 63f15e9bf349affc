#include "doctor/evidence.h"

#include <fileindex/index_mgr.h>

#include "core/paths.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::kFolderConfPath;
using VANO::FILEINDEX::kStatusConfPath;

constexpr std::size_t kMostNamed = 10; // on one command line

} // namespace

std::string ReindexCommand(const KnownShare &share) {
    std::string command = "fileindexctl reindex";
    if (share.folders.empty() || share.folders.size() > kMostNamed) {
        return command + " --all";
    }
    for (const auto &folder : share.folders) {
        command += " " + Quoted(folder.path);
    }
    return command;
}

Finding FoldersUnknown() {
    return Unknown("folders-unknown", kFolderConfPath,
                   "The settings cannot be loaded; see Settings");
}

Evidence GatherEvidence() {
    Evidence evidence;
    evidence.folderFile = ReadJsonFile(kFolderConfPath);
    evidence.statusFile = ReadJsonFile(kStatusConfPath);
    evidence.areFoldersKnown = VANO::FILEINDEX::IndexMgr::List(evidence.folders);
    std::set<std::string> names;
    if (VANO::PLATFORM::ListShares != nullptr) {
        const VANO::PLATFORM::ShareList list = VANO::PLATFORM::ListShares();
        evidence.areSharesListed = true;
        evidence.shareTable = list.file;
        evidence.shareFaults = list.faults;
        names.insert(list.names.begin(), list.names.end());
    }
    evidence.shares = SharesOf(names, evidence.folders);
    return evidence;
}

} // namespace CTL::DOCTOR
