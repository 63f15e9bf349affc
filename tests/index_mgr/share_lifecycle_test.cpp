#include <fileindex/index_mgr.h>

#include <stdexcept>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

using namespace std::string_literals;

// --- ShareRemove --------------------------------------------------------------------------------

class ShareRemoveTest : public IndexMgrTest {};

TEST_F(ShareRemoveTest, TheSharesSettingsGoAndNobodyElseIsTold) {
    platform.AddShare("photos2", "/volume1/photos2");
    platform.AddShare("Photos", "/volume2/Photos");
    PutFolders({"/photos", "/photos/a", "/photos2/b", "/video/c", "/Photos/d"});
    PutFile(QueueOf(kPhotos), "kept\n");
    platform.spotlight = true;
    const DaemonPeer daemon;
    Watch();
    Fault::Record(Call::Flock);
    EXPECT_TRUE(IndexMgr::ShareRemove("photos"));
    EXPECT_THAT(Effects(),
                ElementsAre(Locked(kFolderLock), Changed(kFolderFile), Unlocked(kFolderLock)));
    EXPECT_THAT(StoredPaths(), ElementsAre("/Photos/d", "/photos2/b", "/video/c"));
    EXPECT_EQ(ReadText(QueueOf(kPhotos)), "kept\n");
    EXPECT_TRUE(platform.spotlight);
}

TEST_F(ShareRemoveTest, AShareWithoutFoldersIsSavedUnchanged) {
    PutFolders({"/photos/a"});
    const DaemonPeer daemon;
    Watch();
    Fault::Count(Call::Rename);
    EXPECT_TRUE(IndexMgr::ShareRemove("video"));
    EXPECT_EQ(Fault::Calls(Call::Rename), 1U);
    EXPECT_THAT(StoredPaths(), ElementsAre("/photos/a"));
    EXPECT_EQ(platform.Calls("VLIBServiceStop"), 0U);
    EXPECT_EQ(platform.Calls("VANOSMBIsEnableSpotlight"), 0U);
    EXPECT_THAT(platform.monitorCalls, IsEmpty());
}

TEST_F(ShareRemoveTest, TheLastIndexedShareStopsTheServices) {
    PutFolders({"/photos/a", "/photos/b"});
    platform.spotlight = true;
    const DaemonPeer daemon;
    Watch();
    Fault::Record(Call::Flock);
    EXPECT_TRUE(IndexMgr::ShareRemove("photos"));
    EXPECT_THAT(Effects(), ElementsAre(Locked(kFolderLock), Changed(kFolderFile), kStopped,
                                       kSpotlightOff, kRestarted, Unlocked(kFolderLock)));
    EXPECT_EQ(ReadJson(kFolderFile), Json("{}"));
}

TEST_F(ShareRemoveTest, SpotlightThatIsOffIsLeftAlone) {
    PutFolders({"/photos/a"});
    Watch();
    EXPECT_TRUE(IndexMgr::ShareRemove("photos"));
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), kStopped));
}

TEST_F(ShareRemoveTest, WithoutAnySettingsTheServiceIsStoppedAllTheSame) {
    Watch();
    EXPECT_TRUE(IndexMgr::ShareRemove("photos"));
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), kStopped));
    EXPECT_EQ(ReadJson(kFolderFile), Json("{}"));
}

TEST_F(ShareRemoveTest, AShareThatIsAlreadyGoneCanBeRemoved) {
    PutFolders({"/gone/a", "/gone/b", "/photos/c"});
    Watch();
    EXPECT_TRUE(IndexMgr::ShareRemove("gone"));
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile)));
    EXPECT_THAT(StoredPaths(), ElementsAre("/photos/c"));
}

TEST_F(ShareRemoveTest, TheEmptyNameStandsForEveryShare) {
    PutFolders({"/photos/a", "/video/b"});
    Watch();
    EXPECT_TRUE(IndexMgr::ShareRemove(""));
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), kStopped));
    EXPECT_EQ(ReadJson(kFolderFile), Json("{}"));
}

class ShareRemoveServiceTest : public ShareRemoveTest,
                               public ::testing::WithParamInterface<ServiceFailure> {};

TEST_P(ShareRemoveServiceTest, AFailureIsLoggedOnly) {
    ExpectSuccess(GetParam(), [] { return IndexMgr::ShareRemove("photos"); });
}

INSTANTIATE_TEST_SUITE_P(Rows, ShareRemoveServiceTest, ::testing::ValuesIn(ServiceFailures()),
                         NameOfRow());

