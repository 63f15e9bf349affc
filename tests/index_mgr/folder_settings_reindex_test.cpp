#include <fileindex/index_mgr.h>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

using namespace std::string_literals;

const Json::Value kNoData;

std::string Revived(const std::string &share) {
    return Told("revive_share_worker", "share_name", share);
}

class ReindexTest : public IndexMgrTest {
  protected:
    void SetUp() override {
        IndexMgrTest::SetUp();
        PutFolders({"/photos/a", "/photos/b", "/video/c"});
    }
};

TEST_F(ReindexTest, EachPathIsQueuedInTheOrderOfTheRequest) {
    Watch();
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/video/c", "/photos/b", "/photos/a"})));
    EXPECT_THAT(Steps(), ElementsAre(Changed(QueueOf(kVideo)), Changed(QueueOf(kPhotos)),
                                     Changed(QueueOf(kPhotos))));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kReindexEvent, "/volume1/photos/b", kNoData),
                            Event(kReindexEvent, "/volume1/photos/a", kNoData)));
    EXPECT_THAT(EventsIn(QueueOf(kVideo)),
                ElementsAre(Event(kReindexEvent, "/volume1/video/c", kNoData)));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ReindexTest, AnEmptyRequestIsDone) {
    Watch();
    EXPECT_TRUE(IndexMgr::Reindex(Json("[]")));
    EXPECT_THAT(Effects(), IsEmpty());
}

TEST_F(ReindexTest, AnyPathOfAnIndexedShareWillDo) {
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos", "/photos/never/seen", "/photos/a"})));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kReindexEvent, "/volume1/photos", kNoData),
                            Event(kReindexEvent, "/volume1/photos/never/seen", kNoData),
                            Event(kReindexEvent, "/volume1/photos/a", kNoData)));
}

TEST_F(ReindexTest, APathThatComesTwiceIsQueuedOnce) {
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a", "/photos/a"})));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kReindexEvent, "/volume1/photos/a", kNoData)));
}

TEST_F(ReindexTest, TheFolderSettingsAreNotLocked) {
    const HoldLock lock(kFolderLock);
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a"})));
    EXPECT_EQ(EventsIn(QueueOf(kPhotos)).size(), 1U);
}

TEST_F(ReindexTest, NeitherServicesNorMonitorAreTouched) {
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a"})));
    for (const char *function : {"VLIBServiceStart", "VANOSMBSetSpotlight", "VLIBServiceRestart",
                                 "MonitorQueue::Upsert"}) {
        EXPECT_EQ(platform.Calls(function), 0U) << function;
    }
}

TEST_F(ReindexTest, NamesAreBytes) {
    for (const char *share : {"my share", "100% %s%n", "\xff\xfe", "a\"b\\c"}) {
        SCOPED_TRACE(share);
        const std::string directory = "/volume1/"s + share;
        platform.AddShare(share, directory);
        const std::string path = "/"s + share + "/caf\xe9 %d\n" + std::string(5000, 'x');
        PutFolders({"/"s + share});
        EXPECT_TRUE(IndexMgr::Reindex(Paths({path})));
        EXPECT_THAT(EventsIn(QueueOf(directory)),
                    ElementsAre(Event(kReindexEvent, "/volume1" + path, kNoData)));
    }
}

// --- bad requests -------------------------------------------------------------------------------

TEST_F(ReindexTest, ARequestThatIsNoArrayIsMalformed) {
    Watch();
    for (const char *request : {R"("/photos/a")", R"({"a":"/photos/a"})", "{}", "null", "7"}) {
        SCOPED_TRACE(request);
        EXPECT_FALSE(IndexMgr::Reindex(Json(request)));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        ExpectLog({"index_mgr:* Malformed jsArrPath: "s + request});
    }
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(ReindexTest, AnElementThatIsNoStringIsMalformedAndNothingIsQueued) {
    for (const char *element : {"7", "null", "true", "[]", R"(["/photos/b"])", R"({"a":1})"}) {
        SCOPED_TRACE(element);
        Json::Value request = Paths({"/photos/a"});
        request.append(Json(element));
        Watch();
        EXPECT_NO_THROW(EXPECT_FALSE(IndexMgr::Reindex(request)));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        ExpectLog({"index_mgr:* Malformed jsArrPath: "s + element});
        EXPECT_THAT(Steps(), IsEmpty());
    }
}

TEST_F(ReindexTest, AHoleInTheRequestIsMalformed) {
    Json::Value request(Json::arrayValue);
    request[1] = "/photos/a";
    Watch();
    EXPECT_FALSE(IndexMgr::Reindex(request));
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    ExpectLog({"index_mgr:* Malformed jsArrPath: null"});
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(ReindexTest, AnEmptyPathHasNoShare) {
    Watch();
    EXPECT_FALSE(IndexMgr::Reindex(Paths({"/photos/a", ""})));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"index_mgr:* Failed to get share name from path: "});
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(ReindexTest, AShareWithoutFoldersEndsItSilently) {
    PutFile(kStatusFile, R"({"no_space":{"photos":true}})");
    const DaemonPeer daemon;
    const std::vector<std::string> paths = {"/music/x", "/nowhere", "/Photos/a", "/",
                                            "/photos\0/a"s};
    for (const std::string &path : paths) {
        SCOPED_TRACE(path);
        Watch();
        EXPECT_FALSE(IndexMgr::Reindex(Paths({"/photos/a", path, "/video/c"})));
        ExpectError(FILEINDEX_ERR_NONE);
        ExpectLog({});
        EXPECT_THAT(Effects(), IsEmpty());
    }
}

TEST_F(ReindexTest, TheFirstFaultOfTheRequestCounts) {
    EXPECT_FALSE(IndexMgr::Reindex(Json(R"(["/music/x", 7])")));
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_FALSE(IndexMgr::Reindex(Json(R"([7, "/music/x"])")));
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    ExpectLog({"index_mgr:* Malformed jsArrPath: 7"});
}

TEST_F(ReindexTest, SettingsThatCannotBeLoadedIndexNothing) {
    PutFile(kFolderFile, "{");
    EXPECT_FALSE(IndexMgr::Reindex(Paths({"/photos/a"})));
    ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/folder.conf"});
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)), IsEmpty());
}

