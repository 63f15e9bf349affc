#include <fileindex/folder.h>
#include <fileindex/folders.h>

#include <algorithm>
#include <fileindex/error_handler.h>
#include <fileindex/index_rules.h>
#include <fileindex/status_mgr.h>

#include "base/json_io.h"
#include "base/log.h"
#include "platform/vano_platform.h"

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

bool CollectAdditional(Json::Value &facts, const Folder &folder, const Json::Value &keys) {
    if (!keys.isArray()) {
        return RefuseKeys(97, keys);
    }
    for (const Json::Value &element : keys) {
        if (!element.isString()) {
            return RefuseKeys(104, element);
        }
        const std::string key = element.asString();
        if (!folder.GetAdditional(facts[key], key)) {
            LogError(kUnit, 110, "Failed to get additional: %s", key.c_str());
        }
    }
    return true;
}

} // namespace

bool Folder::GetAdditional(Json::Value &out, const std::string &key) const {
    if (key == "status") {
        out = StatusMgr::GetFolderStatus(path);
        return true;
    }
    if (key == "is_valid") {
        out = CanPathBeIndexed(path);
        return true;
    }
    LogError(kUnit, 129, "Unknown additional: %s", key.c_str());
    ErrorHandler::SetError(FILEINDEX_ERR_BAD_PARAM);
    return false;
}

bool Folder::GetAdditional(Json::Value &out, const Json::Value &keys) const {
    Json::Value facts(Json::objectValue); // `keys` may be what `out` holds
    const bool complete = CollectAdditional(facts, *this, keys);
    out.swap(facts);
    return complete;
}

Json::Value Folder::asJson(const Json::Value &additional) const {
    Json::Value json = asJson();
    if (!GetAdditional(json["additional"], additional)) {
        LogError(kUnit, 83, "GetAdditional failed");
    }
    return json;
}

bool Folders::List(Json::Value &out, unsigned long offset, unsigned long limit,
                   const std::string &sort_by, const std::string &sort_direction,
                   const Json::Value &additional) {
    std::vector<Folder> sorted;
    (void)List(sorted);
    const unsigned long total = sorted.size();
    Json::Value listing(Json::objectValue); // `additional` may be what `out` holds
    listing["total"] = Json::UInt64{total};
    listing["offset"] = Json::UInt64{offset};
    Sort(sorted, sort_by);
    Json::Value page(Json::arrayValue);
    if (sort_direction == "DESC") {
        // The offset shortens a descending page but does not move it; one beyond the end does not
        // even shorten it.
        unsigned long index = std::min(limit, offset > total ? total : total - offset);
        while (index-- > 0) {
            page.append(sorted[index].asJson(additional));
        }
    } else {
        const unsigned long begin = std::min(offset, total);
        const unsigned long end = begin + std::min(limit, total - begin);
        for (unsigned long index = begin; index < end; ++index) {
            page.append(sorted[index].asJson(additional));
        }
    }
    listing["folder"] = std::move(page);
    out.swap(listing);
    return true;
}

} // namespace VANO::FILEINDEX
