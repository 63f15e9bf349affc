#include "doctor/machine.h"

#include <fileindex/index_mgr.h>
#include <utility>

#include "status/queue_file.h"

namespace CTL::DOCTOR {

namespace {

constexpr std::size_t kMostNamed = 10; // on one command line

} // namespace

std::string KnownShare::Queue() const {
    return QueueIn(directory);
}

std::string KnownShare::ReindexCommand() const {
    std::string command = "fileindexctl reindex";
    if (folders.empty() || folders.size() > kMostNamed) {
        return command + " --all";
    }
    for (const auto &folder : folders) {
        command += " " + Quoted(folder.path);
    }
    return command;
}

Machine LookAtMachine() {
    Machine machine;
    machine.folderFile = ReadJsonFile(kFolderConf);
    machine.statusFile = ReadJsonFile(kStatusConf);
    machine.shareTable = ReadJsonFile(kShareTable);
    machine.areFoldersKnown = VANO::FILEINDEX::IndexMgr::List(machine.folders);
    for (Share &share : SharesOf(NamesIn(machine.shareTable.value), machine.folders)) {
        machine.shares.push_back({std::move(share)});
    }
    return machine;
}

} // namespace CTL::DOCTOR
