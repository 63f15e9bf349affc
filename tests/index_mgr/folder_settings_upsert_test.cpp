#include <fileindex/folders.h>
#include <fileindex/index_mgr.h>

#include <memory>
#include <stdexcept>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

using namespace std::string_literals;

const std::string kUpsert = "upsert_folder_setting";

std::string Told(const std::string &path) {
    return TESTS::Told(kUpsert, "folder_path", path);
}

// Two new folders, the shares against the order of the array.
Json::Value TwoFolders() {
    return Json(R"([{"path":"/video/b","video":true},{"path":"/photos/a","photo":true}])");
}

// What a successful Upsert of TwoFolders() does.
std::vector<std::string> AllSteps() {
    return {Changed(kFolderFile),
            Watched(kPhotos, {"/volume1/photos/a"}),
            Watched(kVideo, {"/volume1/video/b"}),
            kStarted,
            kSpotlightOn,
            kRestarted,
            Told("/video/b"),
            Told("/photos/a"),
            Changed(QueueOf(kPhotos)),
            Changed(QueueOf(kVideo))};
}

std::vector<std::string> Numbered(int count) {
    std::vector<std::string> paths;
    for (int i = 0; i < count; ++i) {
        paths.push_back("/photos/" + std::to_string(i));
    }
    return paths;
}

class UpsertTest : public IndexMgrTest {};

TEST_F(UpsertTest, EveryPartyIsToldInOrderUnderTheLock) {
    DaemonPeer daemon;
    Watch();
    Fault::Record(Call::Flock);
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    EXPECT_THAT(Effects(),
                ElementsAre(Locked(kFolderLock), Changed(kFolderFile), Made(kPhotos),
                            Watched(kPhotos, {"/volume1/photos/a"}), Made(kVideo),
                            Watched(kVideo, {"/volume1/video/b"}), kStarted, kSpotlightOn,
                            kRestarted, Told("/video/b"), Told("/photos/a"), Made(kPhotos),
                            Locked(QueueOf(kPhotos)), Changed(QueueOf(kPhotos)),
                            Unlocked(QueueOf(kPhotos)), Made(kVideo), Locked(QueueOf(kVideo)),
                            Changed(QueueOf(kVideo)), Unlocked(QueueOf(kVideo)),
                            Unlocked(kFolderLock)));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(UpsertTest, TheSettingsAreStoredAndTheChangesQueued) {
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    Json::Value stored(Json::objectValue);
    stored["/photos/a"] = PhotoFolder("/photos/a");
    stored["/video/b"] = PhotoFolder("/video/b");
    stored["/video/b"]["photo"] = false;
    stored["/video/b"]["video"] = true;
    EXPECT_EQ(ReadJson(kFolderFile), stored);
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1/photos/a", EverythingChanged())));
    EXPECT_THAT(EventsIn(QueueOf(kVideo)),
                ElementsAre(Event(kSettingEvent, "/volume1/video/b", EverythingChanged())));
    EXPECT_FALSE(Exists(kStatusFile));
}

TEST_F(UpsertTest, AddAndSetAreUpsert) {
    using Operation = bool (*)(const Json::Value &);
    for (const Operation operation : {&IndexMgr::Add, &IndexMgr::Set}) {
        SetUp();
        const DaemonPeer daemon;
        Watch();
        EXPECT_TRUE(operation(TwoFolders()));
        EXPECT_THAT(Steps(), ElementsAreArray(AllSteps()));
        EXPECT_FALSE(operation(Json("{}")));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        ExpectLog({"index_mgr:* Bad param: {}"});
    }
}

TEST_F(UpsertTest, ARequestThatIsNoArrayIsRefusedBeforeAnything) {
    PutFolders({"/photos/a"});
    const DaemonPeer daemon;
    Watch();
    Fault::Count(Call::Flock);
    for (const char *request : {R"({"path":"/photos/b"})", R"("/photos/b")", "{}", "null", "7",
                                "true", "1.5", "\"\xff\""}) {
        SCOPED_TRACE(request);
        EXPECT_FALSE(IndexMgr::Upsert(Json(request)));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        ExpectLog({"index_mgr:* Bad param: "s + request});
    }
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
    EXPECT_FALSE(Exists(kFolderLock));
    EXPECT_THAT(Steps(), IsEmpty());
}

TEST_F(UpsertTest, AnEmptyRequestSavesAndStartsTheServicesOnly) {
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(Json("[]")));
    EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), kStarted, kSpotlightOn, kRestarted));
    EXPECT_EQ(ReadJson(kFolderFile), Json("{}"));
}

