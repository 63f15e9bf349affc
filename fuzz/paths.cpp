// The input is a few byte strings that stand for share paths, full paths and names.
//
// Each path function agrees with its description, share paths and full paths lead back to each
// other, and an output buffer of any size is kept to.

#include <cstring>
#include <fileindex/error_handler.h>
#include <fileindex/fileindex.h>
#include <fileindex/index_rules.h>
#include <fileindex/share_path.h>
#include <fileindex/status_mgr.h>
#include <fuzzer/FuzzedDataProvider.h>
#include <memory>

#include "support/check.h"
#include "support/naive.h"
#include "support/world.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;

constexpr std::size_t kLongest = 5000; // beyond what a path of the file system may be
constexpr int kLargestBuffer = 96;

// The share's name in a share path, by hand.
std::string NaiveShareName(const std::string &path) {
    std::string name;
    for (std::size_t i = 1; i < path.size() && path[i] != '/'; ++i) {
        name += path[i];
    }
    return name;
}

bool IsShare(const std::string &name) {
    const auto &names = ShareNames();
    return std::find(names.begin(), names.end(), name) != names.end();
}

void CheckShareName(const std::string &path) {
    std::string name = "untouched";
    Check(GetShareNameByPath(name, path) == !path.empty(), "every path but \"\" has a name", path);
    Check(name == (path.empty() ? "untouched" : NaiveShareName(path)), "the first component", path);
}

void CheckRenaming(const std::string &path, const std::string &name) {
    const std::string renamed = ReplaceShareName(path, name);
    if (path.empty()) {
        Check(renamed.empty(), "\"\" has no share to rename");
        return;
    }
    Check(renamed ==
              "/" + name + path.substr(std::min(path.size(), NaiveShareName(path).size() + 1)),
          "only the first component is replaced", renamed);
    if (path[0] == '/' && name.find('/') == std::string::npos) {
        Check(ReplaceShareName(renamed, NaiveShareName(path)) == path, "renaming back", path);
    }
}

void CheckFullPath(const std::string &path) {
    std::string full = "old";
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
    const bool resolved = GetFullPath(full, path);
    Check(resolved == IsShare(NaiveShareName(path)), "a known share resolves", path);
    Check(full == (resolved ? "/volume1" + path : ""), "beside the share's directory", path);
    Check(ErrorHandler::GetError() ==
              (resolved || path.empty() ? FILEINDEX_ERR_NONE : FILEINDEX_ERR_PATH),
          "an unknown share is an error", path);
    if (!resolved || path[0] != '/' || path.find('\0') != std::string::npos) {
        return;
    }
    std::string name;
    std::string inside;
    if (path.size() < 4000) { // what fits the platform's buffer
        Check(GetShareNamePathByFullPath(name, inside, full), "a full path leads back", full);
        Check(name == NaiveShareName(path) && "/" + name + inside == path, "to where it is", path);
    }
}

void CheckShareOf(const std::string &fullPath) {
    std::string name = "old name";
    std::string inside = "old path";
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
    if (!GetShareNamePathByFullPath(name, inside, fullPath)) {
        Check(name == "old name" && inside == "old path", "a failure leaves its outputs", fullPath);
        Check(ErrorHandler::GetError() == FILEINDEX_ERR_PATH, "and sets its error", fullPath);
        return;
    }
    Check(IsShare(name), "a full path lies in a known share", name);
    // The platform takes a path to end at a zero byte.
    Check(Lies(fullPath.c_str(), "/volume1/" + name), "which holds it", fullPath);
}

void CheckPrefix(const std::string &text, const std::string &prefix) {
    bool starts = text.size() >= prefix.size();
    for (std::size_t i = 0; starts && i < prefix.size() && (text[i] != '\0' || prefix[i] != '\0');
         ++i) {
        starts = text[i] == prefix[i];
    }
    Check(StringStartWith(text, prefix) == starts, "a prefix test", prefix);
    Check(StringStartWith(text, "") && StringStartWith(text + prefix, text), "what must hold",
          text);
}

// Every rule answers; two of them are tied together.
void CheckRules(const std::string &path) {
    std::string full;
    const bool resolved = GetFullPath(full, path);
    Check(CanPathBeIndexed(path) == (resolved && CanFullPathBeIndexed(full)), "by full path", path);
    if (CanFullPathBeIndexed(path)) {
        std::string name;
        std::string inside;
        Check(GetShareNamePathByFullPath(name, inside, path), "only shares are indexed", path);
        Check(IsDirExist(path) || IsFileExist(path), "only what is there is indexed", path);
    }
    const std::size_t slash = path.rfind('/');
    Check(slash != std::string::npos || IsSkipIndex(path), "no path, no index", path);
    if (slash != std::string::npos && IsSystemPreservedFileName(path.substr(slash + 1))) {
        Check(IsSkipIndex(path), "reserved names are left out", path);
    }
    Check(!IsShareSpaceEnough(path) || IsShare(path), "a known share has room", path);
    Check(!StatusMgr::GetFolderStatus(path).empty(), "every path has a status", path);
    Check(!(IsDirExist(path) && IsFileExist(path)), "nothing is two things", path);
}

using PathGet = int (*)(const char *name, char *out, int size);

// The buffer is on the heap, so that a byte too many is seen.
void CheckLocation(PathGet get, const std::string &share, int size, const char *last) {
    const std::unique_ptr<char[]> out(new char[static_cast<std::size_t>(std::max(size, 1))]);
    const int length = get(share.c_str(), out.get(), size);
    const bool known = IsShare(share.c_str());
    Check((length >= 0) == (known && size > 0), "a known share and some room", share);
    if (length >= 0) {
        const std::string whole = std::string("/volume1/") + share.c_str() + "/@eaDir/" + last;
        Check(out.get() == whole.substr(0, static_cast<std::size_t>(size) - 1) &&
                  std::strlen(out.get()) == static_cast<std::size_t>(length),
              "as much as fits", whole);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    const Run run;
    FuzzedDataProvider input(data, size);
    const int room = input.ConsumeIntegralInRange(-1, kLargestBuffer);
    const std::string path = input.ConsumeRandomLengthString(kLongest);
    const std::string other = input.ConsumeRandomLengthString(kLongest);
    CheckShareName(path);
    CheckRenaming(path, other);
    CheckFullPath(path);
    CheckPrefix(path, other);
    for (const std::string &text : {path, other, "/volume1" + path, "/volume1/photos/" + other}) {
        CheckShareOf(text);
        CheckRules(text);
    }
    // A cut path would be made a directory anywhere: only those that are whole are asked for.
    CheckLocation(FILEIDXQueuePathGet, NaiveShareName(path), room, "VANO@file_index_queue");
    CheckLocation(FILEIDXDBPathGet, NaiveShareName(path), kLargestBuffer, "VANO@.fileindexdb");
    return 0;
}
