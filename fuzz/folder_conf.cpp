// The input is the text of folder.conf.
//
// It loads or is refused, as it is an object or not; what was loaded is saved and loaded again
// without a change; every query agrees with the rule it is described by; a folder that is added and
// deleted again leaves the settings as they were.

#include <fileindex/error_handler.h>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>

#include "support/check.h"
#include "support/log_tap.h"
#include "support/naive.h"
#include "support/world.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;

constexpr char kNewFolder[] = "/photos/2016/not in the file";

// The settings as JSON, without the library's own reading.
Json::Value NaiveSettings(const Json::Value &conf) {
    Json::Value settings(Json::objectValue);
    for (const std::string &path : conf.getMemberNames()) {
        const Json::Value &from = conf[path];
        Json::Value &folder = settings[path];
        folder["path"] = path;
        folder["name"] = from.isObject() ? StringOf(from["name"]) : "";
        for (const char *type : {"document", "audio", "video", "photo"}) {
            folder[type] = from.isObject() && from[type].isBool() && from[type].asBool();
        }
    }
    return settings;
}

Json::Value AsJson(const Folders &settings) {
    Json::Value all(Json::objectValue);
    for (const auto &[path, folder] : settings.folders) {
        Check(path == folder.path, "a record is filed under its path");
        all[path] = folder.asJson();
    }
    return all;
}

void CheckRefused(const std::string &text, bool isJson) {
    Check(ErrorHandler::GetError() == (isJson ? FILEINDEX_ERR_MALFORMED : FILEINDEX_ERR_LOAD),
          "a refused file sets the error of its kind", text);
    Check(LogTap::Take().size() == 1, "a refused file is logged with one line", text);
    Check(Get(kFolderFile) == text, "a refused file is left alone", text);
    std::vector<Folder> folders(1);
    Check(!IndexMgr::List(folders) && folders.size() == 1, "a failed listing leaves its output");
    Check(!IndexMgr::IsPathIndexed("/photos") && !IndexMgr::IsShareIndexed("photos"),
          "nothing is indexed by settings that cannot be loaded");
}

void CheckSaving(Folders &settings) {
    Check(settings.Save(), "settings that were loaded can be saved");
    const std::string saved = Get(kFolderFile);
    Folders again;
    Check(again.Load(), "a saved file loads", saved);
    Check(AsJson(again) == AsJson(settings), "what was saved is what is loaded", saved);
    Check(again.Save() && Get(kFolderFile) == saved, "saving is stable", saved);
}

// A path with a trailing "/" meets only what is stored with one.
bool Meets(const std::string &asked, const std::string &stored) {
    return asked.empty() || asked.back() != '/' || (!stored.empty() && stored.back() == '/');
}

void CheckQueries(const std::vector<Folder> &folders, const std::string &path) {
    bool indexed = false;
    bool contains = false;
    bool fullIndexed = false;
    for (const Folder &folder : folders) {
        const bool meets = Meets(path, folder.path);
        indexed = indexed || (meets && Lies(path, folder.path));
        contains = contains || (meets && Lies(folder.path, path));
        fullIndexed = fullIndexed || (!folder.full_path.empty() && Meets(path, folder.full_path) &&
                                      Lies(path, folder.full_path));
    }
    Check(IndexMgr::IsPathIndexed(path, folders) == indexed, "a path is indexed", path);
    Check(IndexMgr::IsPathContainIndexed(path, folders) == contains, "a path contains", path);
    Check(IndexMgr::IsFullPathIndexed(path, folders) == fullIndexed, "a full path is", path);
}

void CheckGoverning(const std::vector<Folder> &folders, const std::string &fullPath) {
    Json::Value governing(Json::objectValue);
    for (const Folder &folder : folders) {
        if (!folder.full_path.empty() && Lies(fullPath, folder.full_path)) {
            governing = folder.asJson();
        }
    }
    Check(GetMostSuitableCfg(folders, fullPath) == governing, "the last match governs", fullPath);
}

// Each folder's own paths, and some around them.
void CheckAllQueries(Folders &settings) {
    std::vector<Folder> folders;
    Check(settings.List(folders) && folders.size() == settings.folders.size(), "all are listed");
    std::vector<std::string> asked{"", "/", "/photos", "/photos/a", "/volume1/photos/a"};
    for (const Folder &folder : folders) {
        for (const char *behind : {"", "/", "/a", "a"}) {
            asked.push_back(folder.path + behind);
            asked.push_back(folder.full_path + behind);
        }
        asked.push_back(folder.path.substr(0, folder.path.rfind('/')));
    }
    asked.resize(std::min<std::size_t>(asked.size(), 24));
    for (const std::string &path : asked) {
        CheckQueries(folders, path);
        CheckGoverning(folders, path);
    }
}

void CheckShares(Folders &settings) {
    std::size_t listed = 0;
    for (const std::string &share : ShareNames()) {
        std::vector<Folder> folders;
        Check(settings.List(folders, share), "a share's folders are listed");
        Check(IndexMgr::IsShareIndexed(share) == !folders.empty(), "a share is indexed", share);
        listed += folders.size();
    }
    Check(listed <= settings.folders.size(), "a folder lies in one share");
}

// The refused 1001st folder is left out of account: it stays in memory.
void CheckAddingAndDeleting(Folders &settings) {
    const Json::Value before = AsJson(settings);
    Json::Value folder;
    folder["path"] = kNewFolder;
    folder["photo"] = true;
    Json::Value changes;
    if (settings.folders.size() >= 1000 || before.isMember(kNewFolder)) {
        return;
    }
    Check(settings.Upsert(changes, folder), "a folder of a known share is taken");
    Check(changes.size() == 4 && settings.folders.at(kNewFolder).photo, "it is what was asked");
    Check(settings.Delete(changes, kNewFolder), "it is deleted");
    Check(changes.size() == 1 && changes[kNewFolder].size() == 4, "the change is reported");
    Check(AsJson(settings) == before, "a deletion restores what was");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    const Run run;
    const std::string text(reinterpret_cast<const char *>(data), size);
    PutFile(kFolderFile, text);
    const auto conf = Parse(text);
    Folders settings;
    const bool loaded = settings.Load();
    Check(loaded == (conf && conf->isObject()), "exactly the objects are loaded", text);
    if (!loaded) {
        CheckRefused(text, conf.has_value());
        return 0;
    }
    Check(AsJson(settings) == NaiveSettings(*conf), "the settings are what the text says", text);
    CheckSaving(settings);
    CheckShares(settings);
    CheckAllQueries(settings);
    CheckAddingAndDeleting(settings);
    return 0;
}