TEST_F(ShareRemoveTest, TheLockIsHeldWhileTheServicesAreStopped) {
    PutFolders({"/photos/a"});
    platform.spotlight = true;
    WatchLockAt({"VLIBServiceStop", "VANOSMBSetSpotlight", "VLIBServiceRestart"}, {});
    EXPECT_TRUE(IndexMgr::ShareRemove("photos"));
    EXPECT_THAT(held, ElementsAre("VLIBServiceStop", "VANOSMBSetSpotlight", "VLIBServiceRestart"));
    EXPECT_THAT(unheld, IsEmpty());
}

// --- ShareRename --------------------------------------------------------------------------------

class ShareRenameTest : public IndexMgrTest {
  protected:
    void SetUp() override {
        IndexMgrTest::SetUp();
        platform.AddShare("photo", "/volume1/photo");
        platform.AddShare("pictures", "/volume1/pictures");
    }
};

TEST_F(ShareRenameTest, EverySettingMovesWithItsFields) {
    platform.AddShare("photo2", "/volume1/photo2");
    PutFile(kFolderFile, R"({"/photo":{"name":"All","document":true,"video":true},
                             "/photo/a/b":{"name":"B","audio":true,"photo":true},
                             "/photo2/x":{"name":"X"},"/video/photo":{"name":"V"}})");
    platform.spotlight = true;
    const DaemonPeer daemon;
    Watch();
    Fault::Record(Call::Flock);
    EXPECT_TRUE(IndexMgr::ShareRename("photo", "pictures"));
    EXPECT_THAT(Effects(),
                ElementsAre(Locked(kFolderLock), Changed(kFolderFile), Unlocked(kFolderLock)));
    const Json::Value stored = ReadJson(kFolderFile);
    EXPECT_THAT(StoredPaths(),
                ElementsAre("/photo2/x", "/pictures", "/pictures/a/b", "/video/photo"));
    EXPECT_EQ(stored["/pictures"], Json(R"({"path":"/pictures","name":"All","document":true,
                                            "audio":false,"video":true,"photo":false})"));
    EXPECT_EQ(stored["/pictures/a/b"],
              Json(R"({"path":"/pictures/a/b","name":"B","document":false,"audio":true,
                       "video":false,"photo":true})"));
    EXPECT_EQ(stored["/video/photo"]["name"], "V");
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ShareRenameTest, AShareWithoutFoldersIsSavedUnchanged) {
    PutFolders({"/video/a"});
    Fault::Count(Call::Rename);
    EXPECT_TRUE(IndexMgr::ShareRename("photo", "pictures"));
    EXPECT_EQ(Fault::Calls(Call::Rename), 1U);
    EXPECT_THAT(StoredPaths(), ElementsAre("/video/a"));
}

TEST_F(ShareRenameTest, TheOldNameNeedNotBeKnownAnyMore) {
    PutFolders({"/photo/a", "/photo/b"});
    platform.RemoveShare("photo");
    EXPECT_TRUE(IndexMgr::ShareRename("photo", "pictures"));
    // The second folder was compared with while it had its old name.
    ExpectLog({"folder:16 Failed to get full path from /photo/b"});
    EXPECT_THAT(StoredPaths(), ElementsAre("/pictures/a", "/pictures/b"));
}

TEST_F(ShareRenameTest, ASettingAtTheNewPathIsReplaced) {
    PutFile(kFolderFile, R"({"/photo/a":{"name":"moved","photo":true},
                             "/pictures/a":{"name":"old","audio":true}})");
    EXPECT_TRUE(IndexMgr::ShareRename("photo", "pictures"));
    EXPECT_EQ(ReadJson(kFolderFile),
              Json(R"({"/pictures/a":{"path":"/pictures/a","name":"moved","document":false,
                       "audio":false,"video":false,"photo":true}})"));
}

TEST_F(ShareRenameTest, ARenameToItselfKeepsTheSettings) {
    PutFolders({"/photo/a", "/photo/b"});
    const Json::Value before = ReadJson(kFolderFile);
    EXPECT_TRUE(IndexMgr::ShareRename("photo", "photo"));
    EXPECT_EQ(ReadJson(kFolderFile), before);
}

TEST_F(ShareRenameTest, TheFirstByteOfAStoredPathIsDroppedWhateverItIs) {
    PutFolders({"xphoto/a"});
    EXPECT_TRUE(IndexMgr::ShareRename("photo", "pictures"));
    EXPECT_THAT(StoredPaths(), ElementsAre("/pictures/a"));
}

