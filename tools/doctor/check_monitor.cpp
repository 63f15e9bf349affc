// The file-change monitor: it must watch exactly the folders that are set.

#include <fileindex/share_path.h>
#include <map>
#include <platform/diagnosis.h>
#include <set>

#include "core/paths.h"
#include "core/share_files.h"
#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::QueueIn;
using VANO::PLATFORM::MonitorWatch;
using Watches = std::map<std::string, MonitorWatch>; // by queue

std::set<std::string> FullPathsOf(const KnownShare &share) {
    std::set<std::string> paths;
    for (const auto &folder : share.folders) {
        std::string path;
        if (VANO::FILEINDEX::GetFullPath(path, folder.path)) {
            paths.insert(path);
        }
    }
    return paths;
}

// The members of `a` that `b` lacks, for a message.
std::string Lacking(const std::set<std::string> &a, const std::set<std::string> &b) {
    std::string list;
    for (const std::string &path : a) {
        if (b.count(path) == 0) {
            list += (list.empty() ? "" : ", ") + Shown(path);
        }
    }
    return list;
}

std::string DifferenceOf(const std::set<std::string> &wanted, const std::set<std::string> &found) {
    const std::string missing = Lacking(wanted, found);
    const std::string extra = Lacking(found, wanted);
    return (missing.empty() ? "" : "Not watched: " + missing + ". ") +
           (extra.empty() ? "" : "Watched needlessly: " + extra + ".");
}

void LookAtShare(Findings &findings, const KnownShare &share, const Watches &watches) {
    const std::string resume = "fileindexctl share resume " + Quoted(share.name);
    const auto watch = watches.find(QueueIn(share.directory));
    if (watch == watches.end()) {
        findings.push_back(
            Error("monitor-missing", share.name,
                  "The monitor does not watch the share " + Shown(share.name))
                .Because("Changes in its folders are not noticed. A paused share is not watched "
                         "either.")
                .Fix("Write its configuration again.", resume));
        return;
    }
    const std::set<std::string> wanted = FullPathsOf(share);
    const std::set<std::string> found(watch->second.paths.begin(), watch->second.paths.end());
    if (found != wanted) {
        findings.push_back(
            Error("monitor-differs", share.name,
                  "The monitor watches other folders of " + Shown(share.name) + " than are set")
                .Because(DifferenceOf(wanted, found))
                .Fix("Write its configuration again.", resume)
                .With("file", watch->second.file));
    }
}

Finding Surplus(const MonitorWatch &watch) {
    return Warning("monitor-surplus", watch.file,
                   "The monitor watches for a share without folders: " + Shown(watch.queue))
        .Because("Its queue grows and nobody reads it.")
        .Fix("Remove the file, or add the folders again if they were lost.",
             "rm " + Quoted(watch.file))
        .With("queue", watch.queue);
}

} // namespace

Findings CheckMonitor(const Evidence &evidence) {
    if (VANO::PLATFORM::ListMonitorWatches == nullptr) {
        return {Unknown("monitor-unknown", "",
                        "This platform does not tell what the change monitor watches")};
    }
    const auto known = VANO::PLATFORM::ListMonitorWatches(VANO::FILEINDEX::kMonitorConsumer);
    Findings findings;
    for (const auto &fault : known.faults) {
        findings.push_back(
            MistakeOf(fault, "monitor")
                .Fix("Write it again: resume its share.", "fileindexctl share resume --help"));
        if (fault.file == known.directory) {
            return findings;
        }
    }
    if (!evidence.areFoldersKnown) {
        findings.push_back(FoldersUnknown());
        return findings;
    }
    Watches watches;
    for (const MonitorWatch &watch : known.watches) {
        watches[watch.queue] = watch;
    }
    std::size_t watched = 0;
    for (const KnownShare &share : evidence.shares) {
        if (!share.folders.empty() && !share.directory.empty()) {
            ++watched;
            LookAtShare(findings, share, watches);
            watches.erase(QueueIn(share.directory));
        }
    }
    for (const auto &[queue, watch] : watches) {
        findings.push_back(Surplus(watch));
    }
    FindStrayFiles(findings, known.directory, VANO::FILEINDEX::kMonitorConsumer, ".json");
    if (findings.empty()) {
        findings.push_back(Ok("monitor-good", "",
                              watched == 0 ? "Nothing is to be watched"
                                           : "The monitor watches " + Count(watched, "share")));
    }
    return findings;
}

} // namespace CTL::DOCTOR