TEST_F(UpsertTest, AnEmptyRequestKeepsTheSettings) {
    PutFolders({"/photos/a", "/gone/b"});
    const Json::Value before = ReadJson(kFolderFile);
    platform.spotlight = true;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(Json("[]")));
    EXPECT_EQ(ReadJson(kFolderFile), before);
    EXPECT_THAT(platform.monitorCalls, IsEmpty());
    EXPECT_EQ(platform.Calls("VLIBServiceStart"), 1U);
}

TEST_F(UpsertTest, FieldsThatTheRequestLacksAreKept) {
    PutFile(kFolderFile, R"({"/photos/a":{"name":"Mine","document":true,"photo":true}})");
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(Json(R"([{"path":"/photos/a","photo":false,"video":true}])")));
    EXPECT_EQ(ReadJson(kFolderFile)["/photos/a"],
              Json(R"({"path":"/photos/a","name":"Mine","document":true,"audio":false,
                       "video":true,"photo":false})"));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)), ElementsAre(Event(kSettingEvent, "/volume1/photos/a",
                                                              Report(false, false, true, true))));
}

TEST_F(UpsertTest, ANewFolderIsComparedWithTheFolderThatGovernedIt) {
    PutFolders({"/photos"});
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(Json(R"([{"path":"/photos/a","photo":true,"audio":true}])")));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)), ElementsAre(Event(kSettingEvent, "/volume1/photos/a",
                                                              Report(false, true, false, false))));
}

TEST_F(UpsertTest, OfAPathThatComesTwiceTheLastReportIsQueued) {
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(Json(R"([{"path":"/photos/a","photo":true},
                                          {"path":"/video/b"},
                                          {"path":"/photos/a","photo":true,"audio":true}])")));
    EXPECT_THAT(Steps(),
                ElementsAre(Changed(kFolderFile), Watched(kPhotos, {"/volume1/photos/a"}),
                            Watched(kVideo, {"/volume1/video/b"}), kStarted, kSpotlightOn,
                            kRestarted, Told("/photos/a"), Told("/video/b"), Told("/photos/a"),
                            Changed(QueueOf(kPhotos)), Changed(QueueOf(kVideo))));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)), ElementsAre(Event(kSettingEvent, "/volume1/photos/a",
                                                              Report(false, true, false, false))));
    // The other report is its own, nothing of the first element's is left in it.
    EXPECT_THAT(EventsIn(QueueOf(kVideo)),
                ElementsAre(Event(kSettingEvent, "/volume1/video/b", EverythingChanged())));
}

TEST_F(UpsertTest, SharesAndEventsGoInByteOrderAndCommandsInThatOfTheRequest) {
    platform.AddShare("Zoo", "/volume1/Zoo");
    PutFile(QueueOf("/volume1/Zoo"), "");
    PutFolders({"/photos/c"});
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(Json(R"([{"path":"/photos/b"},{"path":"/Zoo/z"},
                                          {"path":"/photos/B"}])")));
    EXPECT_THAT(
        Steps(),
        ElementsAre(
            Changed(kFolderFile), Watched("/volume1/Zoo", {"/volume1/Zoo/z"}),
            Watched(kPhotos, {"/volume1/photos/B", "/volume1/photos/b", "/volume1/photos/c"}),
            kStarted, kSpotlightOn, kRestarted, Told("/photos/b"), Told("/Zoo/z"),
            Told("/photos/B"), Changed(QueueOf(kPhotos)), Changed(QueueOf(kPhotos))));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1/photos/B", EverythingChanged()),
                            Event(kSettingEvent, "/volume1/photos/b", EverythingChanged())));
}

TEST_F(UpsertTest, APendingReindexOfTheFolderCoversTheChange) {
    const std::string pending = R"({"event":65536,"path":"/volume1/photos/a","data":null})"
                                "\n";
    PutFile(QueueOf(kPhotos), pending);
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(Json(R"([{"path":"/photos/a"}])")));
    EXPECT_EQ(ReadText(QueueOf(kPhotos)), pending);
}

