#include "share_table.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <mutex>
#include <sys/stat.h>
#include <utility>

#include "base/file_io.h"
#include "base/json_io.h"
#include "base/log.h"
#include "case_fold.h"
#include "paths.h"

namespace VANO::PLATFORM {

namespace {

using FILEINDEX::LogError;

constexpr char kUnit[] = "share_table";

// Whether a single path component can name a share.
bool IsShareName(std::string_view name) {
    return !name.empty() && name != "." && name != ".." &&
           name.find('/') == std::string_view::npos && name.find('\0') == std::string_view::npos;
}

// The directory without doubled and trailing slashes; empty when it is not absolute or holds "."
// or "..".
std::string NormalDirectory(std::string_view path) {
    std::string normal;
    if (path.empty() || path.front() != '/') {
        return normal;
    }
    for (std::size_t start = 1; start < path.size();) {
        const std::size_t end = std::min(path.find('/', start), path.size());
        const std::string_view component = path.substr(start, end - start);
        start = end + 1;
        if (component.empty()) {
            continue;
        }
        if (!IsShareName(component)) {
            return {};
        }
        normal.append("/").append(component);
    }
    return normal;
}

bool ReadFlag(bool &flag, const Json::Value &entry, const char *key) {
    if (!entry.isMember(key)) {
        return true;
    }
    if (!entry[key].isBool()) {
        return false;
    }
    flag = entry[key].asBool();
    return true;
}

// What tells one state of the file from another.
struct FileState {
    int error = -1; // of stat(); -1 before the first
    dev_t device = 0;
    ino_t inode = 0;
    off_t size = 0;
    timespec modified{};
    timespec changed{};

    static FileState Of(const char *path) {
        FileState state;
        struct stat info {};
        if (::stat(path, &info) != 0) {
            state.error = errno;
            return state;
        }
        state.error = 0;
        state.device = info.st_dev;
        state.inode = info.st_ino;
        state.size = info.st_size;
        state.modified = info.st_mtim;
        state.changed = info.st_ctim;
        return state;
    }

    bool operator==(const FileState &other) const {
        return error == other.error && device == other.device && inode == other.inode &&
               size == other.size && IsSame(modified, other.modified) &&
               IsSame(changed, other.changed);
    }

  private:
    static bool IsSame(const timespec &a, const timespec &b) {
        return a.tv_sec == b.tv_sec && a.tv_nsec == b.tv_nsec;
    }
};

class ShareTableCache {
  public:
    std::shared_ptr<const ShareTable> Get() {
        const std::lock_guard<std::mutex> lock(mutex_);
        // Taken before the file is read: a change in between is then seen at the next call.
        const FileState now = FileState::Of(kShareTablePath);
        if (table_ == nullptr || retry_ || !(now == state_)) {
            const bool isNews = !(now == state_);
            table_ = Load(!isNews);
            state_ = now;
        }
        return table_;
    }

  private:
    std::shared_ptr<const ShareTable> Load(bool quiet) {
        // Why a file that is there could not be loaded may be gone at the next call, be it for want
        // of memory or of a descriptor: only a missing table is remembered.
        retry_ = true;
        std::string text;
        if (!FILEINDEX::ReadFile(text, kShareTablePath, FILEINDEX::kMaxJsonFileBytes)) {
            retry_ = errno != ENOENT;
            if (!quiet) {
                LogError(kUnit, __LINE__, "share table cannot be read, path=%s, reason=%s",
                         kShareTablePath, std::strerror(errno));
            }
            return std::make_shared<const ShareTable>();
        }
        Json::Value table;
        if (!FILEINDEX::JsonFromString(table, text) || !table.isObject()) {
            if (!quiet) {
                LogError(kUnit, __LINE__, "share table is not a JSON object, path=%s",
                         kShareTablePath);
            }
            return std::make_shared<const ShareTable>();
        }
        auto loaded = std::make_shared<const ShareTable>(table, quiet);
        retry_ = false;
        return loaded;
    }

    std::mutex mutex_;
    FileState state_;
    bool retry_ = false;
    std::shared_ptr<const ShareTable> table_;
};

} // namespace

std::optional<Share> ShareFromEntry(const std::string &name, const Json::Value &value) {
    Share share;
    share.name = name;
    const Json::Value &path = value.isObject() ? value["path"] : value;
    if (!IsShareName(name) || !path.isString()) {
        return std::nullopt;
    }
    share.path = NormalDirectory(path.asString());
    const std::size_t slash = share.path.rfind('/');
    if (slash == std::string::npos ||
        CaseFoldKey(std::string_view(share.path).substr(slash + 1)) != CaseFoldKey(name)) {
        return std::nullopt;
    }
    if (value.isObject() && !(ReadFlag(share.encrypted, value, "encrypted") &&
                              ReadFlag(share.readOnly, value, "read_only") &&
                              ReadFlag(share.encryption, value, "encryption"))) {
        return std::nullopt;
    }
    return share;
}

ShareTable::ShareTable(const Json::Value &table, bool quiet) : usable_(true) {
    shares_.reserve(table.size());
    for (auto entry = table.begin(); entry != table.end(); ++entry) {
        const std::string name = entry.name();
        std::optional<Share> share = ShareFromEntry(name, *entry);
        if (share) {
            Add(std::move(*share), quiet);
        } else if (!quiet) {
            LogError(kUnit, __LINE__, "share table entry left out, share=%s", name.c_str());
        }
    }
}

void ShareTable::Add(Share share, bool quiet) {
    std::u32string key = CaseFoldKey(share.name);
    if (byName_.count(key) != 0 || byPath_.count(share.path) != 0) {
        if (!quiet) {
            LogError(kUnit, __LINE__, "share table entry repeats another, share=%s",
                     share.name.c_str());
        }
        return;
    }
    byName_.emplace(std::move(key), shares_.size());
    byPath_.emplace(share.path, shares_.size());
    longestPath_ = std::max(longestPath_, share.path.size());
    shares_.push_back(std::move(share));
}

const Share *ShareTable::FindByName(std::string_view name) const {
    const auto found = byName_.find(CaseFoldKey(name));
    return found == byName_.end() ? nullptr : &shares_[found->second];
}

const Share *ShareTable::FindByFullPath(std::string_view fullPath) const {
    std::string directory(fullPath);
    while (!directory.empty()) {
        if (directory.size() <= longestPath_) {
            const auto found = byPath_.find(directory);
            if (found != byPath_.end()) {
                return &shares_[found->second];
            }
        }
        const std::size_t slash = directory.rfind('/');
        directory.resize(slash == std::string::npos ? 0 : slash);
    }
    return nullptr;
}

std::shared_ptr<const ShareTable> CurrentShareTable() {
    static ShareTableCache cache;
    return cache.Get();
}

} // namespace VANO::PLATFORM
