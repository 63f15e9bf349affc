#ifndef FILEINDEXCTL_STATE_FOLDER_VIEW_H
#define FILEINDEXCTL_STATE_FOLDER_VIEW_H

#include <array>
#include <fileindex/folder.h>
#include <json/value.h>
#include <optional>
#include <string>
#include <vector>

#include "state/refusal_text.h"

namespace CTL {

inline constexpr std::array<const char *, 4> kFileTypes = {"document", "audio", "video", "photo"};

// The facts beside the setting itself that are asked of the library, as Folder::asJson() takes
// them.
[[nodiscard]] Json::Value FolderFacts();

// "photo,video" of a folder's JSON object.
[[nodiscard]] std::string TypesOf(const Json::Value &folder);

// The folder's status in words, from its "additional" facts.
[[nodiscard]] std::string StatusOf(const Json::Value &folder);

// {"rule", "why", "fix"}; null when there is none.
[[nodiscard]] Json::Value AsJson(const std::optional<Refusal> &refusal);

[[nodiscard]] std::vector<std::string> PathsOf(const std::vector<VANO::FILEINDEX::Folder> &folders);

// The setting that governs a full path, an empty object when none does: of the folders whose share
// is there.
[[nodiscard]] Json::Value GoverningSetting(const std::string &fullPath,
                                           const std::vector<VANO::FILEINDEX::Folder> &folders);

[[nodiscard]] bool IsSet(const std::string &path,
                         const std::vector<VANO::FILEINDEX::Folder> &folders);

// Those of the paths that are no folder settings.
[[nodiscard]] std::vector<std::string> NotSet(const std::vector<std::string> &paths,
                                              const std::vector<VANO::FILEINDEX::Folder> &folders);

} // namespace CTL

#endif
