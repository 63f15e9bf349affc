// The two settings files and the directory that holds them.

#include <cerrno>
#include <fileindex/status.h>

#include "core/paths.h"
#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "state/folder_view.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::kSettingsDirectory;
using VANO::FILEINDEX::kStatusConfPath;

constexpr char kRestore[] = "Fix it by hand, or restore it from a backup. Moved away, it "
                            "counts as empty.";
constexpr std::size_t kMaxFolders = 1000;

std::string EditCommand(const std::string &path) {
    return "editor " + Quoted(path);
}

// Whether the directory is one that files can be looked for in.
bool LookAtDirectory(Findings &findings) {
    const int error = DirectoryError(kSettingsDirectory);
    if (error == EACCES) {
        findings.push_back(Unreadable("settings-directory-unreadable", kSettingsDirectory, error));
        return false;
    }
    if (error != 0) {
        findings.push_back(
            Error("settings-directory-missing", kSettingsDirectory,
                  std::string(kSettingsDirectory) +
                      (error == ENOTDIR ? " is not a directory" : " does not exist"))
                .Because("No setting can be saved.")
                .Fix("Create it.", std::string("mkdir -p -m 755 ") + kSettingsDirectory));
        return false;
    }
    struct stat info {};
    if (::stat(kSettingsDirectory, &info) == 0) {
        FindOddOwner(findings, kSettingsDirectory, info, "755");
    }
    return true;
}

void LookAtOwner(Findings &findings, const std::string &path) {
    const FileLook look(path);
    if (!look.Exists()) {
        return;
    }
    if (look.IsRegular()) {
        FindOddOwner(findings, path, look.info, "644");
    } else if (S_ISLNK(look.info.st_mode)) {
        findings.push_back(
            Warning("settings-link", path, path + " is a symbolic link")
                .Because("It is then rewritten in place: a full disk or a power "
                         "loss can leave half of it.")
                .Fix("Put the file itself there.",
                     "cp --remove-destination \"$(readlink -f " + path + ")\" " + path));
    }
}

// The file as JSON. False when that is all that can be said of it.
bool LookAtJson(Findings &findings, const JsonFile &file) {
    const std::optional<Finding> mistake = MistakeOf(file, "settings");
    if (mistake) {
        const bool isReadable = file.state == JsonFile::State::kMalformed;
        findings.push_back(isReadable ? Finding(*mistake).Fix(kRestore, EditCommand(file.path))
                                      : *mistake);
        return false;
    }
    if (file.state == JsonFile::State::kGood && !file.value.isObject()) {
        findings.push_back(Error("settings-shape", file.path, file.path + " is not a JSON object")
                               .Fix(kRestore, EditCommand(file.path)));
        return false;
    }
    return true;
}

std::string OddMemberOf(const Json::Value &folder) {
    if (!folder.isObject()) {
        return "it is not an object";
    }
    if (folder.isMember("name") && !folder["name"].isString()) {
        return "its \"name\" is not a string";
    }
    for (const char *type : kFileTypes) {
        if (folder.isMember(type) && !folder[type].isBool()) {
            return std::string("its \"") + type + "\" is neither true nor false";
        }
    }
    return {};
}

void LookAtFolders(Findings &findings, const JsonFile &file) {
    if (file.state == JsonFile::State::kMissing) {
        findings.push_back(Ok("settings-none", file.path, "No folder.conf yet: no folder is set"));
        return;
    }
    std::size_t odd = 0;
    for (const std::string &path : file.value.getMemberNames()) {
        const std::string member = OddMemberOf(file.value[path]);
        if (!member.empty()) {
            ++odd;
            findings.push_back(
                Warning("settings-member", path,
                        "The folder " + Shown(path) + " has an odd setting: " + member)
                    .Because("What cannot be read counts as no.")
                    .Fix("Set it again (set, with a name and all types).", ShowCommand(path)));
        }
    }
    if (file.value.size() > kMaxFolders) {
        findings.push_back(
            Warning("settings-limit", file.path,
                    Count(file.value.size(), "folder") + " are set; 1000 is the limit")
                .Because("No more can be added.")
                .Fix("Remove some.", "fileindexctl list"));
    }
    if (odd == 0) {
        findings.push_back(
            Ok("settings-good", file.path, "folder.conf: " + Count(file.value.size(), "folder")));
    }
}

bool IsPauseReadable(const Json::Value &status) {
    try {
        (void)status.get("resume_time", -1).asInt64();
        return true;
    } catch (const Json::Exception &) {
        return false;
    }
}

void LookAtStatus(Findings &findings, const JsonFile &file) {
    if (file.state == JsonFile::State::kMissing) {
        findings.push_back(Ok("settings-none", file.path, "No status.conf yet: not paused"));
        return;
    }
    const std::size_t before = findings.size();
    if (!IsPauseReadable(file.value)) {
        findings.push_back(
            Error("settings-member", "resume_time", "status.conf: \"resume_time\" is not a number")
                .Because("Whether indexing is paused cannot be told.")
                .Fix("Set it again.", "fileindexctl resume"));
    }
    for (const char *marks : {"no_space", "need_reindex"}) {
        const Json::Value &member = file.value[marks];
        if (!member.isObject() && !member.isNull()) {
            findings.push_back(
                Error("settings-member", marks,
                      std::string("status.conf: \"") + marks + "\" is not an object")
                    .Because("No share can be marked.")
                    .Fix("Remove that member by hand.", EditCommand(kStatusConfPath)));
        }
    }
    if (findings.size() == before) {
        findings.push_back(Ok("settings-good", file.path, "status.conf"));
    }
}

} // namespace

Findings CheckSettings(const Evidence &evidence) {
    Findings findings;
    if (!LookAtDirectory(findings)) {
        return findings;
    }
    for (const JsonFile *file : {&evidence.folderFile, &evidence.statusFile}) {
        LookAtOwner(findings, file->path);
        if (LookAtJson(findings, *file)) {
            (file == &evidence.folderFile ? LookAtFolders : LookAtStatus)(findings, *file);
        }
        FindStrayFiles(findings, kSettingsDirectory, file->path.substr(sizeof(kSettingsDirectory)),
                       "");
    }
    return findings;
}

} // namespace CTL::DOCTOR
