#include "commands/query_reason.h"

#include <algorithm>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <sstream>
#include <string_view>

#include "state/folder_view.h"
#include "state/index_refusal.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;

// Names that the system keeps for itself are left out wherever they stand in the path.
bool HasReservedName(const std::string &fullPath) {
    std::istringstream path(fullPath);
    for (std::string name; std::getline(path, name, '/');) {
        if (VANO::FILEINDEX::IsSystemPreservedFileName(name)) {
            return true;
        }
    }
    return false;
}

std::optional<Refusal> RefusalOfPath(const PathForms &path) {
    if (HasReservedName(path.fullPath)) {
        return Refusal{"reserved-name", "the system keeps a name in the path for itself",
                       "Use another name."};
    }
    if (path.sharePath.empty()) {
        return Refusal{"no-share", "it lies in no share", "Check how the path is spelt."};
    }
    std::optional<Refusal> refusal = RefusalOf(path.sharePath);
    if (refusal && refusal->rule == std::string_view("missing")) {
        return Refusal{refusal->rule, "there is nothing at " + Shown(path.fullPath),
                       "Check how the path is spelt."};
    }
    return refusal;
}

// The library finds it by the full path, which folders of a share that is gone do not have.
Json::Value GoverningSetting(const PathForms &path, const std::vector<Folder> &folders) {
    if (!path.fullPath.empty()) {
        return VANO::FILEINDEX::GetMostSuitableCfg(Resolved(folders), path.fullPath);
    }
    const auto found = std::find_if(folders.rbegin(), folders.rend(), [&](const Folder &folder) {
        return VANO::FILEINDEX::IndexMgr::IsPathIndexed(path.sharePath, {folder});
    });
    return found == folders.rend() ? Json::Value(Json::objectValue) : found->asJson();
}

std::string GoverningText(const Json::Value &setting, bool isIndexed) {
    const std::string path = Shown(setting["path"].asString());
    if (path.empty()) {
        return "no indexed folder holds it";
    }
    if (!isIndexed) {
        return "not by " + path + ", for its final slash";
    }
    const std::string types = TypesOf(setting);
    return "by " + path + ", for " + (types.empty() ? "no file types" : types);
}

} // namespace

Reason ReasonOf(const PathForms &path, bool isIndexed, const std::vector<Folder> &folders) {
    const Json::Value setting = GoverningSetting(path, folders);
    const std::optional<Refusal> refusal = RefusalOfPath(path);
    Reason reason;
    reason.facts["setting"] = isIndexed ? setting : Json::Value();
    reason.facts["refusal"] = AsJson(refusal);
    reason.lines.push_back(GoverningText(setting, isIndexed));
    if (refusal) {
        reason.lines.push_back((isIndexed ? "but left out: " : "nor could it be: ") + refusal->why);
    }
    return reason;
}

Reason ReasonOfShare(const std::string &share, const std::vector<Folder> &folders) {
    Reason reason;
    reason.facts["folder"] = Json::Value(Json::arrayValue);
    std::vector<std::string> paths;
    for (const Folder &folder : folders) {
        std::string name;
        if (VANO::FILEINDEX::GetShareNameByPath(name, folder.path) && name == share) {
            paths.push_back(folder.path);
            reason.facts["folder"].append(folder.asJson());
        }
    }
    reason.lines.push_back(paths.empty() ? "no indexed folder lies in it" : "by " + Named(paths));
    return reason;
}

} // namespace CTL
