#include <fileindex/index_mgr.h>

#include <stdexcept>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

using namespace std::string_literals;

std::string Told(const std::string &path) {
    return TESTS::Told("delete_folder_setting", "folder_path", path);
}

std::vector<std::string> Dropped(const std::string &directory) {
    return {Removed(QueueOf(directory)), Removed(TakenOf(directory)),
            Removed(DatabaseOf(directory)), Unwatched(directory)};
}

std::vector<std::string> operator+(std::vector<std::string> first,
                                   const std::vector<std::string> &second) {
    first.insert(first.end(), second.begin(), second.end());
    return first;
}

// "/photos/b" remains of photos, nothing of video.
const std::vector<std::string> kStored = {"/photos/a", "/photos/b", "/video/c"};

Json::Value TwoOfThree() {
    return Paths({"/video/c", "/photos/a"});
}

// What a successful Delete of TwoOfThree() does.
std::vector<std::string> AllSteps() {
    return std::vector<std::string>{Changed(kFolderFile), Told("/video/c"), Told("/photos/a"),
                                    Changed(QueueOf(kPhotos)),
                                    Watched(kPhotos, {"/volume1/photos/b"})} +
           Dropped(kVideo);
}

class DeleteTest : public IndexMgrTest {
  protected:
    void SetUp() override {
        IndexMgrTest::SetUp();
        PutFolders(kStored);
    }
};

TEST_F(DeleteTest, EveryPartyIsToldInOrderUnderTheLock) {
    const DaemonPeer daemon;
    Watch();
    Fault::Record(Call::Flock);
    EXPECT_TRUE(IndexMgr::Delete(TwoOfThree()));
    EXPECT_THAT(Effects(),
                ElementsAre(Locked(kFolderLock), Changed(kFolderFile), Told("/video/c"),
                            Told("/photos/a"), Made(kPhotos), Locked(QueueOf(kPhotos)),
                            Changed(QueueOf(kPhotos)), Unlocked(QueueOf(kPhotos)), Made(kPhotos),
                            Watched(kPhotos, {"/volume1/photos/b"}), Made(kVideo),
                            Removed(QueueOf(kVideo)), Removed(TakenOf(kVideo)), Made(kVideo),
                            Removed(DatabaseOf(kVideo)), Made(kVideo), Unwatched(kVideo),
                            Unlocked(kFolderLock)));
    EXPECT_THAT(StoredPaths(), ElementsAre("/photos/b"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(DeleteTest, OfSeveralFoldersOnlyTheLastWritesAnEvent) {
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a", "/video/c"})));
    EXPECT_THAT(Steps(), ElementsAreArray(
                             std::vector<std::string>{Changed(kFolderFile), Told("/photos/a"),
                                                      Told("/video/c"), Changed(QueueOf(kVideo)),
                                                      Watched(kPhotos, {"/volume1/photos/b"})} +
                             Dropped(kVideo)));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)), IsEmpty());
    EXPECT_THAT(EventsIn(QueueOf(kVideo)),
                ElementsAre(Event(kSettingEvent, "/volume1/video/c", EverythingChanged())));
}

TEST_F(DeleteTest, TheEventIsThatOfTheLastPathThatResolves) {
    PutFolders({"/gone/x", "/photos/a", "/photos/b"});
    const DaemonPeer daemon;
    Watch();
    // The share that is gone can be dropped neither.
    EXPECT_FALSE(IndexMgr::Delete(Paths({"/photos/a", "/gone/x"})));
    ExpectLog({"folder:16 Failed to get full path from /gone/x",
               "folder:16 Failed to get full path from /gone/x",
               "utils:772 VANOShareGet failed, name=gone, code=0",
               "index_mgr:* FILEIDXQueuePathGet failed, share=gone",
               "index_mgr:* CleanShareIndexData failed, share=gone"});
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), Told("/photos/a"), Told("/gone/x"),
                                     Changed(QueueOf(kPhotos))));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1/photos/a", EverythingChanged())));
    EXPECT_THAT(StoredPaths(), ElementsAre("/photos/b"));
    ExpectError(FILEINDEX_ERR_PATH);
}

