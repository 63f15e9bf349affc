// The input is {"folders": FOLDER.CONF, "steps": [{"upsert": REQUEST}, {"delete": REQUEST}, ...]}.
//
// After each step the settings are those of a plain model, and the other parties heard of exactly
// the folders that were named; a request that is refused changes nothing; adding a folder and
// deleting it restores the file byte for byte.

#include <fileindex/error_handler.h>
#include <fileindex/index_mgr.h>
#include <map>

#include "support/check.h"
#include "support/fake_platform.h"
#include "support/naive.h"
#include "support/world.h"

namespace {

using namespace VANO::FILEINDEX;
using namespace VANO::FUZZ;
using VANO::TESTS::FakePlatform;

constexpr Json::ArrayIndex kMostSteps = 6;
constexpr char kNewFolder[] = "/music/2016/not in the file";

bool IsResolvable(const std::string &path) {
    for (const std::string &share : ShareNames()) {
        if (path.size() > share.size() && path.compare(1, share.size(), share) == 0 &&
            (path.size() == share.size() + 1 || path[share.size() + 1] == '/')) {
            return true;
        }
    }
    return false;
}

// The settings as they must be: an object of folder objects.
class Model {
  public:
    // An object as the file holds it; anything else is no settings.
    explicit Model(const Json::Value &conf) : settings_(Json::objectValue) {
        for (const std::string &path : conf.getMemberNames()) {
            Merge(path, conf[path]);
        }
    }

    // False, with nothing changed, for a request that must be refused.
    bool Upsert(const Json::Value &request) {
        if (!request.isArray()) {
            return false;
        }
        Model changed = *this;
        for (const Json::Value &element : request) {
            if (!element.isObject() || !element["path"].isString() ||
                !IsResolvable(element["path"].asString())) {
                return false;
            }
            changed.Merge(element["path"].asString(), element);
        }
        *this = changed;
        return true;
    }

    bool Delete(const Json::Value &request) {
        if (!request.isArray()) {
            return false;
        }
        Json::Value changed = settings_;
        for (const Json::Value &element : request) {
            if (!element.isConvertibleTo(Json::stringValue) || element.asString().empty()) {
                return false;
            }
            const std::string path = element.asString();
            Json::Value removed; // by its length: the name may hold a zero byte
            changed.removeMember(path.data(), path.data() + path.size(), &removed);
        }
        settings_ = changed;
        return true;
    }

    [[nodiscard]] const Json::Value &Settings() const { return settings_; }

  private:
    void Merge(const std::string &path, const Json::Value &from) {
        Json::Value &folder = settings_[path];
        folder["path"] = path;
        const bool isObject = from.isObject();
        if (!folder.isMember("name") || (isObject && from["name"].isString())) {
            folder["name"] = isObject ? StringOf(from["name"]) : "";
        }
        for (const char *type : {"document", "audio", "video", "photo"}) {
            if (!folder.isMember(type) || (isObject && from[type].isBool())) {
                folder[type] = isObject && from[type].isBool() && from[type].asBool();
            }
        }
    }