TEST_F(ShareRenameTest, NamesAreBytes) {
    for (const char *share : {"my share", "100% %s%n", "\xff\xfe", "a\"b\\c"}) {
        SCOPED_TRACE(share);
        platform.AddShare(share, "/volume1/"s + share);
        const std::string rest = "/caf\xe9 %d\n" + std::string(5000, 'x');
        PutFolders({"/photo" + rest});
        EXPECT_TRUE(IndexMgr::ShareRename("photo", share));
        EXPECT_THAT(StoredPaths(), ElementsAre("/"s + share + rest));
        EXPECT_TRUE(IndexMgr::ShareRename(share, "photo"));
        EXPECT_THAT(StoredPaths(), ElementsAre("/photo" + rest));
    }
}

TEST_F(ShareRenameTest, ANewNameThatIsNoShareFailsAndLeavesTheFile) {
    PutFolders({"/photo/a", "/photo/b"});
    Watch();
    EXPECT_FALSE(IndexMgr::ShareRename("photo", "nowhere"));
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    ExpectLog({R"(folders:129 Bad param: {"audio":false,"document":false,"name":"",)"
               R"("path":"/nowhere/a","photo":true,"video":false})"});
    EXPECT_THAT(Steps(), IsEmpty());
    EXPECT_FALSE(IsLocked(kFolderLock));
}

TEST_F(ShareRenameTest, AFailureOfALaterRecordLeavesTheFile) {
    PutFolders({"/photo/a", "/photo/b", "/video/c"});
    Watch();
    // Each record resolves its new path three times; the share vanishes after the first record.
    int found = 0;
    platform.On("VANOShareGet", [&](const std::string &entry) -> std::optional<int> {
        return entry == "VANOShareGet(pictures)" && ++found > 3 ? std::optional<int>(-1)
                                                                : std::nullopt;
    });
    EXPECT_FALSE(IndexMgr::ShareRename("photo", "pictures"));
    EXPECT_GT(found, 3);
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    ExpectLog({R"(folders:129 Bad param: {"audio":false,"document":false,"name":"",)"
               R"("path":"/pictures/b","photo":true,"video":false})"});
    EXPECT_THAT(Steps(), IsEmpty());
}

// --- what both have in common -------------------------------------------------------------------

bool Remove() {
    return IndexMgr::ShareRemove("photos");
}
bool Rename() {
    return IndexMgr::ShareRename("photos", "video");
}

class ShareSettingsTest : public IndexMgrTest, public ::testing::WithParamInterface<bool (*)()> {};

TEST_P(ShareSettingsTest, AFailureBeforeAnyStepIsAnError) {
    for (const FailingStep &row : FailuresBeforeAnyStep()) {
        SCOPED_TRACE(row.name);
        PutFolders({"/photos/a"});
        ExpectFailure(row, GetParam());
    }
}

TEST_P(ShareSettingsTest, TheLockIsHeldWhileTheSettingsAreReadAndWritten) {
    PutFolders({"/photos/a"});
    WatchLockAt({"VANOShareGet"}, {Call::Rename});
    EXPECT_TRUE(GetParam()());
    EXPECT_GE(held.size(), 3U);
    EXPECT_THAT(unheld, IsEmpty());
}

TEST_P(ShareSettingsTest, AnExceptionReleasesTheLock) {
    PutFolders({"/photos/a"});
    platform.On("VANOShareGet", [](const std::string &) -> std::optional<int> {
        throw std::runtime_error("the platform fails");
    });
    EXPECT_THROW((void)GetParam()(), std::runtime_error);
    EXPECT_FALSE(IsLocked(kFolderLock));
}

INSTANTIATE_TEST_SUITE_P(Operations, ShareSettingsTest, ::testing::Values(&Remove, &Rename));

// --- SharePause and ShareResume -----------------------------------------------------------------

class SharePauseTest : public IndexMgrTest {
  protected:
    void SetUp() override {
        IndexMgrTest::SetUp();
        PutFolders({"/photos/a", "/video/b"});
        PutFile(kStatusFile, R"({"no_space":{"photos":true}})");
    }

    const std::string stopped_ = Told("delete_share_worker", "share_name", "photos");
    const std::string revived_ = Told("revive_share_worker", "share_name", "photos");
};

TEST_F(SharePauseTest, PauseTellsTheDaemonBeforeTheMonitor) {
    const DaemonPeer daemon;
    const HoldLock settings(kFolderLock);
    const HoldLock status(kStatusLock);
    Watch();
    EXPECT_TRUE(IndexMgr::SharePause("photos"));
    EXPECT_THAT(Effects(), ElementsAre(stopped_, Made(kPhotos), Unwatched(kPhotos)));
}

