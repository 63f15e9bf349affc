#include <fileindex/index_mgr.h>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

using namespace std::string_literals;

class ChangeMonitorTest : public IndexMgrTest {};

TEST_F(ChangeMonitorTest, EveryFolderOfTheShareIsWatchedInTheOrderOfTheSettings) {
    platform.AddShare("photos2", "/volume1/photos2");
    PutFolders({"/photos/c", "/photos/B", "/photos/a", "/photos2/x", "/video/y"});
    Watch();
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("photos"));
    EXPECT_THAT(Effects(), ElementsAre(Made(kPhotos),
                                       Watched(kPhotos, {"/volume1/photos/B", "/volume1/photos/a",
                                                         "/volume1/photos/c"})));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ChangeMonitorTest, TheDescriptionHasExactlyTheAgreedMembers) {
    PutFolders({"/music/a", "/music/b"});
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("music"));
    ASSERT_EQ(platform.monitorCalls.size(), 1U);
    const MonitorCall &call = platform.monitorCalls[0];
    EXPECT_EQ(call.operation, "Upsert");
    EXPECT_EQ(call.consumer, "fileindex");
    EXPECT_EQ(call.type, 1);
    EXPECT_EQ(call.description, Json(R"({
        "queue": "/volume2/music/@eaDir/VANO@file_index_queue",
        "config": [
            {"path": "/volume2/music/a", "mask": 65486, "ignore": ["@eaDir"]},
            {"path": "/volume2/music/b", "mask": 65486, "ignore": ["@eaDir"]}
        ]})"));
}

TEST_F(ChangeMonitorTest, AShareWithoutFoldersIsWatchedNowhere) {
    PutFolders({"/video/y"});
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("photos"));
    ASSERT_EQ(platform.monitorCalls.size(), 1U);
    EXPECT_EQ(platform.monitorCalls[0].description,
              Json(R"({"queue":"/volume1/photos/@eaDir/VANO@file_index_queue","config":[]})"));
    RemoveTree(kFolderFile);
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("photos"));
    ASSERT_EQ(platform.monitorCalls.size(), 2U);
    EXPECT_TRUE(platform.monitorCalls[1].description["config"].isArray());
    platform.Answer("MonitorQueue::Upsert", {0});
    EXPECT_FALSE(IndexMgr::UpsertVANotifydCfg("photos"));
    ExpectLog({"index_mgr:* MonitorQueue::Add failed"});
}

TEST_F(ChangeMonitorTest, ARefusedConfigurationIsAnError) {
    PutFolders({"/photos/a"});
    platform.Answer("MonitorQueue::Upsert", {0});
    Watch();
    EXPECT_FALSE(IndexMgr::UpsertVANotifydCfg("photos"));
    ExpectLog({"index_mgr:* MonitorQueue::Add failed"});
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_THAT(Steps(), ElementsAre(Watched(kPhotos, {"/volume1/photos/a"}))); // tried once
}

TEST_F(ChangeMonitorTest, AnUnknownShareIsAnErrorBeforeTheSettingsAreRead) {
    PutFile(kFolderFile, "{");
    Watch();
    EXPECT_FALSE(IndexMgr::UpsertVANotifydCfg("nowhere"));
    ExpectLog({"utils:772 VANOShareGet failed, name=nowhere, code=0",
               "index_mgr:* FILEIDXQueuePathGet failed, share=nowhere"});
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(ChangeMonitorTest, SettingsThatCannotBeLoadedAreAnError) {
    PutFile(kFolderFile, "{");
    EXPECT_FALSE(IndexMgr::UpsertVANotifydCfg("photos"));
    ExpectError(FILEINDEX_ERR_LOAD);
    ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/folder.conf"});
    PutFile(kFolderFile, "[]");
    EXPECT_FALSE(IndexMgr::UpsertVANotifydCfg("photos"));
    ExpectError(FILEINDEX_ERR_MALFORMED);
    ExpectLog({"folders:80 Malformed folders: []"});
    EXPECT_THAT(platform.monitorCalls, IsEmpty());
}

TEST_F(ChangeMonitorTest, OneFolderWithoutAFullPathKeepsTheFormerConfiguration) {
    PutFolders({"/photos/a", "/photos/b", "/photos/c"});
    // The share is there for its queue and while the settings are loaded.
    int lookups = 0;
    platform.On("VANOShareGet", [&](const std::string &) -> std::optional<int> {
        return ++lookups > 5 ? std::optional<int>(-1) : std::nullopt;
    });
    Watch();
    EXPECT_FALSE(IndexMgr::UpsertVANotifydCfg("photos"));
    ExpectLog({"index_mgr:* GetFullPath failed, path=/photos/b"});
    ExpectError(FILEINDEX_ERR_PATH);
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(ChangeMonitorTest, NoLockIsTaken) {
    PutFolders({"/photos/a"});
    Fault::Count(Call::Flock);
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("photos"));
    EXPECT_TRUE(IndexMgr::DeleteVANotifydCfg("photos"));
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
    const HoldLock lock(kFolderLock);
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("photos"));
    EXPECT_TRUE(IndexMgr::DeleteVANotifydCfg("photos"));
}

