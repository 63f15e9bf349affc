// The locks that every change needs.

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <fcntl.h>
#include <fstream>
#include <sys/file.h>
#include <thread>

#include "core/paths.h"
#include "core/share_files.h"
#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using namespace VANO::FILEINDEX;

// A lock that is held for one change is free again after that many looks.
constexpr int kLooks = 11;
constexpr std::chrono::milliseconds kBetweenLooks{100};

struct LockFile {
    std::string path;
    UniqueFd file;
    const char *effect; // of the lock being held
};

// A shared lock is tried and given back at once: whoever wants the lock at that instant tries
// again.
bool IsHeld(const LockFile &lock) {
    if (::flock(lock.file.Get(), LOCK_SH | LOCK_NB) == 0) {
        (void)::flock(lock.file.Get(), LOCK_UN);
        return false;
    }
    return errno == EWOULDBLOCK;
}

// Leaves those that were held at every look.
void LookUntilFree(std::vector<LockFile> &locks) {
    for (int look = 0; look < kLooks && !locks.empty(); ++look) {
        if (look > 0) {
            std::this_thread::sleep_for(kBetweenLooks);
        }
        locks.erase(std::remove_if(locks.begin(), locks.end(),
                                   [](const LockFile &lock) { return !IsHeld(lock); }),
                    locks.end());
    }
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
                               .Because("The settings cannot be locked, and so not be changed.")
                               .Fix("Remove it; it is created again when needed.",
                                    S_ISDIR(info.st_mode) ? "rmdir " + path : remove));
        return;
    }
    if (info.st_uid != 0) {
        const std::string owner = path + " belongs to user " + std::to_string(info.st_uid);
        findings.push_back(
            (IsTmpProtected() ? Error("lock-owner", path, owner)
                              : Warning("lock-owner", path, owner))
                .Because("That user can hold the lock forever, and the kernel may deny root access "
                         "to such files in /tmp.")
                .Fix("Remove it while nobody changes settings; it is created again when needed.",
                     remove));
    }
}

void Add(std::vector<LockFile> &locks, const std::string &path, UniqueFd file, const char *effect) {
    struct stat info {};
    if (file && ::fstat(file.Get(), &info) == 0 && S_ISREG(info.st_mode)) {
        locks.push_back({path, std::move(file), effect});
    }
}

} // namespace

Findings CheckLocks(const Evidence &evidence) {
    Findings findings;
    std::vector<LockFile> locks;
    for (const char *path : {kFolderLockPath, kStatusLockPath}) {
        const FileLook look(path);
        if (look.Exists()) {
            LookAtLockFile(findings, path, look.info);
        }
        Add(locks, path,
            UniqueFd(::open(path, O_RDONLY | O_NONBLOCK | O_NOCTTY | O_NOFOLLOW | O_CLOEXEC)),
            "Settings cannot be changed meanwhile.");
    }
    for (const KnownShare &share : evidence.shares) {
        if (!share.directory.empty()) {
            const std::string queue = QueueIn(share.directory);
            Add(locks, queue, ShareFile(queue).Open(O_RDONLY),
                "Events for this queue are dropped meanwhile.");
        }
    }
    LookUntilFree(locks);
    for (const LockFile &lock : locks) {
        findings.push_back(
            Warning("lock-held", lock.path, Shown(lock.path) + " was locked for a second")
                .Because(lock.effect)
                .Fix("Find out who holds it. Let that process finish; if it hangs, end it.",
                     "lslocks --notruncate"));
    }
    if (findings.empty()) {
        findings.push_back(Ok("locks-free", "", "Nobody holds a lock"));
    }
    return findings;
}

} // namespace CTL::DOCTOR
