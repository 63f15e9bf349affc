#include <fileindex/fileindex.h>

#include <array>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>
#include <sys/stat.h>

#include "base/log.h"
#include "base/no_throw.h"
#include "config/paths.h"
#include "utils/metadata_entry.h"
#include "utils/share_record.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";
constexpr int kPlatformBadParameter = 0x0D00;

// What tells the two locations apart: the last component, and the texts and lines of the messages.
struct Location {
    const char *name;
    const char *outCondition;
    int badArgumentLine;
    int shareLine;
    int metadataDirLine;
};

constexpr Location kDatabase = {kIndexDbName, "__null != szOutDBPath", 733, 736, 743};
constexpr Location kQueue = {kEventQueueName, "__null != szOutQueuePath", 769, 772, 779};

// The first argument condition that does not hold; null when all do.
const char *BrokenCondition(const Location &location, const char *shareName, const char *out,
                            int outSize) {
    if (shareName == nullptr) {
        return "__null != szName";
    }
    if (out == nullptr) {
        return location.outCondition;
    }
    return outSize <= 0 ? "cbOutLen > 0" : nullptr;
}

// Writes the location's path, with the metadata directory above it made. Returns the share's
// record; null when the arguments are bad or the share is unknown.
ShareRecord WriteLocation(const Location &location, const char *shareName, char *out, int outSize) {
    const char *const broken = BrokenCondition(location, shareName, out, outSize);
    if (broken != nullptr) {
        LogError(kUnit, location.badArgumentLine, "Invaild Argument (%s)=[%d]\n", broken, 0);
        VLIBCErrSetEx(kPlatformBadParameter, "utils.cpp", location.badArgumentLine);
        return nullptr;
    }
    ShareRecord share = FindShare(shareName);
    if (!share) {
        LogError(kUnit, location.shareLine, "VANOShareGet failed, name=%s, code=%d", shareName,
                 VLIBCErrGet());
        return nullptr;
    }
    std::array<char, PATH_MAX> metadataDir{};
    (void)std::snprintf(metadataDir.data(), metadataDir.size(), "%s/%s", share->path,
                        kMetadataDirName);
    if (VANOEAMKDir(0, metadataDir.data()) < 0) {
        LogError(kUnit, location.metadataDirLine, "VANOEAMKDir failed, path=%s, code=%d",
                 metadataDir.data(), VLIBCErrGet());
    }
    (void)std::snprintf(out, static_cast<std::size_t>(outSize), "%s/%s/%s", share->path,
                        kMetadataDirName, location.name);
    return share;
}

// Users can write to the share: nothing is made behind a symbolic link. A path that was cut to the
// caller's buffer may name no place in the metadata directory any more; it is made as it stands.
bool MakeDatabase(const std::string &sharePath, const std::string &path) {
    const std::string metadataDir = sharePath + "/" + kMetadataDirName + "/";
    const bool isInside =
        path.size() > metadataDir.size() && path.compare(0, metadataDir.size(), metadataDir) == 0;
    return isInside ? MetadataEntry(path).MakeDirectory(0777) : ::mkdir(path.c_str(), 0777) == 0;
}

} // namespace

} // namespace VANO::FILEINDEX

using namespace VANO::FILEINDEX;

int FILEIDXDBPathGet(const char *szName, char *szOutDBPath, int cbOutLen) {
    return NoThrow(-1, [&] {
        const ShareRecord share = WriteLocation(kDatabase, szName, szOutDBPath, cbOutLen);
        if (!share) {
            return -1;
        }
        if (!MakeDatabase(share->path, szOutDBPath) && errno != EEXIST) {
            LogError(kUnit, 750, "mkdir failed, path=%s, reason=%s", szOutDBPath,
                     ErrnoText().c_str());
        }
        return static_cast<int>(std::strlen(szOutDBPath));
    });
}

int FILEIDXQueuePathGet(const char *szName, char *szOutQueuePath, int cbOutLen) {
    return NoThrow(-1, [&] {
        const ShareRecord share = WriteLocation(kQueue, szName, szOutQueuePath, cbOutLen);
        return share ? static_cast<int>(std::strlen(szOutQueuePath)) : -1;
    });
}
