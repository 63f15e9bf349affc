#include <algorithm>
#include <memory>
#include <string_view>

#include "error.h"
#include "places.h"
#include "share_table.h"

namespace {

using namespace VANO::PLATFORM;

constexpr std::string_view kRecycleBin = "#recycle";
constexpr std::string_view kSnapshots = "#snapshot";

// What VANOShareGet() hands out: the strings that the C record points to, and the properties.
struct HandedOutShare : _tag_VANOSHARE {
    explicit HandedOutShare(const TableShare &from) : _tag_VANOSHARE(), share(from) {
        name = share.name.data();
        path = share.path.data();
    }
    HandedOutShare(const HandedOutShare &) = delete;
    HandedOutShare &operator=(const HandedOutShare &) = delete;

    TableShare share;
};

bool IsEmpty(const char *text) {
    return text == nullptr || *text == '\0';
}

bool CopyOut(char *buffer, int size, std::string_view text) {
    if (text.size() >= static_cast<std::size_t>(size)) {
        return false;
    }
    text.copy(buffer, text.size());
    buffer[text.size()] = '\0';
    return true;
}

int GetFlag(const _tag_VANOSHARE *share, int *flag, bool TableShare::*property) {
    if (share == nullptr || flag == nullptr) {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    *flag = static_cast<const HandedOutShare *>(share)->share.*property ? 1 : 0;
    return 0;
}

// Whether the path is, or lies beneath, the directory of that name at its share's top.
bool IsBelowShareTop(const char *fullPath, std::string_view topName) {
    const auto table = CurrentShareTable();
    const TableShare *share = table->FindByFullPath(fullPath);
    if (share == nullptr) {
        return false;
    }
    std::string_view inside = std::string_view(fullPath).substr(share->path.size());
    inside.remove_prefix(std::min(inside.find_first_not_of('/'), inside.size()));
    return inside.substr(0, inside.find('/')) == topName;
}

} // namespace

int VANOShareGet(const char *name, struct _tag_VANOSHARE **share) {
    if (share != nullptr) {
        *share = nullptr;
    }
    if (share == nullptr || IsEmpty(name)) {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    return Guarded(-1, [&] {
        const auto table = CurrentShareTable();
        const TableShare *found = table->FindByName(name);
        if (found == nullptr) {
            return PLATFORM_FAIL(table->IsUsable() ? kErrNoSuchShare : kErrShareTable);
        }
        *share = std::make_unique<HandedOutShare>(*found).release();
        return 0;
    });
}

void VANOShareFree(struct _tag_VANOSHARE *share) {
    const std::unique_ptr<HandedOutShare> owner(static_cast<HandedOutShare *>(share));
}

// The second buffer gets what follows the share's directory, byte for byte: empty for the share
// itself, else a text that begins with "/". Both buffers are written only on success, and never cut
// short: an answer that does not fit is a failure.
int VANOShareNamePathGet(const char *fullPath, char *name, int nameSize, char *path, int pathSize) {
    if (IsEmpty(fullPath) || name == nullptr || path == nullptr || nameSize <= 0 || pathSize <= 0) {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    return Guarded(-1, [&] {
        const auto table = CurrentShareTable();
        const TableShare *share = table->FindByFullPath(fullPath);
        if (share == nullptr) {
            return PLATFORM_FAIL(table->IsUsable() ? kErrNotInShare : kErrShareTable);
        }
        const std::string_view inside = std::string_view(fullPath).substr(share->path.size());
        if (inside.size() >= static_cast<std::size_t>(pathSize) ||
            !CopyOut(name, nameSize, share->name)) {
            return PLATFORM_FAIL(kErrBufferTooSmall);
        }
        (void)CopyOut(path, pathSize, inside); // it was measured above
        return 0;
    });
}

int VLIBShareIsEncryptedGet(struct _tag_VANOSHARE *share, int *flag) {
    return GetFlag(share, flag, &TableShare::encrypted);
}

int VLIBShareIsReadOnlyGet(struct _tag_VANOSHARE *share, int *flag) {
    return GetFlag(share, flag, &TableShare::readOnly);
}

int VLIBShareIsEncryptionGet(struct _tag_VANOSHARE *share, int *flag) {
    return GetFlag(share, flag, &TableShare::encryption);
}

int VANOShareIsShareRecycle(const char *fullPath) {
    if (fullPath == nullptr) {
        (void)PLATFORM_FAIL(kErrBadParameter);
        return 0;
    }
    return Guarded(0, [&] { return IsBelowShareTop(fullPath, kRecycleBin) ? 1 : 0; });
}

int VLIBFhsPathInSnapshot(const char *fullPath, int *flag) {
    if (fullPath == nullptr || flag == nullptr) {
        return PLATFORM_FAIL(kErrBadParameter);
    }
    return Guarded(-1, [&] {
        *flag = IsBelowShareTop(fullPath, kSnapshots) ? 1 : 0;
        return 0;
    });
}

namespace VANO::PLATFORM {

ShareList ListShares() {
    const ShareTable table = ShareTable::Load();
    ShareList list{kShareTablePath, {}, table.Faults()};
    for (const TableShare &share : table.Shares()) {
        list.names.push_back(share.name);
    }
    return list;
}

} // namespace VANO::PLATFORM
