#include "paths.h"

#include "text.h"

namespace CTL {

CLI::Option *AddPathsTo(CLI::App &app, std::vector<std::string> &paths, const char *description) {
    return app.add_option("PATH", paths, description)->required();
}

std::string CheckSharePath(const std::string &path) {
    if (path.size() < 2 || path[0] != '/' || path[1] == '/') {
        return "'" + Shown(path) + "' is no share path: it begins with /SHARE";
    }
    return {};
}

std::string CheckFullPath(const std::string &path) {
    return !path.empty() && path[0] == '/' ? "" : "'" + Shown(path) + "' does not begin with /";
}

std::string CheckFolderPath(const std::string &path) {
    std::string mistake = CheckSharePath(path);
    if (!mistake.empty()) {
        return mistake;
    }
    const std::string inner = path + "/";
    for (const char *part : {"//", "/./", "/../"}) {
        if (inner.find(part) != std::string::npos) {
            return "'" + Shown(path) +
                   "' is not plain: leave out doubled and final slashes, . and ..";
        }
    }
    return {};
}

Json::Value ArrayOf(const std::vector<std::string> &paths) {
    Json::Value array(Json::arrayValue);
    for (const std::string &path : paths) {
        array.append(path);
    }
    return array;
}

} // namespace CTL
