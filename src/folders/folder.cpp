#include <fileindex/folder.h>

#include <fileindex/share_path.h>

#include "base/log.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "folder";

} // namespace

bool Folder::Load(const std::string &newPath, const Json::Value &obj) {
    path = newPath;
    // A missing or mistyped member keeps its value.
    (void)RetrieveStringFromJsonObj(name, "name", obj);
    (void)RetrieveBoolFromJsonObj(document, "document", obj);
    (void)RetrieveBoolFromJsonObj(audio, "audio", obj);
    (void)RetrieveBoolFromJsonObj(video, "video", obj);
    (void)RetrieveBoolFromJsonObj(photo, "photo", obj);
    return VANO::FILEINDEX::GetFullPath(full_path, path);
}

bool Folder::Reload(const std::string &newPath, const Json::Value &obj) {
    Folder fresh;
    const bool resolved = fresh.Load(newPath, obj);
    *this = std::move(fresh);
    return resolved;
}

bool Folder::SetPath(const std::string &newPath) {
    path = newPath;
    return VANO::FILEINDEX::GetFullPath(full_path, path);
}

std::string Folder::GetFullPath() const {
    if (!full_path.empty()) {
        return full_path;
    }
    std::string resolved;
    if (!VANO::FILEINDEX::GetFullPath(resolved, path)) {
        LogError(kUnit, 16, "Failed to get full path from %s", path.c_str());
    }
    return resolved;
}

Json::Value Folder::asJson() const {
    Json::Value json(Json::objectValue);
    json["path"] = path;
    json["name"] = name;
    json["document"] = document;
    json["audio"] = audio;
    json["video"] = video;
    json["photo"] = photo;
    return json;
}

bool Folder::AddToJson(Json::Value &obj) const {
    if (!obj.isObject()) {
        return false;
    }
    obj[path] = asJson();
    return true;
}

} // namespace VANO::FILEINDEX
