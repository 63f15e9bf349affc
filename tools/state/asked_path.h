#ifndef FILEINDEXCTL_STATE_ASKED_PATH_H
#define FILEINDEXCTL_STATE_ASKED_PATH_H

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

// The share path that a user means, who may have typed a full path. `asked` is, in this order:
//   - a share path, when its first component is the name of a share, which is then spelt as the
//     share's own name is;
//   - a full path, when it lies in a share;
//   - else a share path as typed, so that settings of shares that are gone can be named.
// The last errors of the library and of the platform are cleared.
//
// False, with `sharePath` untouched, when it does not begin with "/".
[[nodiscard]] bool ToSharePath(std::string &sharePath, const std::string &asked);

// The share path of a full path; empty when that lies in no share. The last errors are cleared.
[[nodiscard]] std::string SharePathOfFullPath(const std::string &fullPath);

// ToSharePath() of each; the paths have been checked to begin with "/".
[[nodiscard]] std::vector<std::string> ToSharePaths(const std::vector<std::string> &asked);

// The full path of a share path; empty when its share is unknown. The last errors are cleared.
[[nodiscard]] std::string ToFullPath(const std::string &sharePath);

[[nodiscard]] Json::Value ArrayOf(const std::vector<std::string> &paths);

} // namespace CTL

#endif
