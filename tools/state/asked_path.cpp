#include "state/asked_path.h"

#include <fileindex/share_path.h>

#include "core/folder_cover.h"
#include "core/share.h"
#include "state/known_shares.h"
#include "terminal/messages.h"

namespace CTL {

namespace fileindex = VANO::FILEINDEX;

CLI::Option *AddPathsTo(CLI::App &app, std::vector<std::string> &paths, const char *description) {
    return app.add_option("PATH", paths, description)->required();
}

std::string CheckSharePath(const std::string &path) {
    if (path.size() < 2 || path[0] != '/' || path[1] == '/') {
        return "'" + path + "' is not a share path: those begin with /SHARE";
    }
    return {};
}

std::string CheckFullPath(const std::string &path) {
    return !path.empty() && path[0] == '/' ? "" : "'" + path + "' does not begin with /";
}

std::string CheckFolderPath(const std::string &path) {
    std::string mistake = CheckSharePath(path);
    if (!mistake.empty()) {
        return mistake;
    }
    const std::string inner = path + "/";
    for (const char *part : {"//", "/./", "/../"}) {
        if (inner.find(part) != std::string::npos) {
            return "'" + path + "' is not plain: remove double and trailing slashes, . and ..";
        }
    }
    return {};
}

bool ToSharePath(std::string &sharePath, const std::string &asked) {
    if (asked.empty() || asked[0] != '/') {
        return false;
    }
    std::string share;
    (void)fileindex::GetShareNameByPath(share, asked); // the path is not empty
    const std::string own = OwnNameOf(share);
    const std::string found =
        own.empty() ? SharePathOfFullPath(asked) : fileindex::ReplaceShareName(asked, own);
    sharePath = found.empty() ? asked : found;
    return true;
}

std::string SharePathOfFullPath(const std::string &fullPath) {
    // Not through GetShareNamePathByFullPath(), which writes every no into the system log.
    const auto found = fileindex::FindShareOfFullPath(fullPath);
    const std::string share = "/" + (found ? OwnNameOf(found->name) : "");
    const std::string directory = ToFullPath(share);
    if (directory.empty() || !fileindex::IsSameOrBelow(fullPath, directory)) {
        return {};
    }
    return share + fullPath.substr(directory.size());
}

std::vector<std::string> ToSharePaths(const std::vector<std::string> &asked) {
    std::vector<std::string> sharePaths;
    for (const std::string &path : asked) {
        sharePaths.push_back(path);
        (void)ToSharePath(sharePaths.back(), path); // what is no path at all stays as typed
    }
    return sharePaths;
}

std::string ToFullPath(const std::string &sharePath) {
    std::string fullPath;
    (void)fileindex::GetFullPath(fullPath, sharePath); // empty on failure
    ForgetErrors();
    return fullPath;
}

Json::Value ArrayOf(const std::vector<std::string> &paths) {
    Json::Value array(Json::arrayValue);
    for (const std::string &path : paths) {
        array.append(path);
    }
    return array;
}

} // namespace CTL
