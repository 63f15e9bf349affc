// Is this path indexed? And what every such question starts with: loading the settings.

#include "bench/benchmarks.h"

#include <cstring>
#include <fcntl.h>
#include <fileindex/fileindex.h>
#include <fileindex/index_mgr.h>
#include <json/reader.h>
#include <memory>
#include <sys/stat.h>

#include "base/unique_fd.h"
#include "bench/allocations.h"
#include "bench/appliance.h"
#include "bench/input.h"
#include "bench/measure.h"
#include "core/paths.h"

namespace VANO::BENCH {

namespace {

using FILEINDEX::Folder;
using FILEINDEX::IndexMgr;
using FILEINDEX::UniqueFd;

// A path that no folder covers, though it begins as one does nearly to the end.
std::string PathOfNoFolder() {
    std::string path = FullPathOf(FolderPaths(kMaxFolders).back());
    path.back() = path.back() == 'x' ? 'y' : 'x';
    return path + "/IMG_2041.JPG";
}

std::string PathInFolder() {
    return FullPathOf(FolderPaths(1).front()) + "/IMG_2041.JPG";
}

bool ParseAsTheJsonLibraryDoes(Json::Value &value, const char *begin, std::size_t size) {
    static const Json::CharReaderBuilder settings;
    const std::unique_ptr<Json::CharReader> reader(settings.newCharReader());
    return reader->parse(begin, begin + size, &value, nullptr);
}

// open, fstat, read, close, and the JSON library with its own settings.
bool ReadSettingsPlainly(std::size_t count) {
    std::string text;
    {
        const UniqueFd file(::open(FILEINDEX::kFolderConfPath, O_RDONLY | O_CLOEXEC));
        struct stat info {};
        if (!file || ::fstat(file.Get(), &info) != 0) {
            return false;
        }
        text.resize(static_cast<std::size_t>(info.st_size));
        if (::read(file.Get(), text.data(), text.size()) != info.st_size) {
            return false;
        }
    }
    Json::Value value;
    return ParseAsTheJsonLibraryDoes(value, text.data(), text.size()) && value.size() == count;
}

Operation OneShotQuery(std::size_t folders) {
    SetFolders(folders);
    Require(FILEIDXIsFullPathIndexed(PathInFolder().c_str()) == 1, "a folder is not found");
    return {
        [path = PathOfNoFolder()] { return FILEIDXIsFullPathIndexed(path.c_str()) == 0; }, {}, {}};
}

Operation LoadAndList(std::size_t count) {
    return {[count] {
                std::vector<Folder> folders;
                return IndexMgr::List(folders) && folders.size() == count;
            },
            [count] { SetFolders(count); },
            {}};
}

std::vector<Folder> HeldList(std::size_t count) {
    SetFolders(count);
    std::vector<Folder> folders;
    Require(IndexMgr::List(folders) && folders.size() == count, "the settings do not load");
    return folders;
}

bool StartsWithOneOf(const std::string &path, const std::vector<std::string> &prefixes) {
    for (const std::string &prefix : prefixes) {
        if (path.size() >= prefix.size() &&
            std::memcmp(path.data(), prefix.data(), prefix.size()) == 0) {
            return true;
        }
    }
    return false;
}

double AllocationsOfQuery(const std::string &path, std::size_t folders) {
    const std::vector<Folder> held = HeldList(folders);
    const std::size_t before = AllocationsOfThread();
    Require(!IndexMgr::IsFullPathIndexed(path, held), "wrong answer");
    return static_cast<double>(AllocationsOfThread() - before);
}

Pair ListQuery(const std::string &key) {
    constexpr std::size_t kFewFolders = 10;
    const std::string path = PathOfNoFolder();
    ReportFact(key, "allocations_per_record",
               (AllocationsOfQuery(path, kMaxFolders) - AllocationsOfQuery(path, kFewFolders)) /
                   static_cast<double>(kMaxFolders - kFewFolders),
               0);
    std::vector<std::string> prefixes;
    for (const std::string &folder : FolderPaths(kMaxFolders)) {
        prefixes.push_back(FullPathOf(folder));
    }
    const std::vector<Folder> held = HeldList(kMaxFolders);
    Require(IndexMgr::IsFullPathIndexed(PathInFolder(), held), "a folder is not found");
    return {{[=] { return !IndexMgr::IsFullPathIndexed(path, held); }, {}, {}},
            {[=] { return !StartsWithOneOf(path, prefixes); }, {}, {}}};
}

} // namespace

void AddMembershipBenchmarks() {
    AddComparison({"one_shot_query",
                   "FILEIDXIsFullPathIndexed, 1,000 folders / open + read + jsoncpp parse",
                   Target::kAtMost, 1.15, 1, [] {
                       return Pair{OneShotQuery(kMaxFolders),
                                   {[] { return ReadSettingsPlainly(kMaxFolders); }, {}, {}}};
                   }});
    AddComparison({"list_query",
                   "IsFullPathIndexed on a held list of 1,000 / memcmp over 1,000 strings",
                   Target::kAtMost, 1.5, 100, [] { return ListQuery("list_query"); }});
    AddComparison(
        {"load_growth", "load + list of 1,000 folders / of 100", Target::kAtMost, 11, 1, [] {
             return Pair{LoadAndList(kMaxFolders), LoadAndList(kMaxFolders / 10)};
         }});
    const std::vector<std::size_t> sizes = {10, 30, 100, 300, kMaxFolders};
    AddSeries({"folders", "one_shot_query", sizes, OneShotQuery});
    AddSeries({"folders", "load_and_list", sizes, LoadAndList});
}

} // namespace VANO::BENCH
