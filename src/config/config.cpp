#include <fileindex/config.h>

#include <cerrno>
#include <fcntl.h>
#include <fileindex/error_handler.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "base/json_io.h"
#include "base/log.h"
#include "core/lock_retry.h"

int LOG_LEVEL = 3;

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "config";

// Only what is surely not there counts as missing: taking a failed look for a first run would let
// the next save wipe out every setting.
bool IsMissing(const std::string &path) {
    struct stat info {};
    return ::lstat(path.c_str(), &info) != 0 && (errno == ENOENT || errno == ENOTDIR);
}

} // namespace

Config::Config() : root(Json::objectValue) {}

Config::~Config() = default;

bool Config::LoadJson() {
    const std::string path = GetPath();
    if (IsMissing(path)) {
        return true;
    }
    if (JsonFromFile(root, path)) {
        return true;
    }
    LogError(kUnit, 22, "Failed to load json from %s", path.c_str());
    ErrorHandler::SetError(FILEINDEX_ERR_LOAD);
    return false;
}

bool Config::SaveJson() {
    const std::string path = GetPath();
    if (!JsonToFile(root, path)) {
        LogError(kUnit, 38, "Failed to save json to %s", path.c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
        return false;
    }
    if (::chmod(path.c_str(), 0644) == -1) {
        LogError(kUnit, 43, "chmod failed, path=%s", path.c_str());
    }
    return true;
}

bool Config::Lock(bool exclusive) {
    const std::string path = GetLockPath();
    for (int attempt = 0; attempt < kLockAttempts; ++attempt) {
        lock_fd = ::open64(path.c_str(), O_RDWR | O_CREAT, 0644);
        if (lock_fd < 0) {
            break;
        }
        // A program that the caller starts meanwhile must not keep the lock alive.
        (void)::fcntl(lock_fd, F_SETFD, FD_CLOEXEC);
        if (::flock(lock_fd, (exclusive ? LOCK_EX : LOCK_SH) | LOCK_NB) == 0) {
            return true;
        }
        if (!IsLockBusy(errno)) {
            break;
        }
        PauseBeforeNextLockAttempt();
    }
    LogError(kUnit, 74, "Failed to lock folder");
    ErrorHandler::SetError(FILEINDEX_ERR_LOCK);
    return false;
}

void Config::Unlock() {
    if (lock_fd < 0) {
        return;
    }
    (void)::flock(lock_fd, LOCK_UN);
    ::close(lock_fd);
}

} // namespace VANO::FILEINDEX
