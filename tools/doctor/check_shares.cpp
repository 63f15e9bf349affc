// The share table of plain Linux, and the directories of the shares.

#include <cerrno>
#include <vano_platform.h>

#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

std::string LastComponent(std::string path) {
    path.resize(path.find_last_not_of('/') + 1);
    return path.substr(path.rfind('/') + 1);
}

// Why the platform leaves an entry out. Whether it does is its own answer.
std::string MistakeIn(const std::string &name, const Json::Value &entry) {
    const Json::Value &path = entry.isObject() ? entry["path"] : entry;
    if (!path.isString()) {
        return "it names no directory";
    }
    const std::string directory = path.asString();
    if (directory.empty() || directory[0] != '/') {
        return "its directory is no absolute path";
    }
    for (const char *flag : {"encrypted", "read_only", "encryption"}) {
        if (entry.isObject() && entry.isMember(flag) && !entry[flag].isBool()) {
            return std::string("its \"") + flag + "\" is neither true nor false";
        }
    }
    if (VLIBCUnicodeUTF8StrCaseCmp(LastComponent(directory).c_str(), name.c_str()) != 0) {
        return "its directory does not end in the share's name";
    }
    return "it repeats another share's name or directory, or its directory is not plain";
}

void LookAtTable(Findings &findings, const Evidence &evidence) {
    const JsonFile &table = evidence.shareTable;
    const std::optional<Finding> mistake = MistakeOf(table, "share-table");
    if (mistake) {
        findings.push_back(mistake->severity == Severity::kUnknown
                               ? *mistake
                               : Finding(*mistake).Fix("Until it is fixed there are no shares.",
                                                       std::string("editor ") + kShareTable));
        return;
    }
    if (table.state == JsonFile::State::kMissing) {
        const std::string what = std::string(kShareTable) + " does not exist: there are no shares";
        findings.push_back((evidence.HasFolders()
                                ? Error("share-table-missing", kShareTable, what)
                                : Warning("share-table-missing", kShareTable, what))
                               .Fix(R"(Write one: {"photos": "/volume1/photos"})",
                                    std::string("editor ") + kShareTable));
        return;
    }
    if (!table.value.isObject()) {
        findings.push_back(
            Error("share-table-shape", kShareTable, std::string(kShareTable) + " is no JSON object")
                .Fix("Until it is fixed there are no shares.",
                     std::string("editor ") + kShareTable));
        return;
    }
    const FileLook look(kShareTable);
    if (look.IsRegular()) {
        FindOddOwner(findings, kShareTable, look.info, "644");
    }
}

void LookAtShare(Findings &findings, const KnownShare &share, const Json::Value &table) {
    const bool isInTable = table.isObject() && table.isMember(share.name);
    if (share.directory.empty() && isInTable) {
        findings.push_back(
            Error("share-left-out", share.name,
                  "The share " + Shown(share.name) + " is left out of the table")
                .Because("Of its entry: " + MistakeIn(share.name, table[share.name]) + ".")
                .Fix("Fix the entry.", std::string("editor ") + kShareTable));
        return;
    }
    if (share.directory.empty() && !table.isObject()) {
        return; // the table itself has been found wanting
    }
    if (share.directory.empty()) {
        findings.push_back(
            Error("share-unknown", share.name,
                  "There is no share " + Shown(share.name) + ", but folders of it are set")
                .Because("It was removed or renamed without the index being told.")
                .Fix("Drop its folders, or move them to its new name (share rename).",
                     "fileindexctl share remove " + Quoted(share.name)));
        return;
    }
    const int error = DirectoryError(share.directory);
    if (error == 0) {
        return;
    }
    if (error == EACCES && !share.folders.empty()) {
        findings.push_back(Unreadable("share-unreachable", share.directory, error));
        return;
    }
    const std::string what =
        "The directory of the share " + Shown(share.name) + " is gone: " + Shown(share.directory);
    findings.push_back((share.folders.empty() ? Warning("share-gone", share.name, what)
                                              : Error("share-gone", share.name, what))
                           .Because(Reason(error) + ".")
                           .Fix("Mount its volume, or take the share out of the table.",
                                "findmnt; ls -ld " + Quoted(share.directory))
                           .With("directory", share.directory));
}

} // namespace

Findings CheckShares(const Evidence &evidence) {
    Findings findings;
    LookAtTable(findings, evidence);
    for (const KnownShare &share : evidence.shares) {
        LookAtShare(findings, share, evidence.shareTable.value);
    }
    if (findings.empty()) {
        findings.push_back(Ok("shares-good", "", Count(evidence.shares.size(), "share")));
    }
    return findings;
}

} // namespace CTL::DOCTOR
