#include "doctor/machine.h"

#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <map>
#include <memory>
#include <vano_platform.h>

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::Folder;

constexpr std::size_t kMostNamed = 10; // on one command line

struct FreeRecord {
    void operator()(_tag_VANOSHARE *record) const { VANOShareFree(record); }
};

std::string DirectoryOf(const std::string &share) {
    _tag_VANOSHARE *found = nullptr;
    if (share.find('\0') != std::string::npos || VANOShareGet(share.c_str(), &found) < 0) {
        return {};
    }
    const std::unique_ptr<_tag_VANOSHARE, FreeRecord> record(found);
    return record->path;
}

std::vector<KnownShare> SharesOf(const Json::Value &table, const std::vector<Folder> &folders) {
    std::map<std::string, KnownShare> shares;
    for (const std::string &name :
         table.isObject() ? table.getMemberNames() : Json::Value::Members()) {
        shares[name].name = name;
    }
    for (const Folder &folder : folders) {
        std::string name;
        if (VANO::FILEINDEX::GetShareNameByPath(name, folder.path)) {
            shares[name].name = name;
            shares[name].folders.push_back(folder);
        }
    }
    std::vector<KnownShare> list;
    for (auto &[name, share] : shares) {
        share.directory = DirectoryOf(name);
        list.push_back(std::move(share));
    }
    return list;
}

} // namespace

std::string KnownShare::Queue() const {
    return directory + "/@eaDir/VANO@file_index_queue";
}

std::string KnownShare::ReindexCommand() const {
    std::string command = "fileindexctl reindex";
    if (folders.empty() || folders.size() > kMostNamed) {
        return command + " --all";
    }
    for (const Folder &folder : folders) {
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
    machine.shares = SharesOf(machine.shareTable.value, machine.folders);
    return machine;
}

} // namespace CTL::DOCTOR