TEST_F(UpsertTest, SpotlightThatIsOnIsLeftAlone) {
    const DaemonPeer daemon;
    for (const int on : {1, 2, -1}) {
        SCOPED_TRACE(on);
        platform.AnswerAlways("VANOSMBIsEnableSpotlight", on);
        Watch();
        EXPECT_TRUE(IndexMgr::Upsert(Json("[]")));
        EXPECT_EQ(platform.Calls("VANOSMBSetSpotlight"), 0U);
        EXPECT_EQ(platform.Calls("VLIBServiceRestart"), 0U);
    }
}

TEST_F(UpsertTest, OnlyNegativeAnswersOfThePlatformAreFailures) {
    platform.AnswerAlways("VLIBServiceStart", 1);
    platform.AnswerAlways("VANOSMBSetSpotlight", 2);
    platform.AnswerAlways("VLIBServiceRestart", 3);
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    EXPECT_THAT(Steps(), ElementsAreArray(AllSteps()));
}

TEST_F(UpsertTest, ASuccessLeavesTheLastErrorAsItWas) {
    const DaemonPeer daemon;
    ErrorHandler::SetError(FILEINDEX_ERR_FOLDER_LIMIT);
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    ExpectError(FILEINDEX_ERR_FOLDER_LIMIT);
}

TEST_F(UpsertTest, StoredSettingsOfAnyShapeStayInTheFile) {
    PutFile(kFolderFile, R"({"/photos/a":7,"/gone/x":[1],"":{"photo":true}})");
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(Json(R"([{"path":"/video/b"}])")));
    EXPECT_THAT(StoredPaths(), ElementsAre("", "/gone/x", "/photos/a", "/video/b"));
    EXPECT_EQ(ReadJson(kFolderFile)[""], PhotoFolder(""));
    const std::string noShare = "utils:389 GetShareNameByPath failed, path=";
    ExpectLog({noShare, // loading
               noShare, "folder:16 Failed to get full path from ",
               "folder:16 Failed to get full path from /gone/x", // comparing
               noShare});                                        // loading for the monitor
}

TEST_F(UpsertTest, NamesAreBytes) {
    for (const char *share : {"my share", "100% %s%n", "\xff\xfe", "a\"b\\c", "#recycle"}) {
        SCOPED_TRACE(share);
        SetUp();
        const std::string directory = "/volume1/"s + share;
        platform.AddShare(share, directory);
        const std::string path = "/"s + share + "/caf\xe9 %d\n\"x\"";
        const std::string full = "/volume1" + path;
        Json::Value request(Json::arrayValue);
        request.append(PhotoFolder(path));
        request[0]["name"] = "caf\xe9";
        const DaemonPeer daemon;
        Watch();
        EXPECT_TRUE(IndexMgr::Upsert(request));
        EXPECT_THAT(Steps(), ElementsAre(Changed(kFolderFile), Watched(directory, {full}), kStarted,
                                         kSpotlightOn, kRestarted, Told(path)));
        EXPECT_EQ(ReadJson(kFolderFile)[path], request[0]);
        EXPECT_THAT(EventsIn(QueueOf(directory)),
                    ElementsAre(Event(kSettingEvent, full, EverythingChanged())));
        EXPECT_TRUE(IndexMgr::IsPathIndexed(path));
    }
}

TEST_F(UpsertTest, PathsMayBeLongerThanTheSystemAllows) {
    const std::string path = "/photos/" + std::string(5000, 'x');
    Json::Value request(Json::arrayValue);
    request.append(PhotoFolder(path));
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(request));
    EXPECT_THAT(Steps(),
                ElementsAre(Changed(kFolderFile), Watched(kPhotos, {"/volume1" + path}), kStarted,
                            kSpotlightOn, kRestarted, Told(path), Changed(QueueOf(kPhotos))));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1" + path, EverythingChanged())));
}

