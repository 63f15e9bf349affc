#include <fileindex/index_rules.h>

#include <algorithm>
#include <array>
#include <climits>
#include <cstdlib>
#include <fileindex/error_handler.h>
#include <fileindex/share_path.h>
#include <string_view>

#include "base/log.h"
#include "config/paths.h"
#include "utils/governing_folder.h"
#include "utils/share_record.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";

constexpr std::array<std::string_view, 5> kSystemPreservedNames = {
    ".TemporaryItems", kIndexDbName, kEventQueueName, ".VANOPPSDB", ".DS_Store"};
constexpr std::array<std::string_view, 2> kExcludedShares = {"surveillance", "NetBackup"};

constexpr int kUnknownFileSystem = -1;
constexpr int kUserSpaceFileSystem = 12; // neither quota nor reliable change events
constexpr long long kIndexRoomBytes = 10LL * 1024 * 1024;
constexpr int kPlatformVolumeFull = 0x2900;
constexpr int kPlatformQuotaExceeded = 0x2400;

template <std::size_t N>
bool Holds(const std::array<std::string_view, N> &names, std::string_view name) {
    return std::find(names.begin(), names.end(), name) != names.end();
}

bool IsInRecycleBin(const std::string &fullPath) {
    return fullPath.find("#recycle") != std::string::npos &&
           VANOShareIsShareRecycle(fullPath.c_str()) != 0;
}

bool IsInSnapshot(const std::string &fullPath) {
    int flag = 0;
    return fullPath.find("#snapshot") != std::string::npos &&
           VLIBFhsPathInSnapshot(fullPath.c_str(), &flag) == 0 && flag == 1;
}

bool IsUnsuitableFileSystem(int type) {
    return VANOFSIsRemoteFS(type) != 0 || VANOFSIsImageFS(type) != 0 ||
           type == kUserSpaceFileSystem;
}

// A share that uses encryption is a mount of its own; so is one that cannot be asked.
bool IsForeignMountPoint(_tag_VANOSHARE *share, const std::string &fullPath) {
    int encryption = 0;
    return VANOFSDirIsMntPoint(fullPath.c_str()) == 1 &&
           VLIBShareIsEncryptionGet(share, &encryption) == 0 && encryption == 0;
}

bool IsCanonical(const std::string &fullPath) {
    std::array<char, PATH_MAX> canonical{};
    return ::realpath(fullPath.c_str(), canonical.data()) != nullptr &&
           fullPath == canonical.data();
}

} // namespace

bool CanShareBeIndexed(_tag_VANOSHARE *share) {
    if (share == nullptr || Holds(kExcludedShares, share->name)) {
        return false;
    }
    int encrypted = 0;
    int readOnly = 0;
    // Both are asked before either answer is looked at.
    const int encryptedResult = VLIBShareIsEncryptedGet(share, &encrypted);
    const int readOnlyResult = VLIBShareIsReadOnlyGet(share, &readOnly);
    return encryptedResult >= 0 && readOnlyResult >= 0 && encrypted == 0 && readOnly == 0;
}

bool IsSystemPreservedFileName(const std::string &fileName) {
    return VANOEAIsHiddenDir(fileName.c_str()) == 1 || Holds(kSystemPreservedNames, fileName);
}

bool IsSkipIndex(const std::string &fullPath) {
    const int type = VANOGetFSType(fullPath.c_str(), 0);
    const std::size_t slash = fullPath.rfind('/');
    if (slash == std::string::npos || IsSystemPreservedFileName(fullPath.substr(slash + 1)) ||
        IsInRecycleBin(fullPath) || IsInSnapshot(fullPath)) {
        return true;
    }
    // An unknown file system is no reason to skip a file, though it refuses a folder.
    return type != kUnknownFileSystem && IsUnsuitableFileSystem(type);
}

bool IsShareSpaceEnough(const std::string &shareName) {
    const ShareRecord share = FindShare(shareName);
    if (!share) {
        LogError(kUnit, 361, "VANOShareGet failed, share=%s", shareName.c_str());
        return false;
    }
    if (VANOQuotaIsEnough(0, share->path, kIndexRoomBytes) != 0) {
        return true;
    }
    return VLIBCErrGet() != kPlatformVolumeFull && VLIBCErrGet() != kPlatformQuotaExceeded;
}

bool CanFullPathBeIndexed(const std::string &fullPath) {
    if (IsInRecycleBin(fullPath) || IsInSnapshot(fullPath)) {
        return false;
    }
    const int type = VANOGetFSType(fullPath.c_str(), 0);
    if (type == kUnknownFileSystem || IsUnsuitableFileSystem(type)) {
        return false;
    }
    std::string shareName;
    std::string pathInShare;
    if (!GetShareNamePathByFullPath(shareName, pathInShare, fullPath)) {
        LogError(kUnit, 239, "GetShareNamePathByFullPath failed, path=%s", fullPath.c_str());
        return false;
    }
    const ShareRecord share = FindShare(shareName);
    if (!share) {
        LogError(kUnit, 245, "VANOShareGet failed, share=%s", shareName.c_str());
        return false;
    }
    if (!CanShareBeIndexed(share.get())) {
        return false;
    }
    if (IsForeignMountPoint(share.get(), fullPath)) {
        LogError(kUnit, 256, "Mount point[%s] is not allowed to be indexed", fullPath.c_str());
        return false;
    }
    if (!IsCanonical(fullPath)) {
        LogError(kUnit, 263, "check realpath failed, path=%s", fullPath.c_str());
        return false;
    }
    return true;
}

bool CanPathBeIndexed(const std::string &sharePath) {
    std::string fullPath;
    if (!GetFullPath(fullPath, sharePath)) {
        LogError(kUnit, 191, "GetFullPath failed, path=%s", sharePath.c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_PATH);
        return false;
    }
    return CanFullPathBeIndexed(fullPath);
}

Json::Value GetMostSuitableCfg(std::vector<Folder> folders, const std::string &fullPath) {
    GoverningFolder governing(fullPath);
    for (const Folder &folder : folders) {
        governing.Consider(folder);
    }
    return governing.AsJson();
}

} // namespace VANO::FILEINDEX