TEST_F(ReindexTest, TheSettingsAreLoadedOnceForAllPaths) {
    Fault::Count(Call::Open);
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a", "/video/c", "/photos/b"})));
    EXPECT_THAT(Fault::Log(Call::Open), Contains(Field(&CallInfo::path, kFolderFile)).Times(1));
}

TEST_F(ReindexTest, EachPathIsAskedForWithItsMessages) {
    PutFile(kFolderFile, R"({"":{},"/photos/a":{},"/photos/b":{}})");
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a", "/photos/b"})));
    ExpectLog({"utils:389 GetShareNameByPath failed, path=",
               "index_mgr:* Failed to get share name from path: ",
               "index_mgr:* Failed to get share name from path: "});
}

// --- shares out of space ------------------------------------------------------------------------

TEST_F(ReindexTest, SharesOutOfSpaceAreRevivedFirst) {
    PutFile(kStatusFile, R"({"no_space":{"video":true,"photos":true,"music":true}})");
    const DaemonPeer daemon;
    Watch();
    Fault::Record(Call::Flock);
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/video/c", "/photos/a", "/photos/b"})));
    EXPECT_THAT(Effects(),
                ElementsAre(Locked(kStatusLock), Changed(kStatusFile), Revived("photos"),
                            Unlocked(kStatusLock), Locked(kStatusLock), Changed(kStatusFile),
                            Revived("video"), Unlocked(kStatusLock), Made(kVideo),
                            Locked(QueueOf(kVideo)), Changed(QueueOf(kVideo)),
                            Unlocked(QueueOf(kVideo)), Made(kPhotos), Locked(QueueOf(kPhotos)),
                            Changed(QueueOf(kPhotos)), Unlocked(QueueOf(kPhotos)), Made(kPhotos),
                            Locked(QueueOf(kPhotos)), Changed(QueueOf(kPhotos)),
                            Unlocked(QueueOf(kPhotos))));
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"no_space":{"music":true}})"));
}

TEST_F(ReindexTest, OtherMarksAreLeftAlone) {
    PutFile(kStatusFile, R"({"resume_time":0,"no_space":{},"need_reindex":{"photos":true}})");
    Watch();
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a"})));
    EXPECT_THAT(Steps(), ElementsAre(Changed(QueueOf(kPhotos))));
}

TEST_F(ReindexTest, AShareThatCannotBeRevivedIsLoggedAndTheNextFollows) {
    PutFile(kStatusFile, R"({"no_space":{"video":true,"photos":true}})");
    Watch(); // no daemon
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/video/c", "/photos/a"})));
    ExpectLog({"status_mgr:321 SendCammandToDaemon failed",
               "index_mgr:* ShareRevice failed, share=photos",
               "status_mgr:321 SendCammandToDaemon failed",
               "index_mgr:* ShareRevice failed, share=video"});
    EXPECT_THAT(Steps(), ElementsAre(Changed(kStatusFile), Changed(kStatusFile),
                                     Changed(QueueOf(kVideo)), Changed(QueueOf(kPhotos))));
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"no_space":{}})"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ReindexTest, AStatusThatIsLockedIsLoggedToo) {
    PutFile(kStatusFile, R"({"no_space":{"photos":true}})");
    Fault::Quiet(Call::Usleep);
    const HoldLock lock(kStatusLock);
    Watch();
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a"})));
    ExpectLeakedDescriptors(2);
    ExpectLog({"config:74 Failed to lock folder", "index_mgr:* ShareRevice failed, share=photos"});
    ExpectError(FILEINDEX_ERR_LOCK);
    EXPECT_THAT(Steps(), ElementsAre(Changed(QueueOf(kPhotos))));
}

