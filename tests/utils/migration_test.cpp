#include <fileindex/index_mgr.h>
#include <fileindex/migration.h>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

const Json::Value kNoData;

const std::vector<std::string> kStored = {"/photos/a", "/photos/b", "/video/c"};

// What a successful migration of kStored does.
std::vector<std::string> AllSteps() {
    return {kStarted,
            kSpotlightOn,
            Watched(kPhotos, {"/volume1/photos/a", "/volume1/photos/b"}),
            Watched(kVideo, {"/volume1/video/c"}),
            Changed(QueueOf(kPhotos)),
            Changed(QueueOf(kPhotos)),
            Changed(QueueOf(kVideo))};
}

class MigrationTest : public IndexMgrTest {
  protected:
    void SetUp() override {
        IndexMgrTest::SetUp();
        PutFolders(kStored);
        SetPlatformError();
    }
};

TEST_F(MigrationTest, EveryFolderIsWatchedAndQueuedInOrder) {
    Watch();
    EXPECT_TRUE(Updater_zem60_beta2());
    EXPECT_THAT(Steps(), ElementsAreArray(AllSteps()));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kReindexEvent, "/volume1/photos/a", kNoData),
                            Event(kReindexEvent, "/volume1/photos/b", kNoData)));
    EXPECT_THAT(EventsIn(QueueOf(kVideo)),
                ElementsAre(Event(kReindexEvent, "/volume1/video/c", kNoData)));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(MigrationTest, SharesAndFoldersGoInByteOrder) {
    platform.AddShare("Zoo", "/volume1/Zoo");
    PutFile(QueueOf("/volume1/Zoo"), "");
    PutFile(kFolderFile, R"({"/video/c":{},"xphotos/a":{},"/Zoo":{},"/photos/b":{}})");
    platform.AnswerAlways("VANOShareNamePathGet", -1); // each event takes the other road
    Watch();
    EXPECT_FALSE(Updater_zem60_beta2());
    EXPECT_THAT(Steps(),
                ElementsAre(kStarted, kSpotlightOn, Watched("/volume1/Zoo", {"/volume1/Zoo"}),
                            Watched(kPhotos, {"/volume1/photos/b", "/volume1xphotos/a"}),
                            Watched(kVideo, {"/volume1/video/c"}), Changed(kStatusFile)));
    ExpectLog({"utils:472 VANOShareNamePathGet failed, path=/volume1/Zoo",
               "index_mgr:* AddCustomEvent failed, path=/Zoo", "utils:678 Reindex failed"});
}

TEST_F(MigrationTest, NoSettingIsChangedAndNoLockTaken) {
    PutFile(kStatusFile, R"({"resume_time":0,"need_reindex":{"photos":true}})");
    const std::string settings = ReadText(kFolderFile);
    const std::string status = ReadText(kStatusFile);
    const HoldLock folderLock(kFolderLock);
    const HoldLock statusLock(kStatusLock);
    EXPECT_TRUE(Updater_zem60_beta2());
    EXPECT_EQ(ReadText(kFolderFile), settings);
    EXPECT_EQ(ReadText(kStatusFile), status);
}

TEST_F(MigrationTest, NoMarkIsKeptThatItHasRun) {
    EXPECT_TRUE(Updater_zem60_beta2());
    for (const char *directory : {kPhotos, kVideo}) {
        PutFile(QueueOf(directory), ""); // the daemon has worked them off
    }
    Watch();
    EXPECT_TRUE(Updater_zem60_beta2());
    EXPECT_THAT(Steps(), ElementsAreArray(AllSteps()));
    EXPECT_FALSE(Exists(kStatusFile));
}

TEST_F(MigrationTest, SpotlightIsSwitchedOnUnaskedAndWithoutARestart) {
    platform.spotlight = true;
    EXPECT_TRUE(Updater_zem60_beta2());
    EXPECT_EQ(platform.Calls("VANOSMBSetSpotlight"), 1U);
    EXPECT_EQ(platform.Calls("VANOSMBIsEnableSpotlight"), 0U);
    EXPECT_EQ(platform.Calls("VLIBServiceRestart"), 0U);
}

TEST_F(MigrationTest, WithoutFoldersTheServiceIsStoppedAndNothingElse) {
    for (const bool there : {true, false}) {
        PutFile(kFolderFile, "{}");
        if (!there) {
            RemoveTree(kFolderFile);
        }
        Watch();
        EXPECT_TRUE(Updater_zem60_beta2());
        EXPECT_THAT(Effects(), ElementsAre(kStopped));
    }
}

TEST_F(MigrationTest, AServiceThatDoesNotStopIsReportedAsOneThatDidNotStart) {
    RemoveTree(kFolderFile);
    platform.Answer("VLIBServiceStop", {-1});
    EXPECT_FALSE(Updater_zem60_beta2());
    ExpectLog({"utils:641 VLIBServiceStart failed: err=[0x00AB service.c:77]"});
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_EQ(platform.Calls("VANOSMBSetSpotlight"), 0U);
}