TEST_F(DeleteTest, WithoutAnyPathThatResolvesNoEventIsWritten) {
    PutFolders({"/gone/x", "/gone/y", "/photos/b"});
    const DaemonPeer daemon;
    Watch();
    EXPECT_FALSE(IndexMgr::Delete(Paths({"/gone/x"})));
    // "/gone/y" remains, and keeps the share in the monitor's care.
    ExpectLog({"utils:772 VANOShareGet failed, name=gone, code=0",
               "index_mgr:* FILEIDXQueuePathGet failed, share=gone",
               "index_mgr:* UpsertVANotifydCfg failed, share=gone"});
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), Told("/gone/x")));
    EXPECT_THAT(StoredPaths(), ElementsAre("/gone/y", "/photos/b"));
}

TEST_F(DeleteTest, OneOfTwoFoldersOfAShareKeepsItsIndex) {
    PutFolders({"/photos/a", "/photos/b"});
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a"})));
    EXPECT_THAT(Steps(),
                ElementsAre(Changed(kFolderFile), Told("/photos/a"), Changed(QueueOf(kPhotos)),
                            Watched(kPhotos, {"/volume1/photos/b"})));
    EXPECT_EQ(platform.Calls("VLIBCExec"), 0U);
    EXPECT_EQ(platform.Calls("VLIBServiceStop"), 0U);
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1/photos/a", EverythingChanged())));
}

TEST_F(DeleteTest, AFolderBelowAnotherIsComparedWithIt) {
    PutFile(kFolderFile, R"({"/photos":{"photo":true,"audio":true},
                             "/photos/a":{"photo":true,"video":true}})");
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a"})));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)), ElementsAre(Event(kSettingEvent, "/volume1/photos/a",
                                                              Report(false, true, true, false))));
}

TEST_F(DeleteTest, TheLastFolderStopsTheServicesAndTellsNobodyElse) {
    PutFolders({"/photos/a"});
    platform.spotlight = true;
    const DaemonPeer daemon;
    Watch();
    Fault::Record(Call::Flock);
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a"})));
    EXPECT_THAT(Effects(),
                ElementsAre(Locked(kFolderLock), Changed(kFolderFile), kStopped, kSpotlightOff,
                            kRestarted, Made(kPhotos), Removed(QueueOf(kPhotos)),
                            Removed(TakenOf(kPhotos)), Made(kPhotos), Removed(DatabaseOf(kPhotos)),
                            Made(kPhotos), Unwatched(kPhotos), Unlocked(kFolderLock)));
    EXPECT_EQ(ReadJson(kFolderFile), Json("{}"));
    EXPECT_FALSE(platform.spotlight);
}

TEST_F(DeleteTest, TheLastFolderLeavesSpotlightAloneThatIsOff) {
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Paths(kStored)));
    EXPECT_THAT(Steps(), ElementsAreArray(std::vector<std::string>{Changed(kFolderFile), kStopped} +
                                          Dropped(kPhotos) + Dropped(kVideo)));
}

TEST_F(DeleteTest, AnythingButZeroMeansSpotlightIsOn) {
    PutFolders({"/photos/a"});
    platform.Answer("VANOSMBIsEnableSpotlight", {-1});
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a"})));
    EXPECT_THAT(Steps(), ElementsAreArray(std::vector<std::string>{Changed(kFolderFile), kStopped,
                                                                   kSpotlightOff, kRestarted} +
                                          Dropped(kPhotos)));
}

TEST_F(DeleteTest, AnEmptyRequestSavesAndTellsNobody) {
    const DaemonPeer daemon;
    Watch();
    Fault::Count(Call::Rename);
    EXPECT_TRUE(IndexMgr::Delete(Json("[]")));
    EXPECT_EQ(Fault::Calls(Call::Rename), 1U);
    EXPECT_THAT(StoredPaths(), ElementsAreArray(kStored));
    EXPECT_EQ(platform.Calls("VLIBServiceStop"), 0U);
    EXPECT_THAT(platform.monitorCalls, IsEmpty());
}

TEST_F(DeleteTest, AnEmptyRequestWithoutFoldersStopsTheService) {
    RemoveTree(kFolderFile);
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Json("[]")));
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), kStopped));
}