TEST_F(ReindexTest, AStatusThatCannotBeReadMarksNoShare) {
    for (const char *status : {"[]", "7", R"({"no_space":true})", R"({"no_space":["photos"]})"}) {
        SCOPED_TRACE(status);
        PutFile(kStatusFile, status);
        PutFile(QueueOf(kPhotos), "");
        Watch();
        EXPECT_NO_THROW(EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a"}))));
        EXPECT_THAT(Steps(), ElementsAre(Changed(QueueOf(kPhotos))));
    }
    PutFile(kStatusFile, "{");
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/b"})));
    ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/status.conf"});
}

// --- queueing -----------------------------------------------------------------------------------

TEST_F(ReindexTest, APathWithoutAFullPathEndsItAfterTheEarlierEvents) {
    PutFolders({"/gone/x", "/photos/a", "/video/c"});
    Watch();
    EXPECT_FALSE(IndexMgr::Reindex(Paths({"/photos/a", "/gone/x", "/video/c"})));
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog({"index_mgr:* GetFullPath failed, path=/gone/x"});
    EXPECT_THAT(Steps(), ElementsAre(Changed(QueueOf(kPhotos))));
}

TEST_F(ReindexTest, AnEventThatCannotBeQueuedMarksTheShareAndEndsIt) {
    RemoveTree(QueueOf(kVideo));
    MakeDirs(QueueOf(kVideo)); // no file can be opened there
    Watch();
    EXPECT_FALSE(IndexMgr::Reindex(Paths({"/photos/a", "/video/c", "/photos/b"})));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"index_mgr:* AddCustomEvent failed, path=/video/c"});
    EXPECT_THAT(Steps(), ElementsAre(Changed(QueueOf(kPhotos)), Changed(kStatusFile)));
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"need_reindex":{"video":true}})"));
}

TEST_F(ReindexTest, AStatusFileOfAnotherShapeMakesTheMarkFailAndNothingThrow) {
    RemoveTree(QueueOf(kVideo));
    MakeDirs(QueueOf(kVideo));
    for (const char *status : {"[]", "7", R"({"need_reindex":5})"}) {
        SCOPED_TRACE(status);
        PutFile(kStatusFile, status);
        EXPECT_NO_THROW(EXPECT_FALSE(IndexMgr::Reindex(Paths({"/video/c"}))));
        ExpectLog({"utils:522 ShareSetNeedReindex failed, share=video",
                   "index_mgr:* AddCustomEvent failed, path=/video/c"});
    }
}

TEST_F(ReindexTest, AQueueThatStaysBusyDropsTheEvent) {
    Fault::Quiet(Call::Usleep);
    const HoldLock busy(QueueOf(kPhotos));
    Watch();
    EXPECT_TRUE(IndexMgr::Reindex(Paths({"/photos/a"})));
    EXPECT_THAT(Steps(), IsEmpty());
}

// --- Update -------------------------------------------------------------------------------------

class UpdateTest : public IndexMgrTest {};

TEST_F(UpdateTest, TheEventCarriesTheGivenData) {
    const std::vector<const char *> data = {"null", "{}", R"({"photo":true})", "[1,\"x\"]",
                                            "\"\xff\""};
    for (const char *text : data) {
        SCOPED_TRACE(text);
        PutFile(QueueOf(kPhotos), "");
        Watch();
        EXPECT_TRUE(IndexMgr::Update("/photos/any", Json(text)));
        EXPECT_THAT(Effects(), ElementsAre(Made(kPhotos), Changed(QueueOf(kPhotos))));
        EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                    ElementsAre(Event(kSettingEvent, "/volume1/photos/any", Json(text))));
    }
}

TEST_F(UpdateTest, TheFolderSettingsPlayNoPart) {
    PutFile(kFolderFile, "{");
    const HoldLock lock(kFolderLock);
    EXPECT_TRUE(IndexMgr::Update("/photos/a", kNoData));
    EXPECT_EQ(EventsIn(QueueOf(kPhotos)).size(), 1U);
}

TEST_F(UpdateTest, APathWithoutAFullPathIsAnError) {
    Watch();
    EXPECT_FALSE(IndexMgr::Update("/nowhere/a", kNoData));
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog({"index_mgr:* GetFullPath failed, path=/nowhere/a"});
    EXPECT_FALSE(IndexMgr::Update("", kNoData));
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog(
        {"utils:389 GetShareNameByPath failed, path=", "index_mgr:* GetFullPath failed, path="});
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(UpdateTest, AnEventThatCannotBeQueuedMarksTheShare) {
    RemoveTree(QueueOf(kPhotos));
    MakeDirs(QueueOf(kPhotos));
    EXPECT_FALSE(IndexMgr::Update("/photos/a", kNoData));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"index_mgr:* AddCustomEvent failed"});
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"need_reindex":{"photos":true}})"));
}

} // namespace

} // namespace VANO::TESTS
