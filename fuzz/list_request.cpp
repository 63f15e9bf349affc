// The input is {"folders": FOLDER.CONF, "queue": TEXT, "offset": N, "limit": N, "sort_by": TEXT,
// "sort_direction": TEXT, "additional": X}.
//
// The page that is answered is the one that its description names, with every fact that was asked
// for, whatever the request holds.

#include <algorithm>
#include <fileindex/error_handler.h>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/status_mgr.h>

#include "platform/vano_platform.h"
#include "support/check.h"
#include "support/log_tap.h"
#include "support/naive.h"
#include "support/world.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;

struct Request {
    unsigned long offset;
    unsigned long limit;
    std::string sortBy;
    std::string direction;
    Json::Value additional;
};

unsigned long NumberOf(const Json::Value &value) {
    return value.isUInt64() ? value.asUInt64() : 0;
}

bool IsFlag(const std::string &key) {
    return key == "document" || key == "audio" || key == "video" || key == "photo";
}

// Negative when `a` must stand before `b`.
int Compare(const Json::Value &a, const Json::Value &b, const std::string &sortBy) {
    if (IsFlag(sortBy)) {
        return static_cast<int>(a[sortBy].asBool()) - static_cast<int>(b[sortBy].asBool());
    }
    const char *key = sortBy == "name" ? "name" : "path";
    return VLIBCUnicodeUTF8StrCaseCmp(a[key].asCString(), b[key].asCString());
}

// The indexes of the sorted list that make the page, in the page's order.
std::vector<unsigned long> IndexesOf(const Request &request, unsigned long total) {
    std::vector<unsigned long> indexes;
    const bool descending = request.direction == "DESC";
    const unsigned long left = request.offset > total ? 0 : total - request.offset;
    const unsigned long count =
        std::min(request.limit, descending && request.offset > total ? total : left);
    for (unsigned long i = 0; i < count; ++i) {
        indexes.push_back(descending ? count - 1 - i : request.offset + i);
    }
    return indexes;
}

// The facts of one folder, as asked one by one; what follows a bad key is left out.
Json::Value FactsOf(const std::string &path, const Json::Value &keys) {
    Json::Value facts(Json::objectValue);
    if (!keys.isArray()) {
        return facts;
    }
    for (const Json::Value &key : keys) {
        if (!key.isString()) {
            break;
        }
        Json::Value &fact = facts[key.asString()];
        if (key == "status") {
            fact = StatusMgr::GetFolderStatus(path);
        } else if (key == "is_valid") {
            fact = CanPathBeIndexed(path);
        }
    }
    return facts;
}

bool IsWellFormed(const Json::Value &keys) {
    return keys.isArray() && std::all_of(keys.begin(), keys.end(), [](const Json::Value &key) {
               return key == "status" || key == "is_valid";
           });
}

void CheckPage(const Request &request, const Json::Value &page, std::vector<Json::Value> all) {
    std::stable_sort(all.begin(), all.end(), [&](const Json::Value &a, const Json::Value &b) {
        return Compare(a, b, request.sortBy) < 0;
    });
    const std::vector<unsigned long> indexes = IndexesOf(request, all.size());
    Check(page.isArray() && page.size() == indexes.size(), "the page has its size");
    std::vector<std::string> seen;
    for (Json::ArrayIndex i = 0; i < page.size(); ++i) {
        Json::Value folder = page[i];
        const Json::Value facts = folder["additional"];
        folder.removeMember("additional");
        Check(Compare(folder, all[indexes[i]], request.sortBy) == 0, "the page is in its order");
        Check(std::find(all.begin(), all.end(), folder) != all.end(), "it holds settings");
        Check(facts == FactsOf(folder["path"].asString(), request.additional), "with their facts");
        seen.push_back(folder["path"].asString());
    }
    std::sort(seen.begin(), seen.end());
    Check(std::adjacent_find(seen.begin(), seen.end()) == seen.end(), "each of them once");
}

void CheckListing(const Request &request, const Json::Value &conf) {
    std::vector<Folder> folders;
    Json::Value answer = "untouched";
    const bool isListed = IndexMgr::List(answer, request.offset, request.limit, request.sortBy,
                                         request.direction, request.additional);
    Check(isListed == conf.isObject(), "settings that load are listed");
    if (!isListed) {
        Check(answer == "untouched", "a failed listing leaves its output");
        return;
    }
    const bool hasError = ErrorHandler::GetError() == FILEINDEX_ERR_BAD_PARAM;
    Check(!hasError || !IsWellFormed(request.additional), "a good request is no bad parameter");
    Check(IndexMgr::List(folders) && answer.size() == 3, "an answer has three members");
    Check(answer["total"].asUInt64() == folders.size() &&
              answer["offset"].asUInt64() == request.offset,
          "it counts all folders");
    std::vector<Json::Value> all;
    for (const Folder &folder : folders) {
        all.push_back(folder.asJson());
    }
    CheckPage(request, answer["folder"], all);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    const auto input = Parse({reinterpret_cast<const char *>(data), size});
    if (!input || !input->isObject()) {
        return 0; // no request
    }
    const Run run;
    const Json::Value &conf = (*input)["folders"];
    PutFile(kFolderFile, Text(conf));
    if ((*input)["queue"].isString()) {
        PutFile(QueueOf("photos"), (*input)["queue"].asString());
    }
    CheckListing({NumberOf((*input)["offset"]), NumberOf((*input)["limit"]),
                  StringOf((*input)["sort_by"]), StringOf((*input)["sort_direction"]),
                  (*input)["additional"]},
                 conf);
    return 0;
}
