#include <fileindex/fileindex.h>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>

#include <algorithm>

#include "base/log.h"
#include "base/no_throw.h"
#include "core/folder_cover.h"
#include "index_mgr/parts.h"

namespace VANO::FILEINDEX {

namespace {

bool EndsInSlash(const std::string &path) {
    return !path.empty() && path.back() == '/';
}

// A path that is asked about with a trailing "/" meets only folders that are stored with one.
bool MayMeet(const std::string &asked, const std::string &stored) {
    return !EndsInSlash(asked) || EndsInSlash(stored);
}

// Answers no when the settings cannot be loaded, or not within the memory there is: a query never
// throws.
template <typename Query>
bool AskSettings(Query query) {
    return NoThrow(false, [&] {
        std::vector<Folder> folders;
        return IndexMgr::List(folders) && query(folders);
    });
}

// The same for a caller in C.
template <typename Query>
int AskFor(const char *what, Query query) {
    return NoThrow(0, [&] { return what != nullptr && query(std::string(what)) ? 1 : 0; });
}

} // namespace

bool HoldsFolderOfShare(const std::vector<Folder> &folders, const std::string &share) {
    return std::any_of(folders.begin(), folders.end(), [&](const Folder &folder) {
        std::string shareOfFolder;
        if (!GetShareNameByPath(shareOfFolder, folder.path)) {
            LogError(kIndexMgrUnit, __LINE__, "Failed to get share name from path: %s",
                     folder.path.c_str());
            return false;
        }
        return shareOfFolder == share;
    });
}

bool IndexMgr::List(std::vector<Folder> &folders) {
    Folders settings;
    if (!settings.Load()) {
        return false;
    }
    std::vector<Folder> listed;
    listed.reserve(settings.folders.size());
    for (auto &[path, folder] : settings.folders) {
        listed.push_back(std::move(folder)); // the settings are not needed any more
    }
    folders.swap(listed);
    return true;
}

bool IndexMgr::IsShareIndexed(const std::string &share) {
    return AskSettings(
        [&](const std::vector<Folder> &folders) { return HoldsFolderOfShare(folders, share); });
}

bool IndexMgr::IsPathIndexed(const std::string &path, const std::vector<Folder> &folders) {
    return std::any_of(folders.begin(), folders.end(), [&](const Folder &folder) {
        return MayMeet(path, folder.path) && IsSameOrBelow(path, folder.path);
    });
}

bool IndexMgr::IsPathContainIndexed(const std::string &path, const std::vector<Folder> &folders) {
    return std::any_of(folders.begin(), folders.end(), [&](const Folder &folder) {
        return MayMeet(path, folder.path) && IsSameOrBelow(folder.path, path);
    });
}

bool IndexMgr::IsFullPathIndexed(const std::string &fullPath, const std::vector<Folder> &folders) {
    std::string scratch;
    return std::any_of(folders.begin(), folders.end(), [&](const Folder &folder) {
        const std::string &full = FullPathOf(folder, scratch);
        // A folder that no longer resolves covers nothing.
        return !full.empty() && MayMeet(fullPath, full) && IsSameOrBelow(fullPath, full);
    });
}

bool IndexMgr::IsPathIndexed(const std::string &path) {
    return AskSettings(
        [&](const std::vector<Folder> &folders) { return IsPathIndexed(path, folders); });
}

bool IndexMgr::IsPathContainIndexed(const std::string &path) {
    return AskSettings(
        [&](const std::vector<Folder> &folders) { return IsPathContainIndexed(path, folders); });
}

bool IndexMgr::IsFullPathIndexed(const std::string &fullPath) {
    return AskSettings(
        [&](const std::vector<Folder> &folders) { return IsFullPathIndexed(fullPath, folders); });
}

} // namespace VANO::FILEINDEX

using VANO::FILEINDEX::IndexMgr;

int FILEIDXIsShareIndexed(const char *szShare) {
    return VANO::FILEINDEX::AskFor(
        szShare, [](const std::string &share) { return IndexMgr::IsShareIndexed(share); });
}

int FILEIDXIsPathIndexed(const char *szPath) {
    return VANO::FILEINDEX::AskFor(
        szPath, [](const std::string &path) { return IndexMgr::IsPathIndexed(path); });
}

int FILEIDXIsFullPathIndexed(const char *szFullPath) {
    return VANO::FILEINDEX::AskFor(
        szFullPath, [](const std::string &path) { return IndexMgr::IsFullPathIndexed(path); });
}
