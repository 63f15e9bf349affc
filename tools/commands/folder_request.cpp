#include "commands/folder_request.h"

#include <algorithm>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/share_path.h>

#include "state/asked_path.h"
#include "state/folder_view.h"
#include "state/refusal_text.h"
#include "terminal/messages.h"
#include "terminal/text.h"

namespace CTL {

namespace {

using VANO::FILEINDEX::Folder;
using VANO::FILEINDEX::Folders;
using VANO::FILEINDEX::IndexMgr;

std::vector<std::string> PathsOf(const Json::Value &request) {
    std::vector<std::string> paths;
    for (const Json::Value &folder : request) {
        paths.push_back(folder["path"].asString());
    }
    return paths;
}

// Whether the settings hold what was asked for, whoever else did not hear of it. What they held
// before may be that too, without having been saved.
bool IsSaved(const Json::Value &request) {
    std::vector<Folder> folders;
    if (IsUnsaved() || !IndexMgr::List(folders)) {
        return false;
    }
    return std::all_of(request.begin(), request.end(), [&](const Json::Value &wanted) {
        return std::any_of(folders.begin(), folders.end(), [&](const Folder &folder) {
            const Json::Value set = folder.asJson();
            const auto keys = wanted.getMemberNames();
            return std::all_of(keys.begin(), keys.end(),
                               [&](const std::string &key) { return set[key] == wanted[key]; });
        });
    });
}

// The library calls a folder of an unknown share a bad parameter, without saying which. Resolving
// the paths again makes that the last error.
ExitCode FailFor(const Json::Value &request, const Wording &wording) {
    const std::vector<std::string> paths = PathsOf(request);
    std::string fullPath;
    (void)std::all_of(paths.begin(), paths.end(), [&](const std::string &path) {
        return VANO::FILEINDEX::GetFullPath(fullPath, path);
    });
    return Fail(wording.attempt + (" " + Named(paths)));
}

std::string ValueText(const Json::Value &value) {
    if (value.isBool()) {
        return value.asBool() ? "yes" : "no";
    }
    return "'" + Shown(value.asString()) + "'";
}

std::string Difference(const Json::Value &before, const Json::Value &after) {
    std::string text;
    const auto compare = [&](const char *key) {
        if (before[key] != after[key]) {
            text += (text.empty() ? "" : ", ") + std::string(key) + " from " +
                    ValueText(before[key]) + " to " + ValueText(after[key]);
        }
    };
    compare("name");
    std::for_each(kFileTypes.begin(), kFileTypes.end(), compare);
    return text;
}

std::string Effect(const Json::Value &before, const Json::Value &after) {
    const std::string path = Shown(after["path"].asString());
    if (before.isNull()) {
        const std::string types = TypesOf(after);
        return "add " + path + (types.empty() ? "" : " for " + types);
    }
    const std::string difference = Difference(before, after);
    return difference.empty() ? "leave " + path + " as it is"
                              : "change " + path + ": " + difference;
}

Json::Value SettingOf(const Folders &folders, const std::string &path) {
    const auto found = folders.folders.find(path);
    return found == folders.folders.end() ? Json::Value() : found->second.asJson();
}

ExitCode Save(const Json::Value &request, const Wording &wording) {
    const std::vector<std::string> paths = PathsOf(request);
    if (!While("Telling the indexing service", [&] { return IndexMgr::Upsert(request); })) {
        return IsSaved(request)
                   ? FailHalfWay(
                         Named(paths) + (paths.size() == 1 ? " is saved" : " are saved"),
                         "fileindexctl doctor shows what is wrong; then repeat this command.")
                   : FailFor(request, wording);
    }
    Say(wording.done + (" " + Named(paths)) + ".");
    for (const std::string &path : paths) {
        if (const auto refusal = RefusalOf(path)) {
            Say(Shown(path) + " cannot be indexed as it is: " + refusal->why + ".");
            Advise(refusal->fix);
        }
    }
    return kDone;
}

ExitCode Preview(const Change &change, const Json::Value &request, const Wording &wording) {
    Folders folders; // never saved
    if (!folders.Load()) {
        return FailFor(request, wording);
    }
    std::vector<std::string> effects;
    for (const Json::Value &folder : request) {
        const Json::Value before = SettingOf(folders, folder["path"].asString());
        Json::Value changes;
        if (!folders.Upsert(changes, folder)) {
            return FailFor(request, wording);
        }
        effects.push_back(Effect(before, SettingOf(folders, folder["path"].asString())));
    }
    for (const std::string &effect : effects) {
        change.Would(effect);
    }
    return kDone;
}

} // namespace

Json::Value RequestFor(const std::vector<std::string> &paths, const Json::Value &members) {
    Json::Value request(Json::arrayValue);
    for (const std::string &path : paths) {
        Json::Value folder = members;
        folder["path"] = path;
        request.append(folder);
    }
    return request;
}

ExitCode Apply(Change &change, const Json::Value &request, const Wording &wording) {
    change.facts["paths"] = ArrayOf(PathsOf(request));
    return change.isDryRun ? Preview(change, request, wording) : Save(request, wording);
}

} // namespace CTL
