#include <fileindex/status_mgr.h>

#include <cstdint>
#include <ctime>
#include <fileindex/daemon_socket.h>
#include <fileindex/error_handler.h>
#include <fileindex/status.h>

#include "base/log.h"
#include "config/settings_lock.h"
#include "core/progress_words.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "status_mgr";
constexpr std::uint32_t kSecondsPerHour = 3600;

// The writers' frame: lock, load, change, save, then `afterwards` with the lock still held.
template <typename Change, typename Afterwards>
bool ChangeStatus(Change change, Afterwards afterwards) {
    Status status;
    const SettingsLock lock(status);
    return lock.IsHeld() && status.Load() && change(status) && status.Save() && afterwards();
}

template <typename Change>
bool ChangeStatus(Change change) {
    return ChangeStatus(change, [] { return true; });
}

// The readers' frame: load without the lock, ask.
template <typename Query>
bool AskStatus(Query query) {
    Status status;
    return status.Load() && query(status);
}

bool TellDaemon(const char *command, const Json::Value &parameters, int line) {
    if (!SendCammandToDaemon(command, parameters)) {
        LogError(kUnit, line, "SendCammandToDaemon failed");
        return false;
    }
    return true;
}

// When a pause that begins now ends. The sum is 32 bits wide and wraps, as the stored times of the
// service always have.
long long EndOfPause(int hours) {
    if (hours == 0) {
        return kPausedWithoutEnd;
    }
    const auto now = static_cast<std::uint32_t>(::time(nullptr));
    return static_cast<std::int32_t>(now + static_cast<std::uint32_t>(hours) * kSecondsPerHour);
}

} // namespace

bool StatusMgr::Pause(const int &hours) {
    if (hours < 0) {
        ErrorHandler::SetError(FILEINDEX_ERR_BAD_PARAM);
        return false;
    }
    const long long resumeTime = EndOfPause(hours);
    return ChangeStatus([&](Status &status) { return status.Pause(resumeTime); },
                        [&] {
                            Json::Value parameters(Json::objectValue);
                            parameters["resume_time"] = static_cast<Json::Int64>(resumeTime);
                            return TellDaemon("pause", parameters, 198);
                        });
}

bool StatusMgr::Resume() {
    return ChangeStatus([](Status &status) { return status.Resume(); },
                        [] { return TellDaemon("resume", Json::Value(Json::objectValue), 221); });
}

bool StatusMgr::GetPauseInfo(long long &resume_time) {
    return AskStatus([&](Status &status) { return status.GetPauseInfo(resume_time); });
}

bool StatusMgr::ShareSetNoSpace(const std::string &share, bool no_space) {
    return ChangeStatus([&](Status &status) { return status.ShareSetNoSpace(share, no_space); });
}

bool StatusMgr::ShareIsNoSpace(const std::string &share) {
    return AskStatus([&](Status &status) { return status.ShareIsNoSpace(share); });
}

bool StatusMgr::ShareSetNeedReindex(const std::string &share, bool need) {
    return ChangeStatus([&](Status &status) { return status.ShareSetNeedReindex(share, need); });
}

bool StatusMgr::ShareIsNeedReindex(const std::string &share) {
    return AskStatus([&](Status &status) { return status.ShareIsNeedReindex(share); });
}

bool StatusMgr::ShareRevive(const std::string &share) {
    return ChangeStatus([&](Status &status) { return status.ShareSetNoSpace(share, false); },
                        [&] {
                            Json::Value parameters(Json::objectValue);
                            parameters["share_name"] = share;
                            return TellDaemon("revive_share_worker", parameters, 321);
                        });
}

bool StatusMgr::IsUpdated(const std::string &key) {
    return AskStatus([&](Status &status) { return status.IsUpdated(key); });
}

bool StatusMgr::SetUpdated(const std::string &key) {
    return ChangeStatus([&](Status &status) { return status.SetUpdated(key); });
}

} // namespace VANO::FILEINDEX
