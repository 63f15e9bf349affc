#include "mount_source.h"

#include <cstdlib>
#include <fcntl.h>
#include <sstream>
#include <string_view>
#include <sys/stat.h>

#include "base/file_io.h"
#include "places.h"

namespace VANO::PLATFORM {

namespace {

constexpr std::size_t kMaxMountInfoBytes = std::size_t{16} * 1024 * 1024;

// The kernel writes white space and backslashes in this table as three octal digits.
std::string Unescape(const std::string &text) {
    std::string plain;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == '\\' && i + 3 < text.size()) {
            plain.push_back(
                static_cast<char>(std::strtol(text.substr(i + 1, 3).c_str(), nullptr, 8)));
            i += 3;
        } else {
            plain.push_back(text[i]);
        }
    }
    return plain;
}

// "<mount id> <parent> <major:minor> <root> <point> <options> [tags ...] - <type> <source> ..."
std::string SourceInLine(const std::string &line, const std::string &mountId) {
    const std::size_t separator = line.find(" - ");
    if (line.compare(0, mountId.size() + 1, mountId + " ") != 0 || separator == std::string::npos) {
        return {};
    }
    std::istringstream fields(line.substr(separator + 3));
    std::string type;
    std::string source;
    fields >> type >> source;
    return Unescape(source);
}

} // namespace

std::string MountSourceOf(int fd) {
    struct statx info {};
    std::string table;
    if (::statx(fd, "", AT_EMPTY_PATH, STATX_MNT_ID, &info) != 0 ||
        (info.stx_mask & STATX_MNT_ID) == 0 ||
        !FILEINDEX::ReadFile(table, kMountInfoPath, kMaxMountInfoBytes)) {
        return {};
    }
    const std::string mountId = std::to_string(info.stx_mnt_id);
    std::istringstream lines(table);
    std::string line;
    while (std::getline(lines, line)) {
        std::string source = SourceInLine(line, mountId);
        if (!source.empty()) {
            return source;
        }
    }
    return {};
}

} // namespace VANO::PLATFORM