TEST_F(ChangeMonitorTest, FoldersBelowEachOtherAreAllWatched) {
    PutFolders({"/photos", "/photos/a", "/photos/a/b"});
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("photos"));
    ASSERT_EQ(platform.monitorCalls.size(), 1U);
    EXPECT_EQ(platform.monitorCalls[0].description["config"].size(), 3U);
}

TEST_F(ChangeMonitorTest, NamesAreBytes) {
    for (const char *share : {"my share", "100% %s%n", "\xff\xfe", "a\"b\\c"}) {
        SCOPED_TRACE(share);
        const std::string directory = "/volume1/"s + share;
        platform.AddShare(share, directory);
        const std::string path = "/"s + share + "/caf\xe9 %d\n" + std::string(5000, 'x');
        PutFolders({path});
        Watch();
        EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg(share));
        EXPECT_TRUE(IndexMgr::DeleteVANotifydCfg(share));
        EXPECT_THAT(Steps(),
                    ElementsAre(Watched(directory, {"/volume1" + path}), Unwatched(directory)));
    }
}

TEST_F(ChangeMonitorTest, AShareMayLieDeep) {
    std::string directory = "/volume1";
    for (int depth = 0; depth < 15; ++depth) {
        directory += "/" + std::string(200, 'd');
    }
    const std::string share = directory + "/deep";
    platform.AddShare("deep", share);
    PutFolders({"/deep/a"});
    Watch();
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("deep"));
    EXPECT_TRUE(IndexMgr::DeleteVANotifydCfg("deep"));
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("deep"));
    EXPECT_THAT(Steps(), ElementsAre(Watched(share, {share + "/a"}), Unwatched(share),
                                     Removed(QueueOf(share)), Removed(TakenOf(share)),
                                     Removed(DatabaseOf(share))));
}

TEST_F(ChangeMonitorTest, DeleteNamesTheQueueAndReadsNoSettings) {
    PutFile(kFolderFile, "{");
    Watch();
    EXPECT_TRUE(IndexMgr::DeleteVANotifydCfg("music"));
    EXPECT_THAT(Effects(), ElementsAre(Made(kMusic), Unwatched(kMusic)));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ChangeMonitorTest, ARefusedDeleteIsAnError) {
    platform.Answer("MonitorQueue::Delete", {0});
    EXPECT_FALSE(IndexMgr::DeleteVANotifydCfg("music"));
    ExpectLog({"index_mgr:* MonitorQueue::Delete failed"});
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_EQ(platform.Calls("MonitorQueue::Delete"), 1U);
}

TEST_F(ChangeMonitorTest, DeleteOfAnUnknownShareIsAnError) {
    EXPECT_FALSE(IndexMgr::DeleteVANotifydCfg("nowhere"));
    ExpectLog({"utils:772 VANOShareGet failed, name=nowhere, code=0",
               "index_mgr:* FILEIDXQueuePathGet failed, share=nowhere"});
    EXPECT_THAT(platform.monitorCalls, IsEmpty());
}

TEST_F(ChangeMonitorTest, AMetadataDirectoryThatCannotBeMadeIsLoggedOnly) {
    SetPlatformError();
    platform.AnswerAlways("VANOEAMKDir", -1);
    EXPECT_TRUE(IndexMgr::UpsertVANotifydCfg("photos"));
    EXPECT_TRUE(IndexMgr::DeleteVANotifydCfg("photos"));
    const char *line = "utils:779 VANOEAMKDir failed, path=/volume1/photos/@eaDir, code=171";
    ExpectLog({line, line});
}

} // namespace

} // namespace VANO::TESTS
