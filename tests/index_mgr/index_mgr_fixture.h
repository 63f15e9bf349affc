#ifndef FILEINDEX_TESTS_INDEX_MGR_FIXTURE_H
#define FILEINDEX_TESTS_INDEX_MGR_FIXTURE_H

// What the tests of IndexMgr start from: three shares with empty event queues, and the words for
// what the operations do to the other parties.
//
//     PutFolders({"/photos/a"});
//     Watch();
//     EXPECT_TRUE(IndexMgr::Reindex(Json(R"(["/photos/a"])")));
//     EXPECT_THAT(Steps(), ElementsAre(Changed(QueueOf("/volume1/photos"))));

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "support/fixture.h"

namespace VANO::TESTS {

constexpr char kVideo[] = "/volume1/video";
constexpr char kMusic[] = "/volume2/music";

// Entries of the event trace.
std::string Changed(const std::string &file);
std::string Locked(const std::string &file);
std::string Unlocked(const std::string &file);
std::string Made(const std::string &directory); // the share's metadata directory
std::string Told(const std::string &command, const std::string &key, const std::string &value);
std::string Watched(const std::string &directory, const std::vector<std::string> &fullPaths);
std::string Unwatched(const std::string &directory);
std::string Removed(const std::string &path);
constexpr char kStarted[] = "VLIBServiceStart(fileindexd, 1)";
constexpr char kStopped[] = "VLIBServiceStop(fileindexd, 1)";
constexpr char kSpotlightOn[] = "VANOSMBSetSpotlight(true)";
constexpr char kSpotlightOff[] = "VANOSMBSetSpotlight(false)";
constexpr char kRestarted[] = "VLIBServiceRestart(samba)";

// What a queue file holds: an object a line.
std::vector<Json::Value> EventsIn(const std::string &queue);
Json::Value Event(int code, const std::string &path, const Json::Value &data);

// Which file types changed.
Json::Value Report(bool document, bool audio, bool video, bool photo);
Json::Value EverythingChanged();
Json::Value NothingChanged();

// A setting for photos only, as folder.conf holds it.
Json::Value PhotoFolder(const std::string &path);

// A JSON array of texts.
Json::Value Paths(const std::vector<std::string> &paths);

// What stands in an operation's way while it runs.
using Obstacle = std::shared_ptr<void>;
using Arrangement = std::function<Obstacle()>;

Arrangement NothingInTheWay();
Arrangement SettingsHold(const std::string &text);
Arrangement Refused(const std::string &platformFunction, const std::vector<int> &answers);
Arrangement Refused(Call call, int error, int nth); // the nth call
Arrangement Gone(const std::string &share,
                 const std::string &platformFunction); // at its first call
Arrangement Gone(const std::string &share, Call call);

// One step of an operation that fails, and what has been done by then.
struct FailingStep {
    const char *name;
    Arrangement arrange;
    std::size_t steps; // how many of all steps happen, the failing one included where it is one
    std::vector<std::string> log;
    _tag_fileindex_err_ error = FILEINDEX_ERR_NONE;
    bool daemonRuns = true;
    int leaks = 0; // descriptors that the lock's attempts leave open
};

// What ends every operation that changes the folder settings before it has done anything.
const std::vector<FailingStep> &FailuresBeforeAnyStep();

// What fails when the service is stopped and Spotlight switched off, and what is tried of it.
struct ServiceFailure {
    const char *name;
    const char *function;
    std::vector<std::string> services;
};
const std::vector<ServiceFailure> &ServiceFailures();

// Names a parameterised test after its row's `name`.
struct NameOfRow {
    template <typename Row>
    std::string operator()(const ::testing::TestParamInfo<Row> &row) const {
        return row.param.name;
    }
};

class IndexMgrTest : public LibraryTest {
  protected:
    void SetUp() override;

    // folder.conf with a setting for each path.
    static void PutFolders(const std::vector<std::string> &paths);

    // The paths that folder.conf holds.
    static std::vector<std::string> StoredPaths();

    // The trace begins here; the settings files and the queues are watched.
    static void Watch();

    // The effects without those that accompany others: log lines and metadata directories.
    static std::vector<std::string> Steps();

    // The operation fails as the row says; of its steps only the first are done.
    void ExpectFailure(const FailingStep &row, const std::function<bool()> &operation,
                       std::vector<std::string> allSteps = {});

    // The operation, which removes the last folder, "/photos/a", succeeds although the service
    // cannot be stopped; it does these steps after those for the services.
    void ExpectSuccess(const ServiceFailure &row, const std::function<bool()> &operation,
                       const std::vector<std::string> &laterSteps = {});

    // From now on notes of every such call whether the lock on the folder settings is held; of
    // writes only those to the queue of photos count.
    void WatchLockAt(const std::vector<std::string> &platformFunctions,
                     const std::vector<Call> &calls);
    std::vector<std::string> held; // "MonitorQueue::Upsert", "rename" ...
    std::vector<std::string> unheld;

    // The platform's last error, as failed platform calls are logged with it:
    // "err=[0x00AB service.c:77]".
    void SetPlatformError();
};

} // namespace VANO::TESTS

#endif
