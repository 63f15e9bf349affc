#include <fileindex/folder.h>
#include <fileindex/folders.h>

#include <algorithm>
#include <fileindex/error_handler.h>
#include <fileindex/index_rules.h>

#include "base/json_io.h"
#include "base/log.h"
#include "platform/vano_platform.h"
#include "status/folder_progress.h"

namespace VANO::FILEINDEX {

namespace {

constexpr char kUnit[] = "folder";

bool RefuseKeys(int line, const Json::Value &value) {
    LogError(kUnit, line, "Bad param: %s", JsonToString(value).c_str());
    ErrorHandler::SetError(FILEINDEX_ERR_BAD_PARAM);
    return false;
}

void SortByText(std::vector<Folder> &folders, std::string Folder::*text) {
    std::sort(folders.begin(), folders.end(), [text](const Folder &a, const Folder &b) {
        return VLIBCUnicodeUTF8StrCaseCmp((a.*text).c_str(), (b.*text).c_str()) < 0;
    });
}

// Folders without the file type come first.
void SortByFlag(std::vector<Folder> &folders, bool Folder::*flag) {
    std::sort(folders.begin(), folders.end(),
              [flag](const Folder &a, const Folder &b) { return !(a.*flag) && b.*flag; });
}

void Sort(std::vector<Folder> &folders, const std::string &sortBy) {
    static constexpr struct {
        const char *name;
        bool Folder::*flag;
    } kFlags[] = {{"document", &Folder::document},
                  {"audio", &Folder::audio},
                  {"video", &Folder::video},
                  {"photo", &Folder::photo}};
    for (const auto &[name, flag] : kFlags) {
        if (sortBy == name) {
            SortByFlag(folders, flag);
            return;
        }
    }
    SortByText(folders, sortBy == "name" ? &Folder::name : &Folder::path);
}

bool GetFact(Json::Value &out, const Folder &folder, const std::string &key,
             FolderProgress &progress) {
    if (key == "status") {
        out = progress.StatusOf(folder.path);
        return true;
    }
    if (key == "is_valid") {
        out = CanPathBeIndexed(folder.path);
        return true;
    }
    LogError(kUnit, 129, "Unknown additional: %s", key.c_str());
    ErrorHandler::SetError(FILEINDEX_ERR_BAD_PARAM);
    return false;
}

bool CollectFacts(Json::Value &facts, const Folder &folder, const Json::Value &keys,
                  FolderProgress &progress) {
    if (!keys.isArray()) {
        return RefuseKeys(97, keys);
    }
    // NOLINTNEXTLINE(modernize-loop-convert): an iterator skips holes
    for (Json::ArrayIndex index = 0; index < keys.size(); ++index) {
        if (!keys[index].isString()) {
            return RefuseKeys(104, keys[index]);
        }
        const std::string key = keys[index].asString();
        if (!GetFact(facts[key], folder, key, progress)) {
            LogError(kUnit, 110, "Failed to get additional: %s", key.c_str());
        }
    }
    return true;
}

Json::Value WithFacts(const Folder &folder, const Json::Value &additional,
                      FolderProgress &progress) {
    Json::Value json = folder.asJson();
    Json::Value &facts = json["additional"] = Json::Value(Json::objectValue);
    if (!CollectFacts(facts, folder, additional, progress)) {
        LogError(kUnit, 83, "GetAdditional failed");
    }
    return json;
}

// The folders of the page, in its order.
std::vector<const Folder *> CutPage(const std::vector<Folder> &sorted, unsigned long offset,
                                    unsigned long limit, bool descending) {
    const unsigned long total = sorted.size();
    std::vector<const Folder *> page;
    if (descending) {
        // The offset shortens a descending page but does not move it; one beyond the end does not
        // even shorten it.
        unsigned long index = std::min(limit, offset > total ? total : total - offset);
        while (index-- > 0) {
            page.push_back(&sorted[index]);
        }
        return page;
    }
    const unsigned long begin = std::min(offset, total);
    const unsigned long end = begin + std::min(limit, total - begin);
    page.reserve(end - begin);
    for (unsigned long index = begin; index < end; ++index) {
        page.push_back(&sorted[index]);
    }
    return page;
}

FolderProgress ProgressOf(const std::vector<const Folder *> &folders) {
    std::vector<std::string> fullPaths;
    fullPaths.reserve(folders.size());
    for (const Folder *folder : folders) {
        fullPaths.push_back(folder->full_path);
    }
    return FolderProgress(std::move(fullPaths));
}

} // namespace

bool Folder::GetAdditional(Json::Value &out, const std::string &key) const {
    FolderProgress progress({});
    return GetFact(out, *this, key, progress);
}

bool Folder::GetAdditional(Json::Value &out, const Json::Value &keys) const {
    FolderProgress progress({});
    Json::Value facts(Json::objectValue); // `keys` may be what `out` holds
    const bool complete = CollectFacts(facts, *this, keys, progress);
    out.swap(facts);
    return complete;
}

Json::Value Folder::asJson(const Json::Value &additional) const {
    FolderProgress progress({});
    return WithFacts(*this, additional, progress);
}

bool Folders::List(Json::Value &out, unsigned long offset, unsigned long limit,
                   const std::string &sort_by, const std::string &sort_direction,
                   const Json::Value &additional) {
    std::vector<Folder> sorted;
    (void)List(sorted);
    Json::Value listing(Json::objectValue); // `additional` may be what `out` holds
    listing["total"] = Json::UInt64{sorted.size()};
    listing["offset"] = Json::UInt64{offset};
    Sort(sorted, sort_by);
    const auto listed = CutPage(sorted, offset, limit, sort_direction == "DESC");
    FolderProgress progress = ProgressOf(listed);
    Json::Value page(Json::arrayValue);
    for (const Folder *folder : listed) {
        page.append(WithFacts(*folder, additional, progress));
    }
    listing["folder"] = std::move(page);
    out.swap(listing);
    return true;
}

} // namespace VANO::FILEINDEX
