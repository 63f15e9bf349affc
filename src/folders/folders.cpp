#include <fileindex/folders.h>

#include <array>
#include <fileindex/error_handler.h>
#include <fileindex/share_path.h>
#include <optional>

#include "base/json_io.h"
#include "base/log.h"
#include "core/folder_cover.h"
#include "core/paths.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "folders";
constexpr std::size_t kMaxFolders = 1000;

// For each file type, whether the rule changed. A type that either rule lacks counts as changed.
Json::Value ChangeReport(const Json::Value &before, const Json::Value &after) {
    static constexpr std::array kTypes = {"document", "audio", "video", "photo"};
    Json::Value report(Json::objectValue);
    for (const char *type : kTypes) {
        const bool comparable = before.isMember(type) && after.isMember(type);
        report[type] = !comparable || before[type].asBool() != after[type].asBool();
    }
    return report;
}

} // namespace

Folders::~Folders() = default;

std::string Folders::GetLockPath() const {
    return kFolderLockPath;
}

std::string Folders::GetPath() const {
    return kFolderConfPath;
}

bool Folders::Load() {
    if (!LoadJson()) {
        return false;
    }
    if (!root.isObject()) {
        LogError(kUnit, 80, "Malformed folders: %s", JsonToString(root).c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_MALFORMED);
        return false;
    }
    for (auto member = root.begin(); member != root.end(); ++member) {
        const std::string path = member.name();
        Folder folder;
        // A folder whose path no longer resolves keeps its setting.
        (void)folder.Load(path, *member);
        folders.emplace_hint(folders.end(), path, std::move(folder)); // they come in order
    }
    return true;
}

bool Folders::Save() {
    root = Json::Value(Json::objectValue);
    for (const auto &[path, folder] : folders) {
        if (!folder.AddToJson(root)) {
            return false;
        }
    }
    return SaveJson();
}

bool Folders::Get(Json::Value &out, const std::string &path) {
    const auto found = folders.find(path);
    if (found == folders.end()) {
        LogError(kUnit, 191, "No such folder: %s", path.c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_NO_SUCH_FOLDER);
        return false;
    }
    out = found->second.asJson();
    return true;
}

bool Folders::List(std::vector<Folder> &out, const std::string &share) {
    std::vector<Folder> listed;
    for (const auto &[key, folder] : folders) {
        std::string shareOfFolder;
        if (share.empty() ||
            (GetShareNameByPath(shareOfFolder, folder.path) && shareOfFolder == share)) {
            listed.push_back(folder);
        }
    }
    out.swap(listed);
    return true;
}

bool Folders::List(std::vector<Folder> &out) {
    return List(out, std::string());
}

bool Folders::Upsert(Json::Value &changes, const Json::Value &param) {
    std::string path;
    std::string full;
    if (!RetrieveStringFromJsonObj(path, "path", param) || !GetFullPath(full, path)) {
        LogError(kUnit, 129, "Bad param: %s", JsonToString(param).c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_BAD_PARAM);
        return false;
    }
    std::optional<Folder> previous;
    const auto found = folders.find(path);
    if (found != folders.end()) {
        previous = found->second;
        (void)found->second.Load(path, param);
    } else {
        (void)folders[path].Reload(path, param);
        if (folders.size() > kMaxFolders) {
            LogError(kUnit, 140, "Exceed max folder size");
            ErrorHandler::SetError(FILEINDEX_ERR_FOLDER_LIMIT);
            return false;
        }
    }
    GoverningFolder before(full);
    for (const auto &[key, folder] : folders) {
        if (key != path) {
            before.Consider(folder);
        } else if (previous) {
            before.Consider(*previous);
        }
    }
    changes = ChangeReport(before.AsJson(), folders[path].asJson());
    return true;
}

bool Folders::Delete(Json::Value &changes, const std::string &path) {
    std::string full;
    if (!GetFullPath(full, path)) {
        folders.erase(path);
        return true;
    }
    GoverningFolder before(full);
    for (const auto &[key, folder] : folders) {
        before.Consider(folder);
    }
    GoverningFolder after(full);
    for (const auto &[key, folder] : folders) {
        if (key != path) {
            after.Consider(folder);
        }
    }
    changes = Json::Value(Json::objectValue);
    changes[path] = ChangeReport(before.AsJson(), after.AsJson());
    folders.erase(path); // last: the caller's path may be the record's own
    return true;
}

} // namespace VANO::FILEINDEX
