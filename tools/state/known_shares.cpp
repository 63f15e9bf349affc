
#include <fileindex/error_handler.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>
#include <fileindex/status.h>
#include <fileindex/status_mgr.h>
#include <map>
#include <platform/diagnosis.h>

#include "core/share.h"
#include "state/known_shares.h"
#include "terminal/messages.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::IndexMgr;
using VANO::FILEINDEX::StatusMgr;

MarkedShare WithMarks(KnownShare share) {
    MarkedShare facts{std::move(share)};
    facts.isOutOfSpace = StatusMgr::ShareIsNoSpace(facts.name);
    facts.needsReindex = StatusMgr::ShareIsNeedReindex(facts.name);
    return facts;
}

// The members of an object whose names are shares'; none of another value.
std::set<std::string> MembersOf(const Json::Value &object) {
    const auto names = object.isObject() ? object.getMemberNames() : Json::Value::Members();
    return {names.begin(), names.end()};
}

} // namespace

std::string DirectoryOfShare(const std::string &name) {
    const VANO::FILEINDEX::ShareRecord share = VANO::FILEINDEX::FindShare(name);
    ForgetErrors();
    return share ? share->path : "";
}

std::string OwnNameOf(const std::string &name) {
    // Not the record's name, which may differ in case from the directory's.
    const std::string directory = DirectoryOfShare(name);
    return directory.substr(directory.rfind('/') + 1);
}

std::vector<KnownShare> SharesOf(const std::set<std::string> &names,
                                 const std::vector<Folder> &folders) {
    std::map<std::string, KnownShare> shares;
    for (const std::string &name : names) {
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
        share.directory = DirectoryOfShare(name);
        list.push_back(std::move(share));
    }
    return list;
}

bool ListShares(std::vector<MarkedShare> &shares) {
    std::vector<Folder> folders;
    Json::Value status;
    if (!IndexMgr::List(folders) || !LoadStatus(status)) {
        return false;
    }
    std::set<std::string> names = MembersOf(status["no_space"]);
    names.merge(MembersOf(status["need_reindex"]));
    if (VANO::PLATFORM::ListShares != nullptr) {
        const auto list = VANO::PLATFORM::ListShares();
        names.insert(list.names.begin(), list.names.end());
    }
    for (KnownShare &share : SharesOf(names, folders)) {
        shares.push_back(WithMarks(std::move(share)));
    }
    return true;
}

std::string NameOfShare(const std::string &typed) {
    if (IndexMgr::IsShareIndexed(typed) || StatusMgr::ShareIsNoSpace(typed) ||
        StatusMgr::ShareIsNeedReindex(typed)) {
        return typed;
    }
    const std::string own = OwnNameOf(typed);
    return own.empty() ? typed : own;
}

bool LookUpShare(MarkedShare &share, const std::string &typed) {
    std::vector<Folder> folders;
    Json::Value status;
    if (!IndexMgr::List(folders) || !LoadStatus(status)) {
        return false;
    }
    const std::string name = NameOfShare(typed);
    for (KnownShare &known : SharesOf({name}, folders)) {
        if (known.name == name) {
            share = WithMarks(std::move(known));
        }
    }
    return true;
}

bool LoadStatus(Json::Value &status) {
    VANO::FILEINDEX::Status file;
    if (!file.Load()) {
        return false;
    }
    if (!file.root.isObject()) {
        VANO::FILEINDEX::ErrorHandler::SetError(VANO::FILEINDEX::FILEINDEX_ERR_MALFORMED);
        return false;
    }
    status = file.root;
    return true;
}

} // namespace CTL
