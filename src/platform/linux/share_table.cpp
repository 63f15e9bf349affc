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
#include "places.h"

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

const char *ReadFlag(bool &flag, const Json::Value &entry, const char *key, const char *mistake) {
    if (!entry.isMember(key)) {
        return nullptr;
    }
    if (!entry[key].isBool()) {
        return mistake;
    }
    flag = entry[key].asBool();
    return nullptr;
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

void LogFault(const StoreFault &fault) {
    switch (fault.kind) {
    case StoreFault::Kind::kLeftOut:
        LogError(kUnit, __LINE__, "share table entry left out, share=%s, reason=%s",
                 fault.entry.c_str(), fault.reason.c_str());
        break;
    case StoreFault::Kind::kMalformed:
        LogError(kUnit, __LINE__, "share table is not a JSON object, path=%s", fault.file.c_str());
        break;
    default:
        LogError(kUnit, __LINE__, "share table cannot be read, path=%s, reason=%s",
                 fault.file.c_str(), fault.reason.c_str());
        break;
    }
}

class ShareTableCache {
  public:
    std::shared_ptr<const ShareTable> Get() {
        const std::lock_guard<std::mutex> lock(mutex_);
        // Taken before the file is read: a change in between is then seen at the next call.
        const FileState now = FileState::Of(kShareTablePath);
        const bool isNews = !(now == state_);
        if (isNews || table_ == nullptr || !IsLasting(*table_)) {
            table_ = std::make_shared<const ShareTable>(ShareTable::Load());
            state_ = now;
            if (isNews) {
                std::for_each(table_->Faults().begin(), table_->Faults().end(), LogFault);
            }
        }
        return table_;
    }

  private:
    // Why a file that is there could not be loaded may be gone at the next call, be it for want of
    // memory or of a descriptor: only a missing table is remembered.
    static bool IsLasting(const ShareTable &table) {
        return table.IsUsable() || table.Faults().front().kind == StoreFault::Kind::kMissing;
    }

    std::mutex mutex_;
    FileState state_;
    std::shared_ptr<const ShareTable> table_;
};

} // namespace

const char *ReadTableEntry(TableShare &share, const std::string &name, const Json::Value &value) {
    const Json::Value &path = value.isObject() ? value["path"] : value;
    if (!IsShareName(name)) {
        return "its name can be no directory's";
    }
    if (!path.isString()) {
        return "it names no directory";
    }
    share.name = name;
    share.path = NormalDirectory(path.asString());
    if (share.path.empty()) {
        return "its directory is no plain absolute path";
    }
    const std::string_view last = std::string_view(share.path).substr(share.path.rfind('/') + 1);
    if (CaseFoldKey(last) != CaseFoldKey(name)) {
        return "its directory does not end in the share's name";
    }
    const char *mistake = nullptr;
    if (value.isObject()) {
        mistake = ReadFlag(share.encrypted, value, "encrypted",
                           "its \"encrypted\" is neither true nor false");
        mistake = mistake != nullptr ? mistake
                                     : ReadFlag(share.readOnly, value, "read_only",
                                                "its \"read_only\" is neither true nor false");
        mistake = mistake != nullptr ? mistake
                                     : ReadFlag(share.encryption, value, "encryption",
                                                "its \"encryption\" is neither true nor false");
    }
    return mistake;
}

ShareTable ShareTable::Load() {
    ShareTable table;
    std::string text;
    if (!FILEINDEX::ReadFile(text, kShareTablePath, FILEINDEX::kMaxJsonFileBytes)) {
        table.AddFault(errno == ENOENT ? StoreFault::Kind::kMissing : StoreFault::Kind::kUnreadable,
                       std::strerror(errno));
        return table;
    }
    Json::Value root;
    if (!FILEINDEX::JsonFromString(root, text) || !root.isObject()) {
        table.AddFault(StoreFault::Kind::kMalformed, "it is no JSON object");
        return table;
    }
    table.usable_ = true;
    table.shares_.reserve(root.size());
    for (auto entry = root.begin(); entry != root.end(); ++entry) {
        table.AddEntry(entry.name(), *entry);
    }
    return table;
}

void ShareTable::AddFault(StoreFault::Kind kind, std::string reason, std::string entry) {
    faults_.push_back({kind, kShareTablePath, std::move(entry), std::move(reason)});
}

void ShareTable::AddEntry(const std::string &name, const Json::Value &value) {
    TableShare share;
    const char *const mistake = ReadTableEntry(share, name, value);
    if (mistake != nullptr) {
        AddFault(StoreFault::Kind::kLeftOut, mistake, name);
        return;
    }
    std::u32string key = CaseFoldKey(share.name);
    if (byName_.count(key) != 0 || byPath_.count(share.path) != 0) {
        AddFault(StoreFault::Kind::kLeftOut, "it repeats another share's name or directory", name);
        return;
    }
    byName_.emplace(std::move(key), shares_.size());
    byPath_.emplace(share.path, shares_.size());
    longestPath_ = std::max(longestPath_, share.path.size());
    shares_.push_back(std::move(share));
}

const TableShare *ShareTable::FindByName(std::string_view name) const {
    const auto found = byName_.find(CaseFoldKey(name));
    return found == byName_.end() ? nullptr : &shares_[found->second];
}

const TableShare *ShareTable::FindByFullPath(std::string_view fullPath) const {
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