    Json::Value settings_;
};

void CheckSettings(const Model &model, const std::string &before, bool isAccepted) {
    const std::string now = Get(kFolderFile);
    if (!isAccepted) {
        Check(now == before, "a request that is refused changes nothing", now);
        return;
    }
    const auto settings = Parse(now);
    Check(settings && *settings == model.Settings(), "the settings are what was asked for", now);
}

// The folders that the daemon was told of, in order.
std::vector<std::string> Told(Run &run, const char *command) {
    std::vector<std::string> paths;
    for (const Json::Value &told : run.Commands()) {
        if (!told.isNull()) { // one that nothing can read
            Check(told["type"] == command && told["data"].size() == 1, "the command is for that");
            paths.push_back(told["data"]["folder_path"].asString());
        }
    }
    return paths;
}

// The change monitor was last told of exactly the share's folders.
void CheckMonitor(const Model &model) {
    std::map<std::string, Json::Value> last;
    for (const auto &call : FakePlatform::Get().monitorCalls) {
        last[call.queue] = call.description;
    }
    for (const auto &[queue, description] : last) {
        Json::ArrayIndex folders = 0;
        for (const std::string &path : model.Settings().getMemberNames()) {
            const std::string share = path.substr(0, path.find('/', 1));
            folders +=
                path[0] != '\0' && share.size() > 1 && queue == QueueOf(share.substr(1)) ? 1U : 0U;
        }
        Check(description.isNull() ? folders == 0 : description["config"].size() == folders,
              "the monitor watches the share's folders", queue);
    }
}

void CheckUpsert(Run &run, Model &model, const Json::Value &request) {
    const std::string before = Get(kFolderFile);
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
    const bool isDone = IndexMgr::Upsert(request);
    const bool isAccepted = model.Upsert(request);
    CheckSettings(model, before, isAccepted);
    const std::vector<std::string> told = Told(run, "upsert_folder_setting");
    if (!isAccepted) {
        Check(!isDone && ErrorHandler::GetError() == FILEINDEX_ERR_BAD_PARAM && told.empty(),
              "a bad request is refused as such");
        return;
    }
    // Without its "/" a share path makes a full path beside every share: that cannot be queued.
    bool isQueueable = true;
    Check(told.size() == request.size(), "the daemon is told of every folder");
    for (Json::ArrayIndex i = 0; i < request.size(); ++i) {
        const std::string path = request[i]["path"].asString();
        Check(told[i] == path, "and of no other", told[i]);
        isQueueable = isQueueable && path[0] == '/';
    }
    Check(isDone == isQueueable, "what can be told to all is done");
    CheckMonitor(model);
}

void CheckDelete(Run &run, Model &model, const Json::Value &request) {
    const std::string before = Get(kFolderFile);
    const bool isDone = IndexMgr::Delete(request);
    const bool isAccepted = model.Delete(request);
    CheckSettings(model, before, isAccepted);
    Check(isAccepted || !isDone, "a bad request is refused");
    const std::vector<std::string> told = Told(run, "delete_folder_setting");
    if (isAccepted) {
        const bool isLast = model.Settings().empty();
        Check(told.size() == (isLast ? 0 : request.size()), "the daemon is told, while it runs");
    }
    if (isDone) {
        CheckMonitor(model);
    }
}

void CheckGet(const Model &model) {
    for (const std::string &path : model.Settings().getMemberNames()) {
        Json::Value folder;
        Check(IndexMgr::Get(folder, path) && folder == model.Settings()[path], "each is got", path);
    }
    Json::Value folder = "untouched";
    Check(!IndexMgr::Get(folder, kNewFolder) && folder == "untouched", "no other is", kNewFolder);
}

void CheckDeleteAfterUpsert(Model &model, Run &run) {
    Json::Value folder;
    folder["path"] = kNewFolder;
    folder["photo"] = true;
    Json::Value request;
    request.append(folder);
    if (model.Settings().empty() || model.Settings().isMember(kNewFolder)) {
        return;
    }
    Check(IndexMgr::Upsert(Json::Value(Json::arrayValue)), "an empty request is done");
    const std::string before = Get(kFolderFile);
    CheckUpsert(run, model, request);
    Json::Value path;
    path.append(kNewFolder);
    CheckDelete(run, model, path);
    Check(Get(kFolderFile) == before, "a deletion restores what was", before);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size) {
    const auto input = Parse({reinterpret_cast<const char *>(data), size});
    if (!input || !input->isObject() || !(*input)["steps"].isArray()) {
        return 0; // no request
    }
    Run run;
    const Json::Value &conf = (*input)["folders"];
    if (conf.isObject()) {
        PutFile(kFolderFile, Text(conf));
    }
    Model model(conf.isObject() ? conf : Json::Value());
    const Json::Value &steps = (*input)["steps"];
    for (Json::ArrayIndex i = 0; i < std::min(steps.size(), kMostSteps); ++i) {
        FakePlatform::Get().monitorCalls.clear();
        if (steps[i].isObject() && steps[i].isMember("upsert")) {
            CheckUpsert(run, model, steps[i]["upsert"]);
        } else if (steps[i].isObject() && steps[i].isMember("delete")) {
            CheckDelete(run, model, steps[i]["delete"]);
        }
    }
    CheckGet(model);
    CheckDeleteAfterUpsert(model, run);
    return 0;
}
