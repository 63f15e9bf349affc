// The folders that are set: may they be indexed, and is there anything to index?

#include <cerrno>
#include <fileindex/share_path.h>
#include <unistd.h>

#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "state/refusal_text.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::Folder;

// A rule that has refused a path which this user cannot reach may be a matter of rights only.
bool IsForRootOnly(const Refusal &refusal, const std::string &fullPath) {
    return std::string(refusal.rule) == "unreachable" && !fullPath.empty() &&
           DirectoryError(fullPath) == EACCES && ::geteuid() != 0;
}

void LookAtFolder(Findings &findings, const Folder &folder) {
    std::string fullPath;
    (void)VANO::FILEINDEX::GetFullPath(fullPath, folder.path);
    const std::optional<Refusal> refusal = RefusalOf(folder.path);
    if (refusal && IsForRootOnly(*refusal, fullPath)) {
        findings.push_back(Unreadable("", fullPath, EACCES));
        return;
    }
    if (refusal) {
        findings.push_back(
            Error("folder-refused", folder.path, Shown(folder.path) + " cannot be indexed")
                .Because(std::string("Rule ") + refusal->rule + ": " + refusal->why + ".")
                .Fix(refusal->fix, ShowCommand(folder.path))
                .With("rule", refusal->rule)
                .With("full_path", fullPath));
        return;
    }
    if (DirectoryError(fullPath) == ENOTDIR) {
        findings.push_back(
            Warning("folder-file", folder.path, Shown(folder.path) + " is no directory")
                .Fix("Choose the directory that contains it.", ShowCommand(folder.path)));
    }
    if (!folder.document && !folder.audio && !folder.video && !folder.photo) {
        findings.push_back(
            Warning("folder-typeless", folder.path,
                    "No file type is indexed of " + Shown(folder.path))
                .Fix("Choose some (set), or remove the folder.", ShowCommand(folder.path)));
    }
}

} // namespace

Findings CheckFolders(const Evidence &evidence) {
    Findings findings;
    if (!evidence.areFoldersKnown) {
        return {FoldersUnknown()};
    }
    for (const Folder &folder : evidence.folders) {
        LookAtFolder(findings, folder);
    }
    if (findings.empty()) {
        findings.push_back(Ok("folders-good", "",
                              evidence.HasFolders()
                                  ? Count(evidence.folders.size(), "folder") + " may be indexed"
                                  : "No folder is set"));
    }
    return findings;
}

} // namespace CTL::DOCTOR