TEST_F(DeleteTest, APathThatIsNotSetIsDeletedAsIfItWere) {
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a/below", "/music/never"})));
    EXPECT_THAT(Steps(), ElementsAreArray(
                             std::vector<std::string>{Told("/photos/a/below"), Told("/music/never"),
                                                      Changed(QueueOf(kMusic))} +
                             Dropped(kMusic) +
                             std::vector<std::string>{
                                 Watched(kPhotos, {"/volume1/photos/a", "/volume1/photos/b"})}));
    EXPECT_THAT(EventsIn(QueueOf(kMusic)),
                ElementsAre(Event(kSettingEvent, "/volume2/music/never", EverythingChanged())));
    EXPECT_THAT(StoredPaths(), ElementsAreArray(kStored));
}

TEST_F(DeleteTest, APathThatIsNotSetButGovernedHasNoChanges) {
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a/below"})));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1/photos/a/below", NothingChanged())));
}

TEST_F(DeleteTest, APathThatComesTwiceIsToldTwiceAndReportedAsItWasLast) {
    PutFolders({"/photos", "/photos/a"});
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/a", "/photos/a"})));
    EXPECT_THAT(Steps(),
                ElementsAre(Changed(kFolderFile), Told("/photos/a"), Told("/photos/a"),
                            Changed(QueueOf(kPhotos)), Watched(kPhotos, {"/volume1/photos"})));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1/photos/a", NothingChanged())));
}

TEST_F(DeleteTest, SharesGoInByteOrder) {
    platform.AddShare("Zoo", "/volume1/Zoo");
    PutFolders({"/Zoo/z", "/photos/a", "/photos/b", "/video/c"});
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/video/c", "/photos/a", "/Zoo/z"})));
    EXPECT_THAT(Steps(),
                ElementsAreArray(std::vector<std::string>{Changed(kFolderFile), Told("/video/c"),
                                                          Told("/photos/a"), Told("/Zoo/z")} +
                                 Dropped("/volume1/Zoo") +
                                 std::vector<std::string>{Watched(kPhotos, {"/volume1/photos/b"})} +
                                 Dropped(kVideo)));
}

TEST_F(DeleteTest, ASuccessLeavesTheLastErrorAsItWas) {
    const DaemonPeer daemon;
    ErrorHandler::SetError(FILEINDEX_ERR_FOLDER_LIMIT);
    EXPECT_TRUE(IndexMgr::Delete(TwoOfThree()));
    ExpectError(FILEINDEX_ERR_FOLDER_LIMIT);
}

TEST_F(DeleteTest, NamesAreBytes) {
    for (const char *share : {"my share", "100% %s%n", "\xff\xfe", "a\"b\\c"}) {
        SCOPED_TRACE(share);
        const std::string directory = "/volume1/"s + share;
        platform.AddShare(share, directory);
        PutFile(QueueOf(directory), "");
        const std::string path = "/"s + share + "/caf\xe9 %d\n" + std::string(5000, 'x');
        PutFolders({path, "/photos/b"});
        const DaemonPeer daemon;
        Watch();
        EXPECT_TRUE(IndexMgr::Delete(Paths({path})));
        EXPECT_THAT(Steps(),
                    ElementsAreArray(std::vector<std::string>{Changed(kFolderFile), Told(path)} +
                                     Dropped(directory)));
        EXPECT_THAT(EventsIn(QueueOf(directory)),
                    ElementsAre(Event(kSettingEvent, "/volume1" + path, EverythingChanged())));
        EXPECT_THAT(StoredPaths(), ElementsAre("/photos/b"));
    }
}

// --- bad requests -------------------------------------------------------------------------------

