#include <fileindex/share_path.h>

#include <cstring>
#include <fileindex/error_handler.h>
#include <string_view>
#include <sys/stat.h>
#include <utility>

#include "base/log.h"
#include "core/share.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";

// Where the path inside the share begins: the first "/" after the first character, or the end.
std::size_t EndOfShareName(const std::string &sharePath) {
    const std::size_t slash = sharePath.find('/', 1);
    return slash == std::string::npos ? sharePath.size() : slash;
}

bool HasType(const std::string &path, mode_t type) {
    struct stat info {};
    return ::lstat(path.c_str(), &info) == 0 && (info.st_mode & S_IFMT) == type;
}

// The member `key` of `obj` when it has the wanted type, otherwise null.
const Json::Value *FindMember(const Json::Value &obj, const std::string &key,
                              bool (Json::Value::*hasType)() const) {
    if (!obj.isObject()) {
        return nullptr;
    }
    const Json::Value *member = obj.find(key.data(), key.data() + key.size());
    return member != nullptr && (member->*hasType)() ? member : nullptr;
}

} // namespace

bool GetShareNameByPath(std::string &name, const std::string &sharePath) {
    if (sharePath.empty()) {
        return false;
    }
    name = sharePath.substr(1, EndOfShareName(sharePath) - 1);
    return true;
}

bool GetFullPath(std::string &fullPath, const std::string &sharePath) {
    std::string shareName;
    if (!GetShareNameByPath(shareName, sharePath)) {
        LogError(kUnit, 389, "GetShareNameByPath failed, path=%s", sharePath.c_str());
        fullPath.clear();
        return false;
    }
    const ShareRecord share = FindShare(shareName);
    if (!share) {
        ErrorHandler::SetError(FILEINDEX_ERR_PATH);
        fullPath.clear();
        return false;
    }
    // The share part keeps the spelling of the request, whatever the platform's is.
    const std::string_view directory = share->path;
    std::string resolved(directory.substr(0, directory.rfind('/')));
    fullPath = std::move(resolved += sharePath);
    return true;
}

bool GetShareNamePathByFullPath(std::string &name, std::string &path, const std::string &fullPath) {
    auto found = FindShareOfFullPath(fullPath);
    if (!found) {
        LogError(kUnit, 418, "VANOShareNamePathGet failed, path=%s", fullPath.c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_PATH);
        return false;
    }
    name = std::move(found->name);
    path = std::move(found->path);
    return true;
}

std::string ReplaceShareName(const std::string &sharePath, const std::string &newShareName) {
    if (sharePath.empty()) {
        return {};
    }
    return "/" + newShareName + sharePath.substr(EndOfShareName(sharePath));
}

bool StringStartWith(const std::string &str, const std::string &prefix) {
    return str.size() >= prefix.size() &&
           std::strncmp(str.c_str(), prefix.c_str(), prefix.size()) == 0;
}

bool IsFileExist(const std::string &path) {
    return HasType(path, S_IFREG);
}

bool IsDirExist(const std::string &path) {
    return HasType(path, S_IFDIR);
}

bool RetrieveBoolFromJsonObj(bool &out, const std::string &key, const Json::Value &obj) {
    const Json::Value *member = FindMember(obj, key, &Json::Value::isBool);
    if (member == nullptr) {
        return false;
    }
    out = member->asBool();
    return true;
}

bool RetrieveStringFromJsonObj(std::string &out, const std::string &key, const Json::Value &obj) {
    const Json::Value *member = FindMember(obj, key, &Json::Value::isString);
    if (member == nullptr) {
        return false;
    }
    out = member->asString();
    return true;
}

} // namespace VANO::FILEINDEX
