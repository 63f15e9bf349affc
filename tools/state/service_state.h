#ifndef FILEINDEXCTL_STATE_SERVICE_STATE_H
#define FILEINDEXCTL_STATE_SERVICE_STATE_H

#include <cstdint>
#include <ctime>
#include <json/value.h>
#include <optional>
#include <string>
#include <vector>

#include "state/daemon_state.h"

// How the service is at one moment. A number of events is missing where the queue cannot be read.

namespace CTL {

struct FolderState {
    Json::Value setting; // the folder's own JSON object
    std::string path;    // share path
    std::string status;  // in the library's words
    bool isValid = false;
    std::optional<std::uint64_t> pending; // at or below it
};

struct ShareState {
    std::string name;
    bool isOutOfSpace = false;
    bool needsReindex = false;
    int queueError = 0;                   // errno
    std::optional<std::uint64_t> pending; // in the share, also outside the folders
};

struct ServiceState {
    std::time_t now = 0;
    DaemonState daemon = DaemonState::kUnknown;
    std::optional<long long> resumeTime; // as StatusMgr::GetPauseInfo() gives it, if it does
    double counted = 1;                  // below 1 as long as events have not been counted yet
    std::vector<FolderState> folders;
    std::vector<ShareState> shares;

    [[nodiscard]] bool IsPaused() const;
};

// "not paused" or "paused until ..."
[[nodiscard]] std::string PauseTextOf(const ServiceState &state);

// What deserves attention beside the folders' states: "share photos is out of space".
[[nodiscard]] std::vector<std::string> NotesOf(const ServiceState &state);

// The folder's status as the tool's other commands word it.
[[nodiscard]] std::string StatusTextOf(const FolderState &folder);

// "?" where it is missing.
[[nodiscard]] std::string PendingText(const std::optional<std::uint64_t> &count);

[[nodiscard]] Json::Value JsonOf(const ServiceState &state);

} // namespace CTL

#endif
