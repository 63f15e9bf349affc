// The locks that every change needs. They are looked up in the kernel's list: trying one would keep
// others from it.

#include <algorithm>
#include <cstdio>
#include <fcntl.h>
#include <fstream>
#include <map>
#include <optional>
#include <sstream>
#include <sys/sysmacros.h>
#include <thread>
#include <unistd.h>

#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "doctor/process.h"
#include "state/queue_file.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::UniqueFd;

// A lock that is held for one change is free again after that many looks.
constexpr int kLooks = 11;
constexpr std::chrono::milliseconds kBetweenLooks{100};

std::string Numbers(unsigned major, unsigned minor) {
    char text[32];
    (void)std::snprintf(text, sizeof(text), "%02x:%02x", major, minor);
    return text;
}

// The device of the file's mount, as the kernel's list of locks has it. Some file systems give
// stat() another number.
std::string MountDeviceOf(const UniqueFd &file) {
    std::ifstream facts("/proc/self/fdinfo/" + std::to_string(file.Get()));
    std::string key;
    std::string mount;
    while (mount.empty() && facts >> key) {
        if (key == "mnt_id:") {
            facts >> mount;
        }
    }
    std::ifstream mounts("/proc/self/mountinfo");
    for (std::string line; std::getline(mounts, line);) {
        unsigned major = 0;
        unsigned minor = 0;
        std::istringstream fields(line);
        std::string id;
        std::string parent;
        char colon = 0;
        if (fields >> id >> parent >> major >> colon >> minor && id == mount) {
            return Numbers(major, minor);
        }
    }
    return {};
}

// How the list names a file: "08:01:1234". Both forms, where they differ.
std::vector<std::string> ListNamesOf(const UniqueFd &file, const struct stat &info) {
    const std::string inode = ":" + std::to_string(info.st_ino);
    return {Numbers(major(info.st_dev), minor(info.st_dev)) + inode, MountDeviceOf(file) + inode};
}

// Who holds each locked file of the system, by its name in the list.
std::map<std::string, pid_t> HeldLocks() {
    std::map<std::string, pid_t> held;
    std::ifstream locks("/proc/locks");
    for (std::string line; std::getline(locks, line);) {
        // "1: FLOCK  ADVISORY  WRITE 1234 08:01:5678 0 EOF"; behind "->" somebody waits.
        std::istringstream fields(line);
        std::string number;
        std::string kind;
        std::string advisory;
        std::string access;
        std::string file;
        pid_t pid = 0;
        if (fields >> number >> kind >> advisory >> access >> pid >> file && kind == "FLOCK") {
            held.emplace(file, pid);
        }
    }
    return held;
}

struct LockFile {
    std::string path;
    std::vector<std::string> names;
    pid_t holder = 0;
    bool isHeld = true; // so far, at every look
};

void LookOnce(std::vector<LockFile> &files, bool isFirst) {
    const auto held = HeldLocks();
    for (LockFile &file : files) {
        std::optional<pid_t> holder;
        for (const std::string &name : file.names) {
            const auto found = held.find(name);
            holder = found == held.end() ? holder : found->second;
        }
        file.isHeld = file.isHeld && holder && (isFirst || *holder == file.holder);
        file.holder = holder.value_or(0);
    }
}

bool IsAnyHeld(const std::vector<LockFile> &files) {
    return std::any_of(files.begin(), files.end(),
                       [](const LockFile &file) { return file.isHeld; });
}

// Leaves those that one process held all the time.
void LookUntilFree(std::vector<LockFile> &files) {
    for (int look = 0; look < kLooks; ++look) {
        LookOnce(files, look == 0);
        if (!IsAnyHeld(files)) {
            break;
        }
        std::this_thread::sleep_for(kBetweenLooks);
    }
    files.erase(std::remove_if(files.begin(), files.end(),
                               [](const LockFile &file) { return !file.isHeld; }),
                files.end());
}

// Whether the kernel keeps root from files that somebody else made in /tmp.
bool IsTmpProtected() {
    std::ifstream setting("/proc/sys/fs/protected_regular");
    int value = 0;
    return setting >> value && value > 0;
}

void LookAtLockFile(Findings &findings, const std::string &path, const struct stat &info) {
    const std::string remove = "rm " + path;
    if (!S_ISREG(info.st_mode)) {
        findings.push_back(Error("lock-kind", path, path + " is " + KindOf(info.st_mode))
                               .Because("The settings cannot be locked, so not be changed.")
                               .Fix("Remove it; it is made anew.",
                                    S_ISDIR(info.st_mode) ? "rmdir " + path : remove));
        return;
    }
    if (info.st_uid != 0) {
        const std::string owner = path + " belongs to user " + std::to_string(info.st_uid);
        findings.push_back(
            (IsTmpProtected() ? Error("lock-owner", path, owner)
                              : Warning("lock-owner", path, owner))
                .Because("That user can hold the lock for ever, and the kernel may "
                         "keep root from such files in /tmp.")
                .Fix("Remove it while nobody changes settings; it is made anew.", remove));
    }
}

bool IsSettingsLock(const std::string &path) {
    return path == kFolderLock || path == kStatusLock;
}

// Adds the file if it can be locked.
void Add(std::vector<LockFile> &files, const std::string &path, const UniqueFd &file) {
    struct stat info {};
    if (file && ::fstat(file.Get(), &info) == 0 && S_ISREG(info.st_mode)) {
        files.push_back({path, ListNamesOf(file, info)});
    }
}

std::vector<LockFile> LockFilesOf(const Evidence &evidence) {
    std::vector<LockFile> files;
    for (const char *path : {kFolderLock, kStatusLock}) {
        Add(files, path, UniqueFd(::open(path, O_PATH | O_NOFOLLOW | O_CLOEXEC)));
    }
    for (const KnownShare &share : evidence.shares) {
        if (!share.directory.empty()) {
            Add(files, QueueIn(share.directory),
                OpenQueue(QueueIn(share.directory), O_PATH)); // its own lock
        }
    }
    return files;
}

Finding Held(const LockFile &file) {
    const bool isKnown = ProcessState(file.holder) != '\0';
    Finding finding =
        Warning("lock-held", file.path,
                Shown(file.path) + " is locked by " + ProcessName(file.holder))
            .Because(IsSettingsLock(file.path)
                         ? "No setting can be changed while it is held; it was for a second."
                         : "Events for this queue are dropped while it is held; it was for a "
                           "second.")
            .Fix("Let it end its work; if it hangs, end it.",
                 isKnown ? "ps -fp " + std::to_string(file.holder) : "lsof " + Quoted(file.path));
    if (isKnown) {
        finding.details["pid"] = file.holder;
    }
    return finding;
}

} // namespace

Findings CheckLocks(const Evidence &evidence) {
    Findings findings;
    for (const char *path : {kFolderLock, kStatusLock}) {
        const FileLook look(path);
        if (look.Exists()) {
            LookAtLockFile(findings, path, look.info);
        }
    }
    std::vector<LockFile> files = LockFilesOf(evidence);
    LookUntilFree(files);
    for (const LockFile &file : files) {
        findings.push_back(Held(file));
    }
    if (findings.empty()) {
        findings.push_back(Ok("locks-free", "", "Nobody holds a lock"));
    }
    return findings;
}

} // namespace CTL::DOCTOR
