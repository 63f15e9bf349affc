// The file-change monitor's configuration: it must watch exactly the folders that are set.

#include <cerrno>
#include <fileindex/share_path.h>
#include <map>
#include <set>

#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "state/queue_file.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

constexpr char kConsumer[] = "fileindex";
constexpr char kSuffix[] = ".json";

bool EndsWith(const std::string &name, const std::string &suffix) {
    return name.size() >= suffix.size() &&
           name.compare(name.size() - suffix.size(), suffix.size(), suffix) == 0;
}

struct Watch {
    std::string file;
    std::set<std::string> paths;
};

using Watches = std::map<std::string, Watch>; // by queue

std::set<std::string> PathsIn(const Json::Value &config) {
    std::set<std::string> paths;
    for (const Json::Value &entry : config) {
        if (entry.isObject() && entry["path"].isString()) {
            paths.insert(entry["path"].asString());
        }
    }
    return paths;
}

// The index's own descriptions; those of other consumers are none of its business.
Watches ReadWatches(Findings &findings) {
    Watches watches;
    for (const std::string &name : NamesIn(kMonitorDirectory)) {
        const std::string path = std::string(kMonitorDirectory) + "/" + name;
        if (!EndsWith(name, kSuffix) || name.rfind(std::string(kConsumer) + "-", 0) != 0) {
            continue;
        }
        const JsonFile file = ReadJsonFile(path);
        const std::optional<Finding> mistake = MistakeOf(file, "monitor");
        if (mistake) {
            findings.push_back(Finding(*mistake).Fix("Have it written anew: resume its share.",
                                                     "fileindexctl share resume --help"));
        } else if (file.value.isObject() && file.value["queue"].isString() &&
                   file.value["config"].isArray() && file.value["consumer"] == kConsumer) {
            watches[file.value["queue"].asString()] = {path, PathsIn(file.value["config"])};
        } else {
            findings.push_back(Error("monitor-shape", path, Shown(path) + " describes no queue")
                                   .Fix("Have it written anew: resume its share.",
                                        "fileindexctl share resume --help"));
        }
    }
    return watches;
}

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
    const std::string surplus = Lacking(found, wanted);
    return (missing.empty() ? "" : "Not watched: " + missing + ". ") +
           (surplus.empty() ? "" : "Watched for nothing: " + surplus + ".");
}

void LookAtShare(Findings &findings, const KnownShare &share, const Watches &watches) {
    const std::string resume = "fileindexctl share resume " + Quoted(share.name);
    const auto watch = watches.find(QueueIn(share.directory));
    if (watch == watches.end()) {
        findings.push_back(
            Error("monitor-missing", share.name,
                  "The monitor does not watch the share " + Shown(share.name))
                .Because("Changes in its folders are not seen. A share that was paused is not "
                         "watched either.")
                .Fix("Have its configuration written anew.", resume));
        return;
    }
    const std::set<std::string> wanted = FullPathsOf(share);
    if (watch->second.paths != wanted) {
        findings.push_back(
            Error("monitor-differs", share.name,
                  "The monitor watches other folders of " + Shown(share.name) + " than are set")
                .Because(DifferenceOf(wanted, watch->second.paths))
                .Fix("Have its configuration written anew.", resume)
                .With("file", watch->second.file));
    }
}

void LookForSurplus(Findings &findings, const Evidence &evidence, Watches watches) {
    for (const KnownShare &share : evidence.shares) {
        if (!share.folders.empty()) {
            watches.erase(QueueIn(share.directory));
        }
    }
    for (const auto &[queue, watch] : watches) {
        findings.push_back(
            Warning("monitor-surplus", watch.file,
                    "The monitor watches for a share without folders: " + Shown(queue))
                .Because("Its queue grows and nobody reads it.")
                .Fix("Remove the file, or set the folders again if they were lost.",
                     "rm " + Quoted(watch.file))
                .With("queue", queue));
    }
}

} // namespace

Findings CheckMonitor(const Evidence &evidence) {
    Findings findings;
    const int error = DirectoryError(kMonitorDirectory);
    if (error != 0 && error != ENOENT) {
        findings.push_back(Unreadable("monitor-unreadable", kMonitorDirectory, error));
        return findings;
    }
    if (!evidence.areFoldersKnown) {
        findings.push_back(
            Unknown("folders-unknown", kFolderConf, "The settings cannot be loaded; see Settings"));
        return findings;
    }
    const Watches watches = ReadWatches(findings);
    std::size_t watched = 0;
    for (const KnownShare &share : evidence.shares) {
        if (!share.folders.empty() && !share.directory.empty()) {
            ++watched;
            LookAtShare(findings, share, watches);
        }
    }
    LookForSurplus(findings, evidence, watches);
    FindStrayFiles(findings, kMonitorDirectory, kConsumer, kSuffix);
    if (findings.empty()) {
        findings.push_back(Ok("monitor-good", "",
                              watched == 0 ? "Nothing is to be watched"
                                           : "The monitor watches " + Count(watched, "share")));
    }
    return findings;
}

} // namespace CTL::DOCTOR
