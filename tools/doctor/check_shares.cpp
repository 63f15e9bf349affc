// The shares as the platform has them, and their directories.

#include <algorithm>
#include <cerrno>

#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::PLATFORM::StoreFault;

Finding FindingOf(const StoreFault &fault, const Evidence &evidence) {
    const std::string edit = "editor " + Quoted(fault.file);
    if (fault.kind == StoreFault::Kind::kLeftOut) {
        return Error("share-left-out", fault.entry,
                     "The share " + Shown(fault.entry) + " is left out of the table")
            .Because("Of its entry: " + Shown(fault.reason) + ".")
            .Fix("Fix the entry.", edit);
    }
    if (fault.kind == StoreFault::Kind::kMissing) {
        const std::string what = Shown(fault.file) + " does not exist: there are no shares";
        return (evidence.HasFolders() ? Error("share-table-missing", fault.file, what)
                                      : Warning("share-table-missing", fault.file, what))
            .Fix("Create it; see shares.json(5).", edit);
    }
    return MistakeOf(fault, "share-table").Fix("Until it is fixed there are no shares.", edit);
}

// Why a share that folders name is not there has been said of the table.
bool IsExplained(const KnownShare &share, const Evidence &evidence) {
    return std::any_of(
        evidence.shareFaults.begin(), evidence.shareFaults.end(), [&](const StoreFault &fault) {
            return fault.kind != StoreFault::Kind::kLeftOut || fault.entry == share.name;
        });
}

void LookAtShare(Findings &findings, const KnownShare &share, const Evidence &evidence) {
    if (share.directory.empty()) {
        if (!IsExplained(share, evidence)) {
            findings.push_back(
                Error("share-unknown", share.name,
                      "There is no share " + Shown(share.name) + ", but folders of it are set")
                    .Because("It was removed or renamed, and the index was not told.")
                    .Fix("Remove its folders, or move them to its new name (share rename).",
                         "fileindexctl share remove " + Quoted(share.name)));
        }
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
    const std::string what = "The directory of the share " + Shown(share.name) +
                             " is missing: " + Shown(share.directory);
    findings.push_back((share.folders.empty() ? Warning("share-gone", share.name, what)
                                              : Error("share-gone", share.name, what))
                           .Because(Reason(error) + ".")
                           .Fix("Mount its volume, or remove the share.",
                                "findmnt; ls -ld " + Quoted(share.directory))
                           .With("directory", share.directory));
}

} // namespace

Findings CheckShares(const Evidence &evidence) {
    Findings findings;
    for (const StoreFault &fault : evidence.shareFaults) {
        findings.push_back(FindingOf(fault, evidence));
    }
    const FileLook table(evidence.shareTable);
    if (table.IsRegular() && findings.empty()) {
        FindOddOwner(findings, evidence.shareTable, table.info, "644");
    }
    if (!evidence.areSharesListed) {
        findings.push_back(Unknown("shares-unlisted", "",
                                   "This platform does not list its shares: only those with "
                                   "folders were checked"));
    }
    for (const KnownShare &share : evidence.shares) {
        LookAtShare(findings, share, evidence);
    }
    if (findings.empty()) {
        findings.push_back(Ok("shares-good", "", Count(evidence.shares.size(), "share")));
    }
    return findings;
}

} // namespace CTL::DOCTOR
