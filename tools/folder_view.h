#ifndef FILEINDEXCTL_FOLDER_VIEW_H
#define FILEINDEXCTL_FOLDER_VIEW_H

#include <json/value.h>
#include <string>

namespace CTL {

// The facts that a listing asks the library for beside the setting itself.
[[nodiscard]] Json::Value AdditionalKeys();

// "photo, video" of a folder's JSON object.
[[nodiscard]] std::string TypesOf(const Json::Value &folder);

// The folder's status in words, from its "additional" facts.
[[nodiscard]] std::string StatusOf(const Json::Value &folder);

} // namespace CTL

#endif
