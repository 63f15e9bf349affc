#include "operations.h"

#include <cstring>
#include <fileindex/event_queue.h>
#include <fileindex/fileindex.h>
#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>
#include <fileindex/index_rules.h>
#include <fileindex/migration.h>
#include <fileindex/notification.h>
#include <fileindex/share_path.h>
#include <fileindex/status.h>
#include <fileindex/status_mgr.h>

#include "support/files.h"

namespace VANO::TORTURE {

namespace {

using namespace FILEINDEX;

constexpr char kTwoShares[] =
    R"({"/media/films":{"audio":false,"document":false,"name":"Films","path":"/media/films",)"
    R"("photo":false,"video":true},"/photos/2016":{"audio":false,"document":false,"name":"Trip",)"
    R"("path":"/photos/2016","photo":true,"video":false},"/photos/2017":{"audio":false,)"
    R"("document":false,"name":"Next","path":"/photos/2017","photo":true,"video":false}})";
constexpr char kOneFolder[] =
    R"({"/photos/2016":{"audio":false,"document":false,"name":"Trip","path":"/photos/2016",)"
    R"("photo":true,"video":false}})";
constexpr char kFullMedia[] = R"({"no_space":{"media":true},"resume_time":-1})";

const Start kFirstRun = {std::nullopt, std::nullopt, false};
const Start kSmall = {kOneFolder, kFullMedia, true};
const Start kUsual = {kTwoShares, kFullMedia, true};

Result DoneIf(bool done) {
    return done ? Result::kDone : Result::kFailed;
}

// For questions that are answered with the failure value when they cannot be.
Result Yes(bool answer) {
    return answer ? Result::kDone : Result::kFailed;
}
Result No(bool answer) {
    return answer ? Result::kWrong : Result::kDone;
}

template <typename Answer>
Result Right(bool answered, const Answer &answer, const Answer &expected) {
    if (!answered) {
        return Result::kFailed;
    }
    return answer == expected ? Result::kDone : Result::kWrong;
}

Operation Write(const char *name, const Start &start, std::function<bool()> run) {
    return {name, start, [run = std::move(run)] { return DoneIf(run()); }, true, false, true};
}

Operation Queue(const char *name, const Start &start, std::function<bool()> run) {
    Operation operation = Write(name, start, std::move(run));
    operation.queuesEvents = true;
    return operation;
}

// The request is read beforehand: reading it is not what is tortured.
Operation Queue(const char *name, const Start &start, bool (*run)(const Json::Value &),
                const char *request) {
    return Queue(name, start, [run, value = TESTS::Json(request)] { return run(value); });
}

Operation Ask(const char *name, std::function<Result()> run, bool mayThrow = false) {
    return {name, kUsual, std::move(run), false, false, mayThrow};
}

// Without memory of its own: the entry points are asked where there is none.
Result Location(int (*get)(const char *, char *, int), const char *expected) {
    char path[4096] = "untouched";
    const int length = get("photos", path, sizeof(path));
    if (length == -1) {
        return Result::kFailed;
    }
    return std::strcmp(path, expected) == 0 && length == static_cast<int>(std::strlen(path))
               ? Result::kDone
               : Result::kWrong;
}

// That a full share is not revived is logged only.
Operation RevivesShares(Operation operation) {
    operation.mayLeaveStatus = true;
    return operation;
}

Operation Delete(const char *name, const Start &start, const char *request) {
    Operation operation = Queue(name, start, IndexMgr::Delete, request);
    operation.mayLackEvents = true;
    return operation;
}

std::vector<Operation> Writers() {
    return {
        Queue("upsert-first", kFirstRun, IndexMgr::Upsert,
              R"([{"path":"/photos/2016","photo":true}])"),
        Queue("upsert-insert", kUsual, IndexMgr::Upsert, R"([{"path":"/pictures","name":"All"}])"),
        Queue("upsert-update", kUsual, IndexMgr::Upsert,
              R"([{"path":"/photos/2016","audio":true}])"),
        Queue("upsert-several", kUsual, IndexMgr::Upsert,
              R"([{"path":"/photos/films","video":true},{"path":"/photos/2017","photo":false}])"),
        Delete("delete-one", kUsual, R"(["/photos/2016"])"),
        Delete("delete-one-share", kUsual, R"(["/media/films"])"),
        Delete("delete-last", kSmall, R"(["/photos/2016"])"),
        Write("share-rename", kUsual, [] { return IndexMgr::ShareRename("photos", "pictures"); }),
        Write("share-remove", kUsual, [] { return IndexMgr::ShareRemove("photos"); }),
        Write("share-remove-last", kSmall, [] { return IndexMgr::ShareRemove("photos"); }),
        Write("share-pause", kUsual, [] { return IndexMgr::SharePause("photos"); }),
        Write("share-resume", kUsual, [] { return IndexMgr::ShareResume("photos"); }),
        Queue("reindex", kUsual, IndexMgr::Reindex, R"(["/photos/2016","/photos/2017"])"),
        RevivesShares(
            Queue("reindex-full-share", kUsual, IndexMgr::Reindex, R"(["/media/films"])")),
        Queue("update", kUsual,
              [] { return IndexMgr::Update("/photos/2016", Json::Value(Json::objectValue)); }),
        Write("pause", kUsual, [] { return StatusMgr::Pause(0); }),
        Write("resume", kUsual, [] { return StatusMgr::Resume(); }),
        Write("share-set-no-space", kUsual,
              [] { return StatusMgr::ShareSetNoSpace("photos", true); }),
        Write("share-clear-no-space", kUsual,
              [] { return StatusMgr::ShareSetNoSpace("media", false); }),
        Write("share-set-need-reindex", kFirstRun,
              [] { return StatusMgr::ShareSetNeedReindex("photos", true); }),
        Write("share-revive", kUsual, [] { return StatusMgr::ShareRevive("media"); }),
        Write("set-updated", kUsual, [] { return StatusMgr::SetUpdated("step"); }),
        Queue("add-custom-event", kUsual,
              [] { return AddCustomEvent(131072, "/volume1/photos/new", Json::Value(1)); }),
        Write("notify-no-space", kUsual, [] { return NotifyNoSpace(); }),
        RevivesShares(Queue("migration", kUsual, [] { return Updater_zem60_beta2(); })),
        Write("migration-empty", kFirstRun, [] { return Updater_zem60_beta2(); }),
    };
}

std::vector<Operation> EntryPointQueries() {
    return {
        Ask("c-share-indexed", [] { return Yes(FILEIDXIsShareIndexed("photos") == 1); }),
        Ask("c-share-not-indexed", [] { return No(FILEIDXIsShareIndexed("pictures") != 0); }),
        Ask("c-path-indexed", [] { return Yes(FILEIDXIsPathIndexed("/photos/2016/a") == 1); }),
        Ask("c-path-not-indexed", [] { return No(FILEIDXIsPathIndexed("/photos/20") != 0); }),
        Ask("c-full-path-indexed",
            [] { return Yes(FILEIDXIsFullPathIndexed("/volume1/photos/2016/a") == 1); }),
        Ask("c-full-path-not-indexed",
            [] { return No(FILEIDXIsFullPathIndexed("/volume1/photos/20") != 0); }),
        Ask("c-database-path",
            [] { return Location(FILEIDXDBPathGet, "/volume1/photos/@eaDir/VANO@.fileindexdb"); }),
        Ask("c-queue-path",
            [] {
                return Location(FILEIDXQueuePathGet,
                                "/volume1/photos/@eaDir/VANO@file_index_queue");
            }),
    };
}

std::vector<Operation> Queries() {
    return {
        Ask("share-indexed", [] { return Yes(IndexMgr::IsShareIndexed("media")); }),
        Ask("path-contains-indexed", [] { return Yes(IndexMgr::IsPathContainIndexed("/photos")); }),
        Ask(
            "list",
            [] {
                std::vector<Folder> folders;
                const bool answered = IndexMgr::List(folders);
                return Right(answered, folders.size(), std::size_t{3});
            },
            true),
        Ask(
            "list-page",
            [] {
                Json::Value facts(Json::arrayValue);
                facts.append("status");
                facts.append("is_valid");
                Json::Value page;
                const bool answered = IndexMgr::List(page, 0, 10, "name", "ASC", facts);
                return Right(answered, page["total"].asInt(), 3);
            },
            true),
        Ask(
            "get",
            [] {
                Json::Value folder;
                const bool answered = IndexMgr::Get(folder, "/media/films");
                return Right(answered, folder["name"].asString(), std::string("Films"));
            },
            true),
        Ask(
            "full-path",
            [] {
                std::string path;
                const bool answered = GetFullPath(path, "/photos/2016");
                return Right(answered, path, std::string("/volume1/photos/2016"));
            },
            true),
        Ask(
            "path-can-be-indexed", [] { return Yes(CanPathBeIndexed("/photos/2016")); }, true),
        Ask(
            "full-path-is-skipped", [] { return Yes(!IsSkipIndex("/volume1/photos/2016")); }, true),
        Ask(
            "share-space-enough", [] { return Yes(IsShareSpaceEnough("photos")); }, true),
        Ask(
            "pause-info",
            [] {
                long long time = 7;
                const bool answered = StatusMgr::GetPauseInfo(time);
                return Right(answered, time, -1LL);
            },
            true),
        Ask(
            "share-no-space", [] { return Yes(StatusMgr::ShareIsNoSpace("media")); }, true),
        Ask(
            "share-has-space", [] { return No(StatusMgr::ShareIsNoSpace("photos")); }, true),
        Ask(
            "share-need-reindex", [] { return No(StatusMgr::ShareIsNeedReindex("photos")); }, true),
        Ask(
            "is-updated", [] { return No(StatusMgr::IsUpdated("step")); }, true),
        Ask(
            "folder-status",
            [] { return Yes(StatusMgr::GetFolderStatus("/photos/2016") == "finished"); }, true),
        Ask(
            "status",
            [] {
                std::string status;
                const bool answered = StatusMgr::GetStatus(status);
                return Right(answered, status.empty(), false);
            },
            true),
    };
}

} // namespace

const std::vector<Operation> &AllOperations() {
    static const std::vector<Operation> operations = [] {
        std::vector<Operation> all = Writers();
        for (const auto &more : {EntryPointQueries(), Queries()}) {
            all.insert(all.end(), more.begin(), more.end());
        }
        return all;
    }();
    return operations;
}

} // namespace VANO::TORTURE
