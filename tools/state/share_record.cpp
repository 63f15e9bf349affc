#include "state/share_record.h"

#include <vano_platform.h>

#include "terminal/messages.h"

namespace CTL {

void FreeShareRecord::operator()(_tag_VANOSHARE *record) const {
    VANOShareFree(record);
}

ShareRecord FindShare(const std::string &name) {
    _tag_VANOSHARE *found = nullptr;
    // The platform would take a name with a zero byte for a shorter one.
    const bool isFound =
        name.find('\0') == std::string::npos && VANOShareGet(name.c_str(), &found) >= 0;
    ForgetErrors();
    return ShareRecord(isFound ? found : nullptr);
}

std::string DirectoryOfShare(const std::string &name) {
    const ShareRecord share = FindShare(name);
    return share ? share->path : "";
}

std::string OwnNameOf(const std::string &name) {
    // Not the record's name, which may differ in case from the directory's.
    const std::string directory = DirectoryOfShare(name);
    return directory.substr(directory.rfind('/') + 1);
}

} // namespace CTL