TEST_F(MigrationTest, OnlyNegativeAnswersAreFailures) {
    platform.AnswerAlways("VLIBServiceStart", 1);
    platform.AnswerAlways("VLIBServiceStop", 1);
    platform.AnswerAlways("VANOSMBSetSpotlight", 1);
    EXPECT_TRUE(Updater_zem60_beta2());
    RemoveTree(kFolderFile);
    EXPECT_TRUE(Updater_zem60_beta2());
}

TEST_F(MigrationTest, AFolderWithoutAShareEndsItBeforeTheMonitor) {
    PutFolders({"", "/photos/a"});
    Watch();
    EXPECT_FALSE(Updater_zem60_beta2());
    ExpectLog({"utils:389 GetShareNameByPath failed, path=",
               "utils:661 GetShareNameByPath failed, path="});
    EXPECT_THAT(Steps(), ElementsAre(kStarted, kSpotlightOn));
}

TEST_F(MigrationTest, AShareThatIsGoneEndsItAtItsMonitor) {
    PutFolders({"/gone/x", "/photos/a"});
    Watch();
    EXPECT_FALSE(Updater_zem60_beta2());
    ExpectLog({"utils:772 VANOShareGet failed, name=gone, code=171",
               "index_mgr:* FILEIDXQueuePathGet failed, share=gone",
               "utils:671 UpsertVANotifydCfg failed, share=gone"});
    EXPECT_THAT(Steps(), ElementsAre(kStarted, kSpotlightOn));
}

TEST_F(MigrationTest, SharesOutOfSpaceAreRevivedByTheReindex) {
    PutFile(kStatusFile, R"({"no_space":{"video":true}})");
    DaemonPeer daemon;
    EXPECT_TRUE(Updater_zem60_beta2());
    EXPECT_THAT(daemon.Commands(),
                ElementsAre(R"({"data":{"share_name":"video"},"type":"revive_share_worker"})"));
}

// --- each step failing in turn ------------------------------------------------------------------

struct FailingStep {
    const char *name;
    void (*arrange)(FakePlatform &platform);
    std::size_t steps; // how many of AllSteps() happen
    std::vector<std::string> log;
    _tag_fileindex_err_ error;
};

class MigrationFailureTest : public MigrationTest,
                             public ::testing::WithParamInterface<FailingStep> {};

TEST_P(MigrationFailureTest, EndsItAndLeavesWhatWasDone) {
    GetParam().arrange(platform);
    Watch();
    EXPECT_FALSE(Updater_zem60_beta2());
    ExpectLog(GetParam().log);
    ExpectError(GetParam().error);
    std::vector<std::string> expected = AllSteps();
    expected.resize(GetParam().steps);
    EXPECT_THAT(Steps(), ElementsAreArray(expected));
}

INSTANTIATE_TEST_SUITE_P(
    Rows, MigrationFailureTest,
    ::testing::Values(
        FailingStep{"SettingsNoJson",
                    [](FakePlatform &) { PutFile(kFolderFile, "{"); },
                    0,
                    {"config:22 Failed to load json from /usr/vano/etc/fileindex/folder.conf"},
                    FILEINDEX_ERR_LOAD},
        FailingStep{"SettingsOfAnotherShape",
                    [](FakePlatform &) { PutFile(kFolderFile, "[]"); },
                    0,
                    {"folders:80 Malformed folders: []"},
                    FILEINDEX_ERR_MALFORMED},
        FailingStep{"ServiceDoesNotStart",
                    [](FakePlatform &platform) { platform.Answer("VLIBServiceStart", {-1}); },
                    1,
                    {"utils:650 VLIBServiceStart failed: err=[0x00AB service.c:77]"},
                    FILEINDEX_ERR_NONE},
        FailingStep{"SpotlightStaysOff",
                    [](FakePlatform &platform) { platform.Answer("VANOSMBSetSpotlight", {-1}); },
                    2,
                    {"utils:654 VANOSMBSetSpotlight failed: err=[0x00AB service.c:77]"},
                    FILEINDEX_ERR_NONE},
        FailingStep{"MonitorRefusesTheFirstShare",
                    [](FakePlatform &platform) { platform.Answer("MonitorQueue::Upsert", {0}); },
                    3,
                    {"index_mgr:* MonitorQueue::Add failed",
                     "utils:671 UpsertVANotifydCfg failed, share=photos"},
                    FILEINDEX_ERR_NONE},
        FailingStep{"MonitorRefusesTheSecondShare",
                    [](FakePlatform &platform) {
                        platform.Answer("MonitorQueue::Upsert", {1, 0});
                    },
                    4,
                    {"index_mgr:* MonitorQueue::Add failed",
                     "utils:671 UpsertVANotifydCfg failed, share=video"},
                    FILEINDEX_ERR_NONE},
        FailingStep{"ShareGoneBeforeItsEvent",
                    [](FakePlatform &platform) {
                        platform.On("MonitorQueue::Upsert", [](const std::string &entry) {
                            if (entry.find("video") != std::string::npos) {
                                FakePlatform::Get().RemoveShare("video");
                            }
                            return std::nullopt;
                        });
                    },
                    6,
                    {"index_mgr:* GetFullPath failed, path=/video/c", "utils:678 Reindex failed"},
                    FILEINDEX_ERR_PATH}),
    NameOfRow());

} // namespace

} // namespace VANO::TESTS
