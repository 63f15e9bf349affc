// Room for the index, and the marks of shares in the status file.

#include <algorithm>
#include <fileindex/index_rules.h>
#include <fileindex/status_mgr.h>
#include <optional>
#include <sys/statvfs.h>

#include "doctor/checks.h"
#include "doctor/file_kind.h"
#include "terminal/text.h"

namespace CTL::DOCTOR {

namespace {

using VANO::FILEINDEX::StatusMgr;

// Nearly full: less than a twentieth free, but never more than 10 GiB nor less than 100 MiB.
constexpr unsigned long long kLeastFree = 100ULL * 1024 * 1024;
constexpr unsigned long long kMostFree = 10ULL * 1024 * 1024 * 1024;

struct Room {
    unsigned long long size = 0;
    unsigned long long free = 0;

    [[nodiscard]] bool IsScarce() const {
        return size > 0 && free < std::clamp(size / 20, kLeastFree, kMostFree);
    }
};

std::optional<Room> RoomOf(const std::string &directory) {
    struct statvfs volume {};
    if (::statvfs(directory.c_str(), &volume) != 0) {
        return std::nullopt;
    }
    const unsigned long long block = volume.f_frsize != 0 ? volume.f_frsize : volume.f_bsize;
    return Room{volume.f_blocks * block, volume.f_bavail * block};
}

void LookAtRoom(Findings &findings, const KnownShare &share) {
    const std::optional<Room> room = RoomOf(share.directory);
    if (!room) {
        return; // a share whose directory is gone is the shares' concern
    }
    if (!VANO::FILEINDEX::IsShareSpaceEnough(share.name)) {
        findings.push_back(
            Error("share-full", share.name,
                  "The share " + Shown(share.name) + " is full: not even 10 MiB can be written")
                .Because("Its index cannot be kept. A quota may be the reason.")
                .Fix("Make room, or raise the quota.", "df -h " + Quoted(share.directory))
                .With("free", Json::UInt64(room->free))
                .With("size", Json::UInt64(room->size)));
    } else if (room->IsScarce()) {
        findings.push_back(
            Warning("share-nearly-full", share.name,
                    "The share " + Shown(share.name) + " is nearly full: " + Size(room->free) +
                        " of " + Size(room->size) + " left")
                .Fix("Make room for the index to grow.", "df -h " + Quoted(share.directory))
                .With("free", Json::UInt64(room->free))
                .With("size", Json::UInt64(room->size)));
    }
}

void LookAtMarks(Findings &findings, const KnownShare &share) {
    if (StatusMgr::ShareIsNoSpace(share.name)) {
        const bool isEnough =
            !share.directory.empty() && VANO::FILEINDEX::IsShareSpaceEnough(share.name);
        findings.push_back(Error("mark-no-space", share.name,
                                 "The share " + Shown(share.name) + " is marked as out of space")
                               .Because(isEnough ? "Its indexing has stopped. There is room again."
                                                 : "Its indexing has stopped.")
                               .Fix(isEnough ? "Resume it." : "Make room, then resume it.",
                                    ReindexCommand(share)));
    }
    if (StatusMgr::ShareIsNeedReindex(share.name)) {
        findings.push_back(
            Warning("mark-need-reindex", share.name,
                    "The share " + Shown(share.name) + " is marked as needing reindexing")
                .Because("An event could not be queued, so its index is "
                         "incomplete.")
                .Fix("Reindex its folders.", ReindexCommand(share)));
    }
}

} // namespace

Findings CheckRoom(const Evidence &evidence) {
    Findings findings;
    std::size_t looked = 0;
    for (const KnownShare &share : evidence.shares) {
        if (share.folders.empty()) {
            continue;
        }
        ++looked;
        if (!share.directory.empty()) {
            LookAtRoom(findings, share);
        }
        LookAtMarks(findings, share);
    }
    if (findings.empty()) {
        findings.push_back(Ok("room-good", "",
                              looked == 0 ? "No share has folders"
                                          : "There is room in " + Count(looked, "share")));
    }
    return findings;
}

} // namespace CTL::DOCTOR