TEST_F(UpsertTest, TheThousandAndFirstFolderIsRefused) {
    PutFolders(Numbered(1000));
    const std::string before = ReadText(kFolderFile);
    EXPECT_FALSE(IndexMgr::Upsert(Json(R"([{"path":"/photos/5","audio":true},
                                           {"path":"/photos/new"}])")));
    ExpectError(FILEINDEX_ERR_FOLDER_LIMIT);
    ExpectLog({"folders:140 Exceed max folder size",
               R"(index_mgr:* Upsert failed, folder={"path":"/photos/new"})"});
    EXPECT_THAT(Steps(), IsEmpty());
    EXPECT_EQ(ReadText(kFolderFile), before);
}

TEST_F(UpsertTest, AThousandFoldersCanBeChanged) {
    PutFolders(Numbered(999));
    platform.Answer("VLIBServiceStart", {-1, -1}); // far enough
    EXPECT_FALSE(IndexMgr::Upsert(Json(R"([{"path":"/photos/new"}])")));
    EXPECT_FALSE(IndexMgr::Upsert(Json(R"([{"path":"/photos/5","audio":true}])")));
    ExpectLog({"index_mgr:* VLIBServiceStart failed: err=[0x0000 :0]",
               "index_mgr:* VLIBServiceStart failed: err=[0x0000 :0]"});
    EXPECT_EQ(StoredPaths().size(), 1000U);
    EXPECT_EQ(ReadJson(kFolderFile)["/photos/5"]["audio"], true);
}

// --- bad elements -------------------------------------------------------------------------------

TEST_F(UpsertTest, ABadElementIsABadParameterAndNothingIsSaved) {
    PutFolders({"/photos/old"});
    const DaemonPeer daemon;
    for (const std::string element :
         {"5", R"("/photos/x")", "null", "true", R"(["path"])", R"({"photo":true})",
          R"({"path":5})", R"({"path":{"a":1}})", R"({"path":["/photos/x"]})", R"({"path":null})",
          R"({"path":"/nowhere/x"})", R"({"path":"/volume1/photos/a"})",
          R"({"path":"/photos\u0000x/a"})", // cut at the zero byte it would be the share photos
          R"({"path":""})"}) {
        SCOPED_TRACE(element);
        Json::Value request = TwoFolders();
        request.append(Json(element));
        request.append(Json(R"({"path":"/music"})"));
        Watch();
        EXPECT_NO_THROW(EXPECT_FALSE(IndexMgr::Upsert(request)));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        std::vector<std::string> log = {"folders:129 Bad param: " + element,
                                        "index_mgr:* Upsert failed, folder=" + element};
        if (element == R"({"path":""})") {
            log.insert(log.begin(), "utils:389 GetShareNameByPath failed, path=");
        }
        ExpectLog(log);
        EXPECT_THAT(Steps(), IsEmpty());
        EXPECT_THAT(StoredPaths(), ElementsAre("/photos/old"));
    }
}

TEST_F(UpsertTest, AHoleInTheRequestIsABadElement) {
    Json::Value request(Json::arrayValue);
    request[1]["path"] = "/photos/a";
    EXPECT_FALSE(IndexMgr::Upsert(request));
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    ExpectLog({"folders:129 Bad param: null", "index_mgr:* Upsert failed, folder=null"});
    EXPECT_FALSE(Exists(kFolderFile));
}

TEST_F(UpsertTest, FieldsOfAnotherTypeAreNoBadElements) {
    PutFile(kFolderFile, R"({"/photos/a":{"name":"Mine","photo":true}})");
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(
        Json(R"([{"path":"/photos/a","name":7,"photo":0,"audio":"true","extra":[]}])")));
    EXPECT_EQ(ReadJson(kFolderFile)["/photos/a"],
              Json(R"({"path":"/photos/a","name":"Mine","document":false,"audio":false,
                       "video":false,"photo":true})"));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)),
                ElementsAre(Event(kSettingEvent, "/volume1/photos/a", NothingChanged())));
}

// --- each step failing in turn ------------------------------------------------------------------

class UpsertFailureTest : public UpsertTest, public ::testing::WithParamInterface<FailingStep> {};

TEST_P(UpsertFailureTest, EndsTheOperationAndLeavesWhatWasDone) {
    ExpectFailure(
        GetParam(), [] { return IndexMgr::Upsert(TwoFolders()); }, AllSteps());
    if (GetParam().steps > 0) {
        EXPECT_THAT(StoredPaths(), ElementsAre("/photos/a", "/video/b"));
    }
}

INSTANTIATE_TEST_SUITE_P(First, UpsertFailureTest, ::testing::ValuesIn(FailuresBeforeAnyStep()),
                         NameOfRow());

