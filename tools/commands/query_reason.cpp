#include "commands/query_reason.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <filesystem>
#include <sstream>
#include <string_view>

#include "state/folder_view.h"
#include "state/refusal_text.h"
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

// What files with these extensions are, by the place of their type in kFileTypes.
constexpr std::array<std::string_view, kFileTypes.size()> kExtensions = {
    " csv doc docx epub htm html md odp ods odt pdf ppt pptx rtf txt xls xlsx xml ",
    " aac aif aiff ape dsf flac m4a m4b mka mp3 oga ogg opus wav wma wv ",
    " 3gp asf avi divx flv m2ts m4v mkv mov mp4 mpeg mpg mts ogv ts vob webm wmv ",
    " arw avif bmp cr2 cr3 dng gif heic heif jpeg jpg nef orf png raf raw rw2 svg tif tiff webp "};

// The type of a file by its name's extension; empty when it is of none.
std::string TypeByName(const std::string &fullPath) {
    const std::filesystem::path extension = std::filesystem::path(fullPath).extension();
    std::string word = " " + extension.string().substr(extension.empty() ? 0 : 1) + " ";
    std::transform(word.begin(), word.end(), word.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    for (std::size_t i = 0; word.size() > 2 && i < kFileTypes.size(); ++i) {
        if (kExtensions[i].find(word) != std::string_view::npos) {
            return kFileTypes[i];
        }
    }
    return {};
}

// Of a file whose type is not among those that `setting` names.
std::optional<Refusal> RefusalOfType(const std::string &fullPath, const Json::Value &setting) {
    std::error_code ignored;
    if (!std::filesystem::is_regular_file(fullPath, ignored)) {
        return std::nullopt;
    }
    const std::string type = TypeByName(fullPath);
    if (type.empty()) {
        return Refusal{"file-type", "by its name, the file is of none of the four types",
                       "Give the file its usual extension if it is."};
    }
    if (!setting[type].asBool()) {
        return Refusal{"file-type", "by its name, the file is of type " + type,
                       "Use fileindexctl set to index that type too."};
    }
    return std::nullopt;
}

std::optional<Refusal> RefusalOfPath(const PathForms &path) {
    if (HasReservedName(path.fullPath)) {
        return Refusal{"reserved-name", "a name in its path is reserved by the system",
                       "Use another name."};
    }
    if (path.sharePath.empty()) {
        return Refusal{"no-share", "it lies in no share", "Check the spelling of the path."};
    }
    std::optional<Refusal> refusal = RefusalOf(path.sharePath);
    if (refusal && refusal->rule == std::string_view("missing")) {
        return Refusal{refusal->rule, "there is nothing at " + Shown(path.fullPath),
                       "Check the spelling of the path."};
    }
    return refusal;
}

// The library finds it by the full path, which folders of a share that is gone do not have.
Json::Value SettingOf(const PathForms &path, const std::vector<Folder> &folders) {
    if (!path.fullPath.empty()) {
        return GoverningSetting(path.fullPath, folders);
    }
    const auto found = std::find_if(folders.rbegin(), folders.rend(), [&](const Folder &folder) {
        return VANO::FILEINDEX::IndexMgr::IsPathIndexed(path.sharePath, {folder});
    });
    return found == folders.rend() ? Json::Value(Json::objectValue) : found->asJson();
}

std::string GoverningText(const Json::Value &setting, bool isIndexed) {
    const std::string path = Shown(setting["path"].asString());
    if (path.empty()) {
        return "not in any indexed folder";
    }
    if (!isIndexed) {
        return "not by " + path + ", because of the trailing slash";
    }
    const std::string types = TypesOf(setting);
    return "by " + path + ", for " + (types.empty() ? "no file types" : types);
}

} // namespace

Reason ReasonOf(const PathForms &path, bool isIndexed, const std::vector<Folder> &folders) {
    const Json::Value setting = SettingOf(path, folders);
    std::optional<Refusal> refusal = RefusalOfPath(path);
    if (isIndexed && !refusal) {
        refusal = RefusalOfType(path.fullPath, setting);
    }
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
    reason.lines.push_back(paths.empty() ? "it has no indexed folder" : "by " + Named(paths));
    return reason;
}

} // namespace CTL