TEST_F(DeleteTest, ARequestThatIsNoArrayIsRefusedBeforeAnything) {
    const DaemonPeer daemon;
    Watch();
    Fault::Count(Call::Flock);
    for (const char *request : {R"("/photos/a")", R"({"a":"/photos/a"})", "{}", "null", "7"}) {
        SCOPED_TRACE(request);
        EXPECT_FALSE(IndexMgr::Delete(Json(request)));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        ExpectLog({"index_mgr:* Bad param: "s + request});
    }
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
    EXPECT_FALSE(Exists(kFolderLock));
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(DeleteTest, AnElementThatIsNoTextIsABadParameterAndNothingIsSaved) {
    const DaemonPeer daemon;
    for (const char *element : {"{}", R"({"path":"/photos/b"})", "[]", R"(["/photos/b"])"}) {
        SCOPED_TRACE(element);
        Json::Value request = Paths({"/photos/a"});
        request.append(Json(element));
        request.append("/photos/b");
        Watch();
        EXPECT_NO_THROW(EXPECT_FALSE(IndexMgr::Delete(request)));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        ExpectLog({"index_mgr:* Bad param: "s + element});
        EXPECT_THAT(Steps(), IsEmpty());
        EXPECT_THAT(StoredPaths(), ElementsAreArray(kStored));
    }
}

TEST_F(DeleteTest, AHoleInTheRequestIsAnElementWithoutAShare) {
    Json::Value request(Json::arrayValue);
    request[1] = "/photos/a";
    Watch();
    EXPECT_FALSE(IndexMgr::Delete(request));
    ExpectLog({"utils:389 GetShareNameByPath failed, path=",
               "index_mgr:* GetShareNameByPath failed, path="});
    EXPECT_THAT(Steps(), IsEmpty());
    EXPECT_THAT(StoredPaths(), ElementsAreArray(kStored));
}

TEST_F(DeleteTest, AnElementWithoutAShareEndsTheOperationUnsaved) {
    for (const char *element : {R"("")", "null"}) {
        SCOPED_TRACE(element);
        Json::Value request = Paths({"/photos/a"});
        request.append(Json(element));
        Watch();
        EXPECT_FALSE(IndexMgr::Delete(request));
        ExpectLog({"utils:389 GetShareNameByPath failed, path=",
                   "index_mgr:* GetShareNameByPath failed, path="});
        ExpectError(FILEINDEX_ERR_NONE);
        EXPECT_THAT(Steps(), IsEmpty());
        EXPECT_THAT(StoredPaths(), ElementsAreArray(kStored));
    }
}

TEST_F(DeleteTest, ANumberIsThePathOfItsDigits) {
    platform.AddShare("23", "/volume1/23");
    PutFolders({"123", "/photos/a"});
    const DaemonPeer daemon;
    Watch();
    // Without its "/" the path leads out of the share.
    EXPECT_FALSE(IndexMgr::Delete(Json("[123]")));
    ExpectLog({"utils:472 VANOShareNamePathGet failed, path=/volume1123",
               "index_mgr:* AddCustomEvent failed", "index_mgr:* Update failed"});
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), Told("123"), Changed(kStatusFile)));
    EXPECT_THAT(StoredPaths(), ElementsAre("/photos/a"));
}

// --- each step failing in turn ------------------------------------------------------------------

class DeleteFailureTest : public DeleteTest, public ::testing::WithParamInterface<FailingStep> {};

TEST_P(DeleteFailureTest, EndsTheOperationAndLeavesWhatWasDone) {
    ExpectFailure(
        GetParam(), [] { return IndexMgr::Delete(TwoOfThree()); }, AllSteps());
    if (GetParam().steps > 0) {
        EXPECT_THAT(StoredPaths(), ElementsAre("/photos/b"));
    }
}

INSTANTIATE_TEST_SUITE_P(First, DeleteFailureTest, ::testing::ValuesIn(FailuresBeforeAnyStep()),
                         NameOfRow());

// Once both commands have been sent.
Arrangement SettingsUnreadable() {
    return [] {
        Fault::Before(Call::Connect, [left = 2](CallInfo &) mutable {
            if (--left == 0) {
                Fault::FailPath(Call::Open, "folder.conf", EMFILE);
            }
        });
        return nullptr;
    };
}

const FailingStep kFailingSteps[] = {
    {"NoDaemon",
     NothingInTheWay(),
     1,
     {"index_mgr:* SendCammandToDaemon failed"},
     FILEINDEX_ERR_NONE,
     false},
    {"DaemonGoneAfterTheFirstCommand",
     Refused(Call::Connect, ECONNREFUSED, 2),
     2,
     {"index_mgr:* SendCammandToDaemon failed"}},
    {"PathGoneBeforeItsEvent",
     Gone("photos", Call::Connect),
     3,
     {"index_mgr:* GetFullPath failed, path=/photos/a", "index_mgr:* Update failed"},
     FILEINDEX_ERR_PATH},
    {"MonitorRefusesAShareThatRemains",
     Refused("MonitorQueue::Upsert", {0}),
     5,
     {"index_mgr:* MonitorQueue::Add failed",
      "index_mgr:* UpsertVANotifydCfg failed, share=photos"}},
    // No index is removed on the word of settings that cannot be read.
    {"SettingsUnreadableWhenTheSharesAreSettled",
     SettingsUnreadable(),
     4,
     {"config:22 Failed to load json from /usr/vano/etc/fileindex/folder.conf"},
     FILEINDEX_ERR_LOAD},
    {"ShareGoneBeforeItsIndexIsRemoved",
     Gone("video", "MonitorQueue::Upsert"),
     5,
     {"utils:772 VANOShareGet failed, name=video, code=171",
      "index_mgr:* FILEIDXQueuePathGet failed, share=video",
      "index_mgr:* CleanShareIndexData failed, share=video"}},
    {"ShareGoneWhileItsIndexIsRemoved",
     Gone("video", "VLIBCExec"),
     7,
     {"utils:736 VANOShareGet failed, name=video, code=171",
      "index_mgr:* FILEIDXDBPathGet failed, share=video",
      "index_mgr:* CleanShareIndexData failed, share=video"}},
    {"MonitorKeepsAShareThatIsDropped",
     Refused("MonitorQueue::Delete", {0}),
     9,
     {"index_mgr:* MonitorQueue::Delete failed",
      "index_mgr:* DeleteVANtifydCfg failed, share=video"}}};

