#include "pause_state.h"

#include <ctime>

#include "json_text.h"

namespace peer {

namespace {

constexpr char kStatusPath[] = "/usr/vano/etc/fileindex/status.conf";

} // namespace

void PauseState::ReadStatusFile() {
    Json::Value status;
    if (ParseJsonFile(status, kStatusPath) && status.isObject()) {
        Follow("pause", status);
    }
}

void PauseState::Follow(const std::string &command, const Json::Value &data) {
    if (command == "resume") {
        resumeTime_ = -1;
    } else if (command == "pause" && data.isObject() && data["resume_time"].isInt64()) {
        resumeTime_ = data["resume_time"].asInt64();
    }
}

bool PauseState::IsPaused() const {
    return resumeTime_ == 0 || resumeTime_ > std::time(nullptr);
}

} // namespace peer
