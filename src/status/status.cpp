#include <fileindex/status.h>

#include <fileindex/notification.h>

#include "base/log.h"
#include "core/paths.h"
#include "core/progress_words.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "status";
constexpr char kResumeTime[] = "resume_time";
constexpr char kNoSpace[] = "no_space";
constexpr char kNeedReindex[] = "need_reindex";

bool IsShareMarked(const Json::Value &root, const char *kind, const std::string &share) {
    return root.isObject() && root.isMember(kind) && root[kind].isObject() &&
           root[kind].isMember(share);
}

void ClearShareMark(Json::Value &root, const char *kind, const std::string &share) {
    if (!root.isMember(kind) || !root[kind].isMember(share)) {
        return;
    }
    // With both ends: otherwise the name of another share, cut at a zero byte, would be removed.
    Json::Value removed;
    root[kind].removeMember(share.data(), share.data() + share.size(), &removed);
}

} // namespace

Status::~Status() = default;

std::string Status::GetLockPath() const {
    return kStatusLockPath;
}

std::string Status::GetPath() const {
    return kStatusConfPath;
}

bool Status::Load() {
    return LoadJson();
}

bool Status::Save() {
    return SaveJson();
}

bool Status::Pause(long long resume_time) {
    root[kResumeTime] = static_cast<Json::Int64>(resume_time);
    return true;
}

bool Status::Resume() {
    root[kResumeTime] = static_cast<Json::Int64>(kNotPaused);
    return true;
}

bool Status::GetPauseInfo(long long &resume_time) {
    try {
        resume_time = root.get(kResumeTime, static_cast<Json::Int64>(kNotPaused)).asInt64();
        return true;
    } catch (const Json::Exception &) {
        LogError(kUnit, 66, "json exception");
        return false;
    }
}

bool Status::ShareSetNoSpace(const std::string &share, bool no_space) {
    if (!no_space) {
        ClearShareMark(root, kNoSpace, share);
        return true;
    }
    Json::Value &shares = root[kNoSpace];
    // Told once, until the mark is cleared.
    if (!shares.isMember(share) && !NotifyNoSpace()) {
        LogError(kUnit, 88, "NotifyNoSpace failed");
    }
    shares[share] = true;
    return true;
}

bool Status::ShareIsNoSpace(const std::string &share) {
    return IsShareMarked(root, kNoSpace, share);
}

bool Status::ShareSetNeedReindex(const std::string &share, bool need) {
    if (need) {
        root[kNeedReindex][share] = true;
    } else {
        ClearShareMark(root, kNeedReindex, share);
    }
    return true;
}

bool Status::ShareIsNeedReindex(const std::string &share) {
    return IsShareMarked(root, kNeedReindex, share);
}

bool Status::IsUpdated(const std::string &key) {
    return root.isObject() && root.isMember(key) && root[key].asBool();
}

bool Status::SetUpdated(const std::string &key) {
    root[key] = true;
    return true;
}

} // namespace VANO::FILEINDEX
