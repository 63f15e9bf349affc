#include "share/shares.h"

#include <fileindex/folders.h>
#include <fileindex/share_path.h>
#include <fileindex/status_mgr.h>
#include <fstream>
#include <json/reader.h>
#include <set>

#include "paths.h"
#include "status_file.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::Folders;
using VANO::FILEINDEX::StatusMgr;

// Where plain Linux has its shares. The platform finds shares by name and lists none.
constexpr char kShareTable[] = "/usr/vano/etc/shares.json";

void AddNames(std::set<std::string> &names, const Json::Value &object) {
    if (object.isObject()) {
        for (const std::string &name : object.getMemberNames()) {
            names.insert(name);
        }
    }
}

// A table that is not there or is broken names no share; the platform then knows none either.
void AddNamesOfTable(std::set<std::string> &names) {
    std::ifstream file(kShareTable);
    Json::Value table;
    try {
        if (file && Json::parseFromStream(Json::CharReaderBuilder(), file, &table, nullptr)) {
            AddNames(names, table);
        }
    } catch (const Json::Exception &) {
        return; // nested too deeply
    }
}

void AddNamesOfFolders(std::set<std::string> &names, Folders &settings) {
    std::vector<Folder> folders;
    (void)settings.List(folders); // always true
    for (const Folder &folder : folders) {
        std::string name;
        if (VANO::FILEINDEX::GetShareNameByPath(name, folder.path)) {
            names.insert(name);
        }
    }
}

ShareFacts StateOf(const std::string &name, Folders &settings) {
    ShareFacts share;
    share.name = name;
    share.directory = ToFullPath("/" + name);
    (void)settings.List(share.folders, name); // always true
    share.isOutOfSpace = StatusMgr::ShareIsNoSpace(name);
    share.needsReindex = StatusMgr::ShareIsNeedReindex(name);
    return share;
}

} // namespace

bool ListShares(std::vector<ShareFacts> &shares) {
    Folders settings;
    Json::Value status;
    if (!settings.Load() || !LoadStatus(status)) {
        return false;
    }
    std::set<std::string> names;
    AddNamesOfTable(names);
    AddNamesOfFolders(names, settings);
    AddNames(names, status["no_space"]);
    AddNames(names, status["need_reindex"]);
    for (const std::string &name : names) {
        shares.push_back(StateOf(name, settings));
    }
    return true;
}

bool LookUpShare(ShareFacts &share, const std::string &name) {
    Folders settings;
    Json::Value status;
    if (!settings.Load() || !LoadStatus(status)) {
        return false;
    }
    share = StateOf(name, settings);
    return true;
}

} // namespace CTL
