#ifndef FILEINDEXCTL_PATHS_H
#define FILEINDEXCTL_PATHS_H

#include <CLI/CLI.hpp>
#include <json/value.h>
#include <string>
#include <vector>

namespace CTL {

// The positional argument PATH..., one or more.
CLI::Option *AddPathsTo(CLI::App &app, std::vector<std::string> &paths, const char *description);

// Mistakes that are seen before anything is done; empty when there are none. CLI validators.
[[nodiscard]] std::string CheckSharePath(const std::string &path);
[[nodiscard]] std::string CheckFullPath(const std::string &path);
// What a folder to be indexed must look like too, or it would match nothing below it.
[[nodiscard]] std::string CheckFolderPath(const std::string &path);

[[nodiscard]] Json::Value ArrayOf(const std::vector<std::string> &paths);

} // namespace CTL

#endif