const FailingStep kFailingSteps[] = {
    {"MonitorRefusesTheFirstShare",
     Refused("MonitorQueue::Upsert", {0}),
     2,
     {"index_mgr:* MonitorQueue::Add failed",
      "index_mgr:* UpsertVANtifydCfg failed, share=photos"}},
    {"MonitorRefusesTheSecondShare",
     Refused("MonitorQueue::Upsert", {1, 0}),
     3,
     {"index_mgr:* MonitorQueue::Add failed", "index_mgr:* UpsertVANtifydCfg failed, share=video"}},
    {"ShareGoneBeforeItsMonitor",
     Gone("video", "MonitorQueue::Upsert"),
     2,
     {"utils:772 VANOShareGet failed, name=video, code=171",
      "index_mgr:* FILEIDXQueuePathGet failed, share=video",
      "index_mgr:* UpsertVANtifydCfg failed, share=video"}},
    {"ServiceDoesNotStart",
     Refused("VLIBServiceStart", {-1}),
     4,
     {"index_mgr:* VLIBServiceStart failed: err=[0x00AB service.c:77]"}},
    {"NoDaemon",
     NothingInTheWay(),
     6,
     {"index_mgr:* SendCammandToDaemon failed"},
     FILEINDEX_ERR_NONE,
     false},
    {"DaemonGoneAfterTheFirstCommand",
     Refused(Call::Connect, ECONNREFUSED, 2),
     7,
     {"index_mgr:* SendCammandToDaemon failed"}},
    {"ShareGoneBeforeItsEvent",
     Gone("video", "VLIBServiceRestart"),
     9,
     {"index_mgr:* GetFullPath failed, path=/video/b"},
     FILEINDEX_ERR_PATH}};

INSTANTIATE_TEST_SUITE_P(Later, UpsertFailureTest, ::testing::ValuesIn(kFailingSteps), NameOfRow());

TEST_F(UpsertTest, AnEventThatCannotBeQueuedMarksTheShareAndEndsTheOperation) {
    RemoveTree(QueueOf(kPhotos));
    MakeDirs(QueueOf(kPhotos)); // no file can be opened there
    const DaemonPeer daemon;
    Watch();
    EXPECT_FALSE(IndexMgr::Upsert(TwoFolders()));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"index_mgr:* AddCustomEvent failed"});
    std::vector<std::string> expected = AllSteps();
    expected.resize(8);
    expected.push_back(Changed(kStatusFile));
    EXPECT_THAT(Steps(), ElementsAreArray(expected));
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"need_reindex":{"photos":true}})"));
}

TEST_F(UpsertTest, AStatusFileOfAnotherShapeMakesTheMarkFailAndNothingThrow) {
    RemoveTree(QueueOf(kPhotos));
    MakeDirs(QueueOf(kPhotos));
    for (const char *status : {"[]", "7", R"("x")", R"({"need_reindex":5})"}) {
        SCOPED_TRACE(status);
        PutFile(kStatusFile, status);
        const DaemonPeer daemon;
        EXPECT_NO_THROW(EXPECT_FALSE(IndexMgr::Upsert(TwoFolders())));
        ExpectLog({"utils:522 ShareSetNeedReindex failed, share=photos",
                   "index_mgr:* AddCustomEvent failed"});
        EXPECT_EQ(ReadText(kStatusFile), status);
        EXPECT_FALSE(IsLocked(kFolderLock));
        EXPECT_FALSE(IsLocked(kStatusLock));
    }
}

TEST_F(UpsertTest, AnEventWhoseShareCannotBeToldMarksNoShareByName) {
    platform.AnswerAlways("VANOShareNamePathGet", -1);
    const DaemonPeer daemon;
    EXPECT_FALSE(IndexMgr::Upsert(TwoFolders()));
    ExpectLog({"utils:472 VANOShareNamePathGet failed, path=/volume1/photos/a",
               "index_mgr:* AddCustomEvent failed"});
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"need_reindex":{"":true}})"));
}

TEST_F(UpsertTest, AQueueThatStaysBusyDropsTheEvent) {
    Fault::Quiet(Call::Usleep);
    const HoldLock busy(QueueOf(kPhotos));
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    EXPECT_THAT(EventsIn(QueueOf(kPhotos)), IsEmpty());
    EXPECT_THAT(EventsIn(QueueOf(kVideo)),
                ElementsAre(Event(kSettingEvent, "/volume1/video/b", EverythingChanged())));
    EXPECT_FALSE(Exists(kStatusFile));
}

TEST_F(UpsertTest, AFailingSpotlightSwitchIsLoggedOnly) {
    SetPlatformError();
    platform.Answer("VANOSMBSetSpotlight", {-1});
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    ExpectLog({"index_mgr:* VANOSMBSetSpotlight failed: err=[0x00AB service.c:77]"});
    std::vector<std::string> expected = AllSteps();
    expected.erase(expected.begin() + 5); // no restart
    EXPECT_THAT(Steps(), ElementsAreArray(expected));
}

