#include "state/service_state.h"

#include <cstring>

#include "core/progress_words.h"
#include "state/folder_view.h"
#include "terminal/text.h"
#include "terminal/times.h"

namespace CTL {

namespace {

Json::Value JsonOf(const std::optional<std::uint64_t> &count) {
    return count ? Json::Value(Json::UInt64{*count}) : Json::Value();
}

// As `list` and `show` have it, with one fact more.
Json::Value JsonOf(const FolderState &folder) {
    Json::Value object = folder.setting;
    object["additional"]["is_valid"] = folder.isValid;
    object["additional"]["status"] = folder.status;
    object["additional"]["pending"] = JsonOf(folder.pending);
    return object;
}

Json::Value JsonOf(const ShareState &share) {
    Json::Value object(Json::objectValue);
    object["name"] = share.name;
    object["need_reindex"] = share.needsReindex;
    object["no_space"] = share.isOutOfSpace;
    object["pending"] = JsonOf(share.pending);
    return object;
}

} // namespace

bool ServiceState::IsPaused() const {
    return resumeTime && VANO::FILEINDEX::IsPaused(*resumeTime, now);
}

std::string PauseTextOf(const ServiceState &state) {
    return state.resumeTime ? PauseText(*state.resumeTime, state.now)
                            : "unknown, the status file cannot be read";
}

std::vector<std::string> NotesOf(const ServiceState &state) {
    std::vector<std::string> notes;
    for (const ShareState &share : state.shares) {
        const std::string name = "share " + Shown(share.name);
        if (share.isOutOfSpace) {
            notes.push_back(name + " is out of space");
        }
        if (share.needsReindex) {
            notes.push_back(name + " needs reindexing");
        }
        if (share.queueError != 0) {
            notes.push_back(name +
                            ": its queue cannot be read: " + std::strerror(share.queueError));
        }
    }
    return notes;
}

std::string StatusTextOf(const FolderState &folder) {
    return StatusOf(JsonOf(folder));
}

std::string PendingText(const std::optional<std::uint64_t> &count) {
    return count ? std::to_string(*count) : "?";
}

Json::Value JsonOf(const ServiceState &state) {
    Json::Value object(Json::objectValue);
    object["daemon"] = NameOf(state.daemon);
    object["paused"] = state.resumeTime ? Json::Value(state.IsPaused()) : Json::Value();
    object["resume_time"] =
        state.resumeTime ? Json::Value(Json::Int64{*state.resumeTime}) : Json::Value();
    object["folder"] = Json::Value(Json::arrayValue);
    for (const FolderState &folder : state.folders) {
        object["folder"].append(JsonOf(folder));
    }
    object["share"] = Json::Value(Json::arrayValue);
    for (const ShareState &share : state.shares) {
        object["share"].append(JsonOf(share));
    }
    return object;
}

} // namespace CTL
