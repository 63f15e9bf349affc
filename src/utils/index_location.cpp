#include "utils/index_location.h"

#include <cerrno>
#include <climits>
#include <fileindex/fileindex.h>
#include <optional>
#include <sys/stat.h>

#include "base/log.h"
#include "base/no_throw.h"
#include "core/share.h"
#include "core/share_files.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";
constexpr int kPlatformBadParameter = 0x0D00;

// What tells the two locations apart: the function and its messages' texts and lines.
struct IndexPart {
    const char *function;
    const char *outCondition;
    int badArgumentLine;
    int shareLine;
    int metadataDirLine;
    bool isDatabase;
};

constexpr IndexPart kDatabase = {"FILEIDXDBPathGet", "__null != szOutDBPath", 733, 736, 743, true};
constexpr IndexPart kQueue = {
    "FILEIDXQueuePathGet", "__null != szOutQueuePath", 769, 772, 779, false};

std::string CutTo(std::string path, std::size_t room) {
    path.resize(std::min(path.size(), room - 1));
    return path;
}

// Users can write to the share: nothing is made behind a symbolic link. A path that was cut to the
// caller's buffer may name no place in the metadata directory any more; it is made as it stands.
void MakeDatabase(const std::string &metadataDir, const std::string &path) {
    const std::string inside = metadataDir + "/";
    const bool isInside =
        path.size() > inside.size() && path.compare(0, inside.size(), inside) == 0;
    const bool isMade =
        isInside ? ShareFile(path).MakeDirectory(0777) : ::mkdir(path.c_str(), 0777) == 0;
    if (!isMade && errno != EEXIST) {
        LogError(kUnit, 750, "mkdir failed, path=%s, reason=%s", path.c_str(), ErrnoText().c_str());
    }
}

struct Place {
    std::string path; // as much of it as there is room for
    bool isWhole;
};

// A place in a share, with the metadata directory made, and the database if it is that. `room` is
// that of a C string. Nothing when the share is unknown.
std::optional<Place> Locate(const IndexPart &part, const char *shareName, std::size_t room) {
    return NoThrow(std::optional<Place>(), [&]() -> std::optional<Place> {
        const ShareRecord share = FindShare(shareName);
        if (!share) {
            LogError(kUnit, part.shareLine, "VANOShareGet failed, name=%s, code=%d", shareName,
                     VLIBCErrGet());
            return std::nullopt;
        }
        const std::string metadataDir = CutTo(MetadataDirIn(share->path), PATH_MAX);
        if (VANOEAMKDir(0, metadataDir.c_str()) < 0) {
            LogError(kUnit, part.metadataDirLine, "VANOEAMKDir failed, path=%s, code=%d",
                     metadataDir.c_str(), VLIBCErrGet());
        }
        std::string whole = part.isDatabase ? DatabaseIn(share->path) : QueueIn(share->path);
        const bool isWhole = whole.size() < room;
        Place place{CutTo(std::move(whole), room), isWhole};
        if (part.isDatabase) {
            MakeDatabase(metadataDir, place.path);
        }
        return place;
    });
}

// The first argument condition that does not hold; null when all do.
const char *BrokenCondition(const IndexPart &part, const char *shareName, const char *out,
                            int outSize) {
    if (shareName == nullptr) {
        return "__null != szName";
    }
    if (out == nullptr) {
        return part.outCondition;
    }
    return outSize <= 0 ? "cbOutLen > 0" : nullptr;
}

// The entry points for C.
int CopyLocation(const IndexPart &part, const char *shareName, char *out, int outSize) {
    const char *const broken = BrokenCondition(part, shareName, out, outSize);
    if (broken != nullptr) {
        LogError(kUnit, part.badArgumentLine, "Invaild Argument (%s)=[%d]\n", broken, 0);
        VLIBCErrSetEx(kPlatformBadParameter, "utils.cpp", part.badArgumentLine);
        return -1;
    }
    const auto place = Locate(part, shareName, static_cast<std::size_t>(outSize));
    if (!place) {
        return -1;
    }
    out[place->path.copy(out, place->path.size())] = '\0';
    return static_cast<int>(place->path.size());
}

// For the library's own use. A path that had to be cut would name something else.
bool GetLocation(std::string &location, const IndexPart &part, const std::string &share,
                 const char *unit, int line) {
    std::optional<Place> place;
    if (share.find('\0') == std::string::npos) { // else it is no share, and nobody is asked
        place = Locate(part, share.c_str(), PATH_MAX);
    }
    if (!place || !place->isWhole) {
        LogError(unit, line, "%s failed, share=%s", part.function, share.c_str());
        return false;
    }
    location = std::move(place->path);
    return true;
}

} // namespace

bool GetQueueLocation(std::string &location, const std::string &share, const char *unit, int line) {
    return GetLocation(location, kQueue, share, unit, line);
}

bool GetDatabaseLocation(std::string &location, const std::string &share, const char *unit,
                         int line) {
    return GetLocation(location, kDatabase, share, unit, line);
}

} // namespace VANO::FILEINDEX

int FILEIDXDBPathGet(const char *szName, char *szOutDBPath, int cbOutLen) {
    return VANO::FILEINDEX::CopyLocation(VANO::FILEINDEX::kDatabase, szName, szOutDBPath, cbOutLen);
}

int FILEIDXQueuePathGet(const char *szName, char *szOutQueuePath, int cbOutLen) {
    return VANO::FILEINDEX::CopyLocation(VANO::FILEINDEX::kQueue, szName, szOutQueuePath, cbOutLen);
}
