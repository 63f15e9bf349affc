#include "core/share.h"

#include <array>

namespace VANO::FILEINDEX {

ShareRecord FindShare(const std::string &name) {
    _tag_VANOSHARE *share = nullptr;
    const bool isFound =
        name.find('\0') == std::string::npos && VANOShareGet(name.c_str(), &share) >= 0;
    return isFound ? ShareRecord(share) : nullptr;
}

std::optional<ShareOfFullPath> FindShareOfFullPath(const std::string &fullPath) {
    std::array<char, 492> name{};
    std::array<char, 4096> path{};
    if (VANOShareNamePathGet(fullPath.c_str(), name.data(), name.size(), path.data(), path.size()) <
        0) {
        return std::nullopt;
    }
    return ShareOfFullPath{name.data(), path.data()};
}

} // namespace VANO::FILEINDEX