TEST_F(SharePauseTest, ResumeTellsTheMonitorBeforeTheDaemon) {
    const DaemonPeer daemon;
    const HoldLock settings(kFolderLock);
    const HoldLock status(kStatusLock);
    Watch();
    EXPECT_TRUE(IndexMgr::ShareResume("photos"));
    EXPECT_THAT(Effects(),
                ElementsAre(Made(kPhotos), Watched(kPhotos, {"/volume1/photos/a"}), revived_));
}

TEST_F(SharePauseTest, PauseWithoutADaemonLeavesTheMonitor) {
    Watch();
    EXPECT_FALSE(IndexMgr::SharePause("photos"));
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_THAT(Effects(), IsEmpty());
}

TEST_F(SharePauseTest, ResumeWithoutADaemonHasConfiguredTheMonitor) {
    Watch();
    EXPECT_FALSE(IndexMgr::ShareResume("photos"));
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_THAT(Steps(), ElementsAre(Watched(kPhotos, {"/volume1/photos/a"})));
}

TEST_F(SharePauseTest, PauseFailsWhenTheMonitorRefuses) {
    platform.Answer("MonitorQueue::Delete", {0});
    const DaemonPeer daemon;
    Watch();
    EXPECT_FALSE(IndexMgr::SharePause("photos"));
    ExpectLog({"index_mgr:* MonitorQueue::Delete failed",
               "index_mgr:* DeleteVANotifydCfg failed, share=photos"});
    EXPECT_THAT(Steps(), ElementsAre(stopped_, Unwatched(kPhotos)));
}

TEST_F(SharePauseTest, ResumeFailsWhenTheMonitorRefusesAndTheDaemonIsNotTold) {
    platform.Answer("MonitorQueue::Upsert", {0});
    const DaemonPeer daemon;
    Watch();
    EXPECT_FALSE(IndexMgr::ShareResume("photos"));
    ExpectLog({"index_mgr:* MonitorQueue::Add failed",
               "index_mgr:* UpsertVANotifydCfg failed, share=photos"});
    EXPECT_THAT(Steps(), ElementsAre(Watched(kPhotos, {"/volume1/photos/a"})));
}

TEST_F(SharePauseTest, AnUnknownShareIsPausedAtTheDaemonOnly) {
    DaemonPeer daemon;
    Watch();
    EXPECT_FALSE(IndexMgr::SharePause("100% %s"));
    ExpectLog({"utils:772 VANOShareGet failed, name=100% %s, code=0",
               "index_mgr:* FILEIDXQueuePathGet failed, share=100% %s",
               "index_mgr:* DeleteVANotifydCfg failed, share=100% %s"});
    EXPECT_THAT(Steps(), ElementsAre(Told("delete_share_worker", "share_name", "100% %s")));
    EXPECT_FALSE(IndexMgr::ShareResume("nowhere"));
    ExpectLog({"utils:772 VANOShareGet failed, name=nowhere, code=0",
               "index_mgr:* FILEIDXQueuePathGet failed, share=nowhere",
               "index_mgr:* UpsertVANotifydCfg failed, share=nowhere"});
    EXPECT_EQ(daemon.Commands().size(), 1U);
}

TEST_F(SharePauseTest, AShareWithoutFoldersIsResumedWithNothingToWatch) {
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::ShareResume("music"));
    EXPECT_THAT(Steps(), ElementsAre(Watched(kMusic, {}),
                                     Told("revive_share_worker", "share_name", "music")));
}

TEST_F(SharePauseTest, ShareNamesAreBytes) {
    for (const char *share : {"my share", "\xff\xfe", "a\"b\\c"}) {
        SCOPED_TRACE(share);
        const std::string directory = "/volume1/"s + share;
        platform.AddShare(share, directory);
        const DaemonPeer daemon;
        Watch();
        EXPECT_TRUE(IndexMgr::SharePause(share));
        EXPECT_TRUE(IndexMgr::ShareResume(share));
        EXPECT_THAT(Steps(), ElementsAre(Told("delete_share_worker", "share_name", share),
                                         Unwatched(directory), Watched(directory, {}),
                                         Told("revive_share_worker", "share_name", share)));
    }
}

// --- CleanShareIndexData ------------------------------------------------------------------------

class CleanShareIndexDataTest : public IndexMgrTest {};

