#include "core/index_refusal.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <string_view>

#include "core/share.h"

namespace VANO::FILEINDEX {

namespace {

constexpr std::array<std::string_view, 2> kExcludedShares = {"surveillance", "NetBackup"};
constexpr int kUnknownFileSystem = -1;
constexpr int kUserSpaceFileSystem = 12; // neither quota nor reliable change events

bool IsExcluded(std::string_view share) {
    return std::find(kExcludedShares.begin(), kExcludedShares.end(), share) !=
           kExcludedShares.end();
}

// A share that uses encryption is a mount of its own; so is one that cannot be asked.
bool IsForeignMountPoint(_tag_VANOSHARE *share, const std::string &fullPath) {
    int encryption = 0;
    return VANOFSDirIsMntPoint(fullPath.c_str()) == 1 &&
           VLIBShareIsEncryptionGet(share, &encryption) == 0 && encryption == 0;
}

IndexRefusal RefusalOfPlace(const std::string &fullPath) {
    if (IsInRecycleBin(fullPath)) {
        return IndexRefusal::kRecycleBin;
    }
    if (IsInSnapshot(fullPath)) {
        return IndexRefusal::kSnapshot;
    }
    return RefusalOfFileSystem(VANOGetFSType(fullPath.c_str(), 0));
}

IndexRefusal RefusalInShare(_tag_VANOSHARE *share, const std::string &fullPath) {
    const IndexRefusal refusal = RefusalOfShare(share);
    if (refusal == IndexRefusal::kNone && IsForeignMountPoint(share, fullPath)) {
        return IndexRefusal::kMountPoint;
    }
    return refusal;
}

void JudgeSpelling(IndexVerdict &verdict, const std::string &fullPath) {
    std::array<char, PATH_MAX> canonical{};
    if (::realpath(fullPath.c_str(), canonical.data()) == nullptr) {
        verdict.refusal = IndexRefusal::kUnreachable;
        verdict.error = errno;
    } else if (fullPath != canonical.data()) {
        verdict.refusal = IndexRefusal::kNotCanonical;
        verdict.canonical = canonical.data();
    }
}

} // namespace

bool IsInRecycleBin(const std::string &fullPath) {
    return fullPath.find("#recycle") != std::string::npos &&
           VANOShareIsShareRecycle(fullPath.c_str()) != 0;
}

bool IsInSnapshot(const std::string &fullPath) {
    int flag = 0;
    return fullPath.find("#snapshot") != std::string::npos &&
           VLIBFhsPathInSnapshot(fullPath.c_str(), &flag) == 0 && flag == 1;
}

IndexRefusal RefusalOfFileSystem(int type) {
    if (type == kUnknownFileSystem) {
        return IndexRefusal::kFileSystemUnknown;
    }
    if (VANOFSIsRemoteFS(type) != 0) {
        return IndexRefusal::kFileSystemRemote;
    }
    if (VANOFSIsImageFS(type) != 0) {
        return IndexRefusal::kFileSystemImage;
    }
    return type == kUserSpaceFileSystem ? IndexRefusal::kFileSystemUserSpace : IndexRefusal::kNone;
}

IndexRefusal RefusalOfShare(_tag_VANOSHARE *share) {
    if (share == nullptr) {
        return IndexRefusal::kShareUnknown;
    }
    if (IsExcluded(share->name)) {
        return IndexRefusal::kShareExcluded;
    }
    int encrypted = 0;
    int readOnly = 0;
    // Both are asked before either answer is looked at.
    const int encryptedResult = VLIBShareIsEncryptedGet(share, &encrypted);
    const int readOnlyResult = VLIBShareIsReadOnlyGet(share, &readOnly);
    if (encryptedResult < 0 || readOnlyResult < 0) {
        return IndexRefusal::kShareUnreadable;
    }
    if (encrypted != 0) {
        return IndexRefusal::kShareEncrypted;
    }
    return readOnly != 0 ? IndexRefusal::kShareReadOnly : IndexRefusal::kNone;
}

IndexVerdict JudgeFullPath(const std::string &fullPath) {
    IndexVerdict verdict;
    verdict.refusal = RefusalOfPlace(fullPath);
    if (verdict.refusal != IndexRefusal::kNone) {
        return verdict;
    }
    const auto found = FindShareOfFullPath(fullPath);
    if (!found) {
        verdict.refusal = IndexRefusal::kInNoShare;
        return verdict;
    }
    verdict.share = found->name;
    const ShareRecord share = FindShare(found->name);
    verdict.refusal = share ? RefusalInShare(share.get(), fullPath) : IndexRefusal::kShareUnknown;
    if (verdict.refusal == IndexRefusal::kNone) {
        JudgeSpelling(verdict, fullPath);
    }
    return verdict;
}

} // namespace VANO::FILEINDEX
