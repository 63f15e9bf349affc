// The input is the text of the plain-Linux provider's share table.
//
// It is an object with every other rule kept, or holds no shares; each share is found by its name
// in any case and by every path inside it, share paths and full paths lead back to each other; the
// order of names is one.

#include <algorithm>
#include <cstdio>
#include <fileindex/share_path.h>
#include <map>
#include <memory>

#include "base/file_io.h"
#include "indexing_peer/queues.h"
#include "platform/linux/case_fold.h"
#include "platform/linux/share_table.h"
#include "platform/vano_platform.h"
#include "support/appliance.h"
#include "support/check.h"
#include "support/descriptors.h"
#include "support/log_tap.h"
#include "support/naive.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;
using VANO::PLATFORM::CaseFoldKey;
using VANO::PLATFORM::ReadTableEntry;
using VANO::PLATFORM::TableShare;
using VANO::TESTS::kShareTable;

struct FreeShare {
    void operator()(_tag_VANOSHARE *share) const { VANOShareFree(share); }
};
using Record = std::unique_ptr<_tag_VANOSHARE, FreeShare>;

Record Find(const std::string &name) {
    _tag_VANOSHARE *share = nullptr;
    const int result = VANOShareGet(name.c_str(), &share);
    Check((result >= 0) == (share != nullptr), "a record is handed out for success only", name);
    return Record(share);
}

// The shares of the table, by hand: entries in byte order, none that repeats an earlier one.
std::map<std::string, std::string> NaiveShares(const std::optional<Json::Value> &table) {
    std::map<std::string, std::string> shares;
    std::vector<std::u32string> names;
    std::vector<std::string> paths;
    if (!table || !table->isObject()) {
        return shares;
    }
    for (const std::string &name : table->getMemberNames()) {
        TableShare share;
        if (ReadTableEntry(share, name, (*table)[name]) != nullptr ||
            std::count(names.begin(), names.end(), CaseFoldKey(name)) != 0 ||
            std::count(paths.begin(), paths.end(), share.path) != 0) {
            continue;
        }
        names.push_back(CaseFoldKey(name));
        paths.push_back(share.path);
        shares.emplace(name, share.path);
    }
    return shares;
}

std::string Upper(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(), [](char c) {
        return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
    });
    return text;
}

void CheckRecord(const std::string &name, const std::string &path) {
    const Record share = Find(name);
    Check(share && share->name == name && share->path == path, "a share is what it says", name);
    const Record same = Find(Upper(name));
    Check(same && same->name == name, "in any case", name);
    Check(path[0] == '/' && path.back() != '/' && path.find("//") == std::string::npos &&
              (path + "/").find("/../") == std::string::npos,
          "its directory is plain", path);
    int flag = -1;
    Check(VLIBShareIsEncryptedGet(share.get(), &flag) == 0 && (flag == 0 || flag == 1) &&
              VLIBShareIsReadOnlyGet(share.get(), &flag) == 0 && (flag == 0 || flag == 1) &&
              VLIBShareIsEncryptionGet(share.get(), &flag) == 0 && (flag == 0 || flag == 1),
          "its properties are told", name);
}

// The name of an entry that breaks a rule finds nothing, or a share that it is another spelling of.
void CheckLeftOut(const Json::Value &table, const std::map<std::string, std::string> &shares) {
    for (const std::string &name : table.getMemberNames()) {
        const Record share = Find(name);
        Check(!share || shares.count(share->name) != 0, "a bad entry is left out", name);
    }
}

// The share that holds a full path: the one with the longest directory.
std::string NaiveShareOf(const std::map<std::string, std::string> &shares,
                         const std::string &fullPath) {
    const std::pair<const std::string, std::string> *best = nullptr;
    for (const auto &share : shares) {
        if (Lies(fullPath, share.second) &&
            (best == nullptr || share.second.size() > best->second.size())) {
            best = &share;
        }
    }
    return best != nullptr ? best->first : "";
}

void CheckFullPath(const std::map<std::string, std::string> &shares, const std::string &fullPath) {
    std::string name;
    std::string inside;
    const bool isFound = GetShareNamePathByFullPath(name, inside, fullPath);
    const std::string wanted = NaiveShareOf(shares, fullPath);
    if (wanted.size() < 492 && fullPath.size() < 4096) { // what fits the platform's buffers
        Check(isFound == !wanted.empty() && name == wanted, "the deepest share holds it", fullPath);
        Check(!isFound || shares.at(name) + inside == fullPath, "the rest is told", fullPath);
    }
    (void)VANOShareIsShareRecycle(fullPath.c_str());
    int flag = 0;
    (void)VLIBFhsPathInSnapshot(fullPath.c_str(), &flag);
}

void CheckRoundTrip(const std::string &name, const std::string &path) {
    const std::string sharePath = "/" + name + "/a";
    std::string fullPath;
    Check(GetFullPath(fullPath, sharePath), "a share's path resolves", sharePath);
    Check(fullPath == path.substr(0, path.rfind('/')) + sharePath, "beside the share", fullPath);
    Check(ReplaceShareName(ReplaceShareName(sharePath, "x"), name) == sharePath, "and back", name);
}

int Sign(int number) {
    return (number > 0 ? 1 : 0) - (number < 0 ? 1 : 0);
}

// Every three names are in one order.
void CheckOrder(std::vector<std::string> names) {
    names.resize(std::min<std::size_t>(names.size(), 6));
    const auto compare = [](const std::string &a, const std::string &b) {
        return Sign(VLIBCUnicodeUTF8StrCaseCmp(a.c_str(), b.c_str()));
    };
    for (const std::string &a : names) {
        for (const std::string &b : names) {
            Check(compare(a, b) == -compare(b, a), "an order looks the same from both sides", a);
            Check((compare(a, b) == 0) == (CaseFoldKey(a.c_str()) == CaseFoldKey(b.c_str())),
                  "what folds alike is equal", a);
            for (const std::string &c : names) {
                Check(compare(a, b) > 0 || compare(b, c) > 0 || compare(a, c) <= 0, "a chain", a);
            }
        }
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    VANO::TESTS::RequireSandbox();
    const Descriptors descriptors;
    const std::string text(reinterpret_cast<const char *>(data), size);
    (void)std::remove(kShareTable);
    Check(WriteFile(kShareTable, text), "the table can be written");
    const auto table = Parse(text);
    const auto shares = NaiveShares(table);
    std::vector<std::string> names;
    for (const auto &[name, path] : shares) {
        CheckRecord(name, path);
        CheckRoundTrip(name, path);
        for (const char *behind : {"", "/", "/a", "x", "/#recycle/a", "//#snapshot"}) {
            CheckFullPath(shares, path + behind);
        }
        CheckFullPath(shares, path.substr(0, path.rfind('/')));
        names.push_back(name);
    }
    if (table && table->isObject()) {
        CheckLeftOut(*table, shares);
    }
    CheckOrder(table && table->isObject() ? table->getMemberNames() : names);
    Check(!Find("surely not in the table"), "there are no other shares");
    (void)peer::QueuesOfAllShares();
    (void)LogTap::Take();
    descriptors.CheckNoneLeft();
    return 0;
}