TEST_F(CleanShareIndexDataTest, QueueTakenQueueAndDatabaseAreRemovedInOrder) {
    Watch();
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
    EXPECT_THAT(Effects(),
                ElementsAre(Made(kPhotos), Removed(QueueOf(kPhotos)), Removed(TakenOf(kPhotos)),
                            Made(kPhotos), Removed(DatabaseOf(kPhotos))));
}

TEST_F(CleanShareIndexDataTest, WhatDoesNotExistIsNoFailure) {
    RemoveTree(QueueOf(kPhotos));
    Watch();
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
    EXPECT_EQ(platform.Calls("VLIBCExec"), 3U);
}

TEST_F(CleanShareIndexDataTest, RemovalsThatFailAreNoFailure) {
    for (const int result : {-1, 1, 127}) {
        platform.AnswerAlways("VLIBCExec", result);
        EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
    }
    EXPECT_EQ(platform.Calls("VLIBCExec"), 9U);
}

TEST_F(CleanShareIndexDataTest, AnUnknownShareIsAnErrorAndNothingIsRemoved) {
    Watch();
    EXPECT_FALSE(IndexMgr::CleanShareIndexData("nowhere"));
    ExpectLog({"utils:772 VANOShareGet failed, name=nowhere, code=0",
               "index_mgr:* FILEIDXQueuePathGet failed, share=nowhere"});
    EXPECT_THAT(Steps(), IsEmpty());
}

// A directory of that many bytes, which need not exist.
std::string LongDirectory(std::size_t size) {
    std::string directory = "/volume1";
    while (directory.size() < size - 200) {
        directory += "/" + std::string(180, 'd');
    }
    return directory + "/" + std::string(size - directory.size() - 1, 'd');
}

// Cut, the location is the share itself or something in it.
TEST_F(CleanShareIndexDataTest, ALocationThatWouldBeCutIsNotRemoved) {
    const std::size_t rest = QueueOf("").size();
    for (const std::size_t size : {4096 - rest, std::size_t{4095}}) {
        platform.AddShare("deep", LongDirectory(size));
        platform.AnswerAlways("VANOEAMKDir", 0);
        Watch();
        EXPECT_FALSE(IndexMgr::CleanShareIndexData("deep"));
        ExpectLog({"index_mgr:* FILEIDXQueuePathGet failed, share=deep"});
        EXPECT_EQ(platform.Calls("VLIBCExec"), 0U);
    }
}

TEST_F(CleanShareIndexDataTest, ALocationOfTheLongestPathIsRemoved) {
    const std::string directory = LongDirectory(4095 - QueueOf("").size());
    platform.AddShare("deep", directory);
    platform.AnswerAlways("VANOEAMKDir", 0);
    Watch();
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("deep"));
    EXPECT_THAT(Steps(), Contains(Removed(QueueOf(directory))));
    (void)SystemLog::Get().Lines(); // no database can be made there
}

TEST_F(CleanShareIndexDataTest, ANameWithAZeroByteIsNoShares) {
    EXPECT_FALSE(IndexMgr::CleanShareIndexData("photos\0x"s));
    ExpectLog({"index_mgr:* FILEIDXQueuePathGet failed, share=photos"});
    EXPECT_EQ(platform.Calls("VLIBCExec"), 0U);
}

TEST_F(CleanShareIndexDataTest, AShareThatVanishesMeanwhileKeepsItsDatabase) {
    platform.Before("VLIBCExec", [&] { platform.RemoveShare("photos"); });
    Watch();
    EXPECT_FALSE(IndexMgr::CleanShareIndexData("photos"));
    ExpectLog({"utils:736 VANOShareGet failed, name=photos, code=0",
               "index_mgr:* FILEIDXDBPathGet failed, share=photos"});
    EXPECT_THAT(Steps(), ElementsAre(Removed(QueueOf(kPhotos)), Removed(TakenOf(kPhotos))));
}

TEST_F(CleanShareIndexDataTest, NoLockIsTakenAndNoSettingRead) {
    PutFile(kFolderFile, "{");
    const HoldLock settings(kFolderLock);
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
}

TEST_F(CleanShareIndexDataTest, ShareNamesAreBytes) {
    for (const char *share : {"-rf", "my share", "100% %s%n", "\xff\xfe"}) {
        SCOPED_TRACE(share);
        const std::string directory = "/volume1/"s + share;
        platform.AddShare(share, directory);
        Watch();
        EXPECT_TRUE(IndexMgr::CleanShareIndexData(share));
        EXPECT_THAT(Steps(), ElementsAre(Removed(QueueOf(directory)), Removed(TakenOf(directory)),
                                         Removed(DatabaseOf(directory))));
    }
}

} // namespace

} // namespace VANO::TESTS