TEST_F(UpsertTest, AFailingRestartIsLoggedOnly) {
    SetPlatformError();
    platform.lastError = 0x12345;
    platform.Answer("VLIBServiceRestart", {-1});
    const DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    ExpectLog({"index_mgr:* VLIBServiceRestart failed: err=[0x12345 service.c:77]"});
    EXPECT_THAT(Steps(), ElementsAreArray(AllSteps()));
    ExpectError(FILEINDEX_ERR_NONE);
}

// --- the lock -----------------------------------------------------------------------------------

TEST_F(UpsertTest, TheLockIsHeldDuringEverySideEffect) {
    WatchLockAt({"MonitorQueue::Upsert", "VLIBServiceStart", "VANOSMBIsEnableSpotlight",
                 "VANOSMBSetSpotlight", "VLIBServiceRestart"},
                {Call::Rename, Call::Connect, Call::Write});
    const DaemonPeer daemon;
    EXPECT_TRUE(IndexMgr::Upsert(Json(R"([{"path":"/photos/a"}])")));
    EXPECT_THAT(held, ElementsAre("rename", "MonitorQueue::Upsert", "VLIBServiceStart",
                                  "VANOSMBIsEnableSpotlight", "VANOSMBSetSpotlight",
                                  "VLIBServiceRestart", "connect", "write"));
    EXPECT_THAT(unheld, IsEmpty());
}

TEST_F(UpsertTest, AnotherWriterIsRefusedMeanwhile) {
    bool other = true;
    Fault::Quiet(Call::Usleep);
    platform.Before("VLIBServiceStart", [&] { other = IndexMgr::Upsert(Json("[]")); });
    EXPECT_TRUE(IndexMgr::Upsert(Json("[]")));
    EXPECT_FALSE(other);
    EXPECT_EQ(platform.Calls("VLIBServiceStart"), 1U);
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({"config:74 Failed to lock folder"});
    ExpectLeakedDescriptors(2);
}

TEST_F(UpsertTest, AnExceptionReleasesTheLock) {
    const DaemonPeer daemon;
    for (const char *function : {"VANOShareGet", "MonitorQueue::Upsert", "VLIBServiceStart",
                                 "VANOSMBSetSpotlight", "VANOShareNamePathGet"}) {
        SCOPED_TRACE(function);
        platform.Reset();
        platform.AddShare("photos", kPhotos);
        platform.On(function, [](const std::string &) -> std::optional<int> {
            throw std::runtime_error("the platform fails");
        });
        EXPECT_THROW((void)IndexMgr::Upsert(Json(R"([{"path":"/photos/a"}])")), std::runtime_error);
        EXPECT_FALSE(IsLocked(kFolderLock));
        EXPECT_EQ(platform.LiveRecords(), 0U);
    }
}

// The queue's location is asked of an entry point for C, which lets nothing out.
TEST_F(UpsertTest, AnExceptionBelowAnEntryPointForCIsAFailure) {
    const DaemonPeer daemon;
    platform.AddShare("photos", kPhotos);
    platform.On("VANOEAMKDir", [](const std::string &) -> std::optional<int> {
        throw std::runtime_error("the platform fails");
    });
    EXPECT_FALSE(IndexMgr::Upsert(Json(R"([{"path":"/photos/a"}])")));
    ExpectLog({"index_mgr:* FILEIDXQueuePathGet failed, share=photos",
               "index_mgr:* UpsertVANtifydCfg failed, share=photos"});
    EXPECT_FALSE(IsLocked(kFolderLock));
    EXPECT_EQ(platform.LiveRecords(), 0U);
}

TEST_F(UpsertTest, TheLockIsTakenOncePerCall) {
    const DaemonPeer daemon;
    Fault::Count(Call::Flock);
    EXPECT_TRUE(IndexMgr::Upsert(TwoFolders()));
    std::vector<long> operations;
    for (const CallInfo &call : Fault::Log(Call::Flock)) {
        if (call.path == kFolderLock) {
            operations.push_back(call.number);
        }
    }
    EXPECT_THAT(operations, ElementsAre(6, 8)); // exclusive without waiting, unlock
}

} // namespace

} // namespace VANO::TESTS