INSTANTIATE_TEST_SUITE_P(Later, DeleteFailureTest, ::testing::ValuesIn(kFailingSteps), NameOfRow());

TEST_F(DeleteTest, AnEventThatCannotBeQueuedMarksTheShareAndEndsTheOperation) {
    RemoveTree(QueueOf(kPhotos));
    MakeDirs(QueueOf(kPhotos)); // no file can be opened there
    const DaemonPeer daemon;
    Watch();
    EXPECT_FALSE(IndexMgr::Delete(TwoOfThree()));
    ExpectLog({"index_mgr:* AddCustomEvent failed", "index_mgr:* Update failed"});
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), Told("/video/c"), Told("/photos/a"),
                                     Changed(kStatusFile)));
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"need_reindex":{"photos":true}})"));
}

TEST_F(DeleteTest, RemovalsThatFailAreNoFailure) {
    platform.AnswerAlways("VLIBCExec", -1);
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Delete(TwoOfThree()));
    EXPECT_THAT(Steps(), ElementsAreArray(AllSteps()));
}

// --- the services when the last folder goes ------------------------------------------------------

class DeleteServiceTest : public DeleteTest,
                          public ::testing::WithParamInterface<ServiceFailure> {};

TEST_P(DeleteServiceTest, AFailureIsLoggedOnly) {
    ExpectSuccess(
        GetParam(), [] { return IndexMgr::Delete(Paths({"/photos/a"})); }, Dropped(kPhotos));
}

INSTANTIATE_TEST_SUITE_P(Rows, DeleteServiceTest, ::testing::ValuesIn(ServiceFailures()),
                         NameOfRow());

// --- the lock -----------------------------------------------------------------------------------

TEST_F(DeleteTest, TheLockIsHeldDuringEverySideEffect) {
    WatchLockAt({"MonitorQueue::Upsert", "MonitorQueue::Delete", "VLIBCExec", "VLIBServiceStop",
                 "VANOSMBSetSpotlight", "VLIBServiceRestart"},
                {Call::Connect, Call::Write});
    platform.spotlight = true;
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Delete(TwoOfThree()));
    EXPECT_EQ(held.size(), 8U); // 2 commands, 1 event, 2 monitor calls, 3 removals
    EXPECT_TRUE(IndexMgr::Delete(Paths({"/photos/b"})));
    EXPECT_EQ(held.size(), 15U); // 3 service calls, 3 removals, 1 monitor call
    EXPECT_THAT(unheld, IsEmpty());
}

TEST_F(DeleteTest, AnExceptionReleasesTheLock) {
    for (const char *function : {"VANOShareGet", "MonitorQueue::Upsert", "MonitorQueue::Delete",
                                 "VLIBCExec", "VANOShareNamePathGet"}) {
        SCOPED_TRACE(function);
        SetUp();
        const DaemonPeer daemon;
        platform.On(function, [](const std::string &) -> std::optional<int> {
            throw std::runtime_error("the platform fails");
        });
        EXPECT_THROW((void)IndexMgr::Delete(TwoOfThree()), std::runtime_error);
        EXPECT_FALSE(IsLocked(kFolderLock));
        EXPECT_EQ(platform.LiveRecords(), 0U);
    }
}

} // namespace

} // namespace VANO::TESTS
