#include <fileindex/index_rules.h>

#include <algorithm>
#include <array>
#include <fileindex/error_handler.h>
#include <fileindex/share_path.h>
#include <string_view>

#include "base/log.h"
#include "core/folder_cover.h"
#include "core/index_refusal.h"
#include "core/paths.h"
#include "core/share.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "utils";

constexpr std::array<std::string_view, 5> kSystemPreservedNames = {
    ".TemporaryItems", kIndexDbName, kEventQueueName, ".VANOPPSDB", ".DS_Store"};
constexpr long long kIndexRoomBytes = 10LL * 1024 * 1024;
constexpr int kPlatformVolumeFull = 0x2900;
constexpr int kPlatformQuotaExceeded = 0x2400;

// The reasons that are logged: the others are refused silently.
void LogRefusal(const IndexVerdict &verdict, const std::string &fullPath) {
    switch (verdict.refusal) {
    case IndexRefusal::kInNoShare:
        LogError(kUnit, 418, "VANOShareNamePathGet failed, path=%s", fullPath.c_str());
        ErrorHandler::SetError(FILEINDEX_ERR_PATH);
        LogError(kUnit, 239, "GetShareNamePathByFullPath failed, path=%s", fullPath.c_str());
        break;
    case IndexRefusal::kShareUnknown:
        LogError(kUnit, 245, "VANOShareGet failed, share=%s", verdict.share.c_str());
        break;
    case IndexRefusal::kMountPoint:
        LogError(kUnit, 256, "Mount point[%s] is not allowed to be indexed", fullPath.c_str());
        break;
    case IndexRefusal::kUnreachable:
    case IndexRefusal::kNotCanonical:
        LogError(kUnit, 263, "check realpath failed, path=%s", fullPath.c_str());
        break;
    default:
        break;
    }
}

} // namespace

bool CanShareBeIndexed(_tag_VANOSHARE *share) {
    return RefusalOfShare(share) == IndexRefusal::kNone;
}

bool IsSystemPreservedFileName(const std::string &fileName) {
    return VANOEAIsHiddenDir(fileName.c_str()) == 1 ||
           std::find(kSystemPreservedNames.begin(), kSystemPreservedNames.end(), fileName) !=
               kSystemPreservedNames.end();
}

bool IsSkipIndex(const std::string &fullPath) {
    const int type = VANOGetFSType(fullPath.c_str(), 0);
    const std::size_t slash = fullPath.rfind('/');
    if (slash == std::string::npos || IsSystemPreservedFileName(fullPath.substr(slash + 1)) ||
        IsInRecycleBin(fullPath) || IsInSnapshot(fullPath)) {
        return true;
    }
    // An unknown file system is no reason to skip a file, though it refuses a folder.
    const IndexRefusal refusal = RefusalOfFileSystem(type);
    return refusal != IndexRefusal::kNone && refusal != IndexRefusal::kFileSystemUnknown;
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
    const IndexVerdict verdict = JudgeFullPath(fullPath);
    LogRefusal(verdict, fullPath);
    return verdict.refusal == IndexRefusal::kNone;
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
