#include "doctor/evidence.h"

#include <fileindex/index_mgr.h>

namespace CTL::DOCTOR {

namespace {

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

Evidence GatherEvidence() {
    Evidence evidence;
    evidence.folderFile = ReadJsonFile(kFolderConf);
    evidence.statusFile = ReadJsonFile(kStatusConf);
    evidence.shareTable = ReadJsonFile(kShareTable);
    evidence.areFoldersKnown = VANO::FILEINDEX::IndexMgr::List(evidence.folders);
    evidence.shares = SharesOf(NamesIn(evidence.shareTable.value), evidence.folders);
    return evidence;
}

} // namespace CTL::DOCTOR
