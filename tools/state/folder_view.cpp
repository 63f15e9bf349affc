#include "state/folder_view.h"

#include <algorithm>
#include <iterator>

#include "core/folder_cover.h"

namespace CTL {

using VANO::FILEINDEX::Folder;

Json::Value FolderFacts() {
    Json::Value keys(Json::arrayValue);
    keys.append("status");
    keys.append("is_valid");
    return keys;
}

std::string TypesOf(const Json::Value &folder) {
    std::string types;
    for (const char *type : kFileTypes) {
        if (folder[type].asBool()) {
            types += (types.empty() ? "" : ",") + std::string(type);
        }
    }
    return types;
}

std::string StatusOf(const Json::Value &folder) {
    const Json::Value &facts = folder["additional"];
    const std::string status = facts["status"].asString();
    if (!facts["is_valid"].asBool()) {
        return "cannot be indexed";
    }
    return status == "err_no_space" ? "out of space" : status;
}

Json::Value AsJson(const std::optional<Refusal> &refusal) {
    Json::Value value;
    if (refusal) {
        value["rule"] = refusal->rule;
        value["why"] = refusal->why;
        value["fix"] = refusal->fix;
    }
    return value;
}

std::vector<std::string> PathsOf(const std::vector<Folder> &folders) {
    std::vector<std::string> paths;
    std::transform(folders.begin(), folders.end(), std::back_inserter(paths),
                   [](const Folder &folder) { return folder.path; });
    return paths;
}

Json::Value GoverningSetting(const std::string &fullPath, const std::vector<Folder> &folders) {
    VANO::FILEINDEX::GoverningFolder governing(fullPath);
    for (const Folder &folder : folders) {
        if (!folder.full_path.empty()) { // the library would look for its share, and log
            governing.Consider(folder);
        }
    }
    return governing.AsJson();
}

bool IsSet(const std::string &path, const std::vector<Folder> &folders) {
    return std::any_of(folders.begin(), folders.end(),
                       [&](const Folder &folder) { return folder.path == path; });
}

std::vector<std::string> NotSet(const std::vector<std::string> &paths,
                                const std::vector<Folder> &folders) {
    std::vector<std::string> missing;
    std::copy_if(paths.begin(), paths.end(), std::back_inserter(missing),
                 [&](const std::string &path) { return !IsSet(path, folders); });
    return missing;
}

} // namespace CTL
