// How far indexing has come, told from the queue files, the status file and the clock.

#include "support/fixture.h"

#include <sys/stat.h>
#include <unistd.h>

#include <fileindex/status_mgr.h>

namespace VANO::TESTS {

namespace {

constexpr long long kNow = 1700000000;
constexpr char kFolder[] = "/photos/trip";
constexpr char kWaiting[] = R"({"event":131072,"path":"/volume1/photos/trip","data":{}})"
                            "\n";

std::string Event(const std::string &path, int code = 1) {
    return R"({"event":)" + std::to_string(code) + R"(,"path":")" + path + "\"}\n";
}

std::string Moved(const std::string &path, const std::string &formerPath, int code = 256) {
    return R"({"event":)" + std::to_string(code) + R"(,"path":")" + path + R"(","path_old":")" +
           formerPath + "\"}\n";
}

std::string Malformed(const std::string &line) {
    return "status_mgr:47 Malformed command: " + line;
}

class ProgressTest : public LibraryTest {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        platform.AddShare("photos", "/volume1/photos");
        MakeDirs("/volume1/photos/trip");
        EventTrace::Get().Clear();
        Fault::On(Call::Time, [](CallInfo &) { return static_cast<long>(kNow); });
    }

    static void SetResumeTime(long long time) {
        PutFile(kStatusFile, R"({"resume_time":)" + std::to_string(time) + "}");
    }

    static std::string StatusOf(const std::string &path = kFolder) {
        return StatusMgr::GetFolderStatus(path);
    }
};

struct PauseRow {
    const char *status; // status.conf
    const char *expected;
};

// What a waiting event means under each pause.
constexpr PauseRow kPauses[] = {
    {R"({})", "processing"},
    {R"({"resume_time":-1})", "processing"},
    {R"({"resume_time":0})", "paused"},
    {R"({"resume_time":1})", "processing"},
    {R"({"resume_time":1699999999})", "processing"}, // ended a second ago
    {R"({"resume_time":1700000000})", "processing"}, // ends now
    {R"({"resume_time":1700000001})", "paused"},
    {R"({"resume_time":4294967297})", "paused"}, // more than 32 bits
    {R"({"resume_time":-1934967296})", "processing"},
    {R"({"resume_time":-9223372036854775808})", "processing"},
};

// --- GetFolderStatus ------------------------------------------------------------------------

TEST_F(ProgressTest, AFolderWithoutAQueueIsFinished) {
    EXPECT_EQ(StatusOf(), "finished");
    EXPECT_FALSE(Exists(kPhotoQueue));
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ProgressTest, AFolderWithAWaitingEventFollowsThePause) {
    PutFile(kPhotoQueue, kWaiting);
    EXPECT_EQ(StatusOf(), "processing");
    for (const PauseRow &row : kPauses) {
        PutFile(kStatusFile, row.status);
        EXPECT_EQ(StatusOf(), row.expected) << row.status;
    }
}

TEST_F(ProgressTest, AFinishedFolderIsFinishedUnderAnyPause) {
    PutFile(kPhotoQueue, Event("/volume1/photos/other"));
    for (const PauseRow &row : kPauses) {
        PutFile(kStatusFile, row.status);
        EXPECT_EQ(StatusOf(), "finished") << row.status;
    }
}

TEST_F(ProgressTest, TheTakenOverQueueCountsToo) {
    PutFile(kPhotoTaken, kWaiting);
    EXPECT_EQ(StatusOf(), "processing");
    PutFile(kPhotoQueue, Event("/volume1/photos/other"));
    EXPECT_EQ(StatusOf(), "processing");
}

TEST_F(ProgressTest, AHitInTheQueueSparesTheTakenOverOne) {
    PutFile(kPhotoQueue, kWaiting);
    PutFile(kPhotoTaken, "malformed\n");
    EXPECT_EQ(StatusOf(), "processing");
    ExpectLog({});
}

TEST_F(ProgressTest, AFolderThatCannotBeIndexedIsPaused) {
    platform.FindShare("photos")->readOnly = true;
    EXPECT_EQ(StatusOf(), "paused");
    PutFile(kPhotoQueue, "malformed\n");
    PutFile(kStatusFile, R"({"resume_time":-1,"no_space":{"photos":true}})");
    EXPECT_EQ(StatusOf(), "paused") << "asked before anything else";
    ExpectLog({});
}

TEST_F(ProgressTest, AFolderOfAnUnknownShareIsPaused) {
    EXPECT_EQ(StatusOf("/gone/trip"), "paused");
    ExpectLog({"utils:191 GetFullPath failed, path=/gone/trip"});
    ExpectError(FILEINDEX_ERR_PATH);
}

TEST_F(ProgressTest, AnEmptyPathIsPaused) {
    EXPECT_EQ(StatusOf(""), "paused");
    ExpectLog(
        {"utils:389 GetShareNameByPath failed, path=", "utils:191 GetFullPath failed, path="});
}

TEST_F(ProgressTest, AShareOutOfSpaceIsToldWhetherOrNotWorkWaits) {
    PutFile(kStatusFile, R"({"resume_time":0,"no_space":{"photos":true}})");
    EXPECT_EQ(StatusOf(), "err_no_space");
    PutFile(kPhotoQueue, "malformed\n");
    EXPECT_EQ(StatusOf(), "err_no_space");
    EXPECT_EQ(platform.Calls("VANOEAMKDir"), 0U) << "the queue does not matter";
    ExpectLog({});
    PutFile(kStatusFile, R"({"resume_time":0,"no_space":{"video":true}})");
    PutFile(kPhotoQueue, kWaiting);
    EXPECT_EQ(StatusOf(), "paused");
}

TEST_F(ProgressTest, AnUnknownQueueLocationReadsAsFinished) {
    PutFile(kPhotoQueue, kWaiting);
    platform.lastError = 0x1400;
    platform.Answer("VANOShareGet", {0, 0, -1});
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({"utils:772 VANOShareGet failed, name=photos, code=5120",
               "status_mgr:100 FILEIDXQueuePathGet failed, share=photos"});
}

// A path that had to be cut would be the beginning of another one.
TEST_F(ProgressTest, AQueueLocationThatIsTooLongReadsAsFinished) {
    PutFile(kPhotoQueue, kWaiting);
    platform.AnswerAlways("VANOEAMKDir", 0);
    const std::size_t rest = std::string("/volume1//@eaDir/VANO@file_index_queue").size();
    for (const std::size_t size : {4095U, 4096U}) {
        SCOPED_TRACE(size);
        int asked = 0;
        platform.On("VANOShareGet", [&](const std::string &) {
            const bool isForLocation = ++asked == 3;
            platform.FindShare("photos")->path =
                "/volume1/" + (isForLocation ? std::string(size - rest, 'x') : "photos");
            return std::optional<int>();
        });
        EXPECT_EQ(StatusOf(), "finished");
        std::vector<std::string> lines;
        if (size == 4096) {
            lines = {"status_mgr:100 FILEIDXQueuePathGet failed, share=photos"};
        }
        ExpectLog(lines);
    }
}

TEST_F(ProgressTest, AFolderThatNoLongerResolvesIsInNoQueue) {
    PutFile(kPhotoQueue, kWaiting);
    PutFile(kPhotoTaken, kWaiting);
    platform.Answer("VANOShareGet", {0, 0, 0, -1, -1});
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({"status_mgr:30 Cannot get full path: /photos/trip",
               "status_mgr:30 Cannot get full path: /photos/trip"});
    ExpectError(FILEINDEX_ERR_PATH);
    platform.Answer("VANOShareGet", {0, 0, 0, -1});
    EXPECT_EQ(StatusOf(), "processing") << "of the taken-over queue it resolved";
    ExpectLog({"status_mgr:30 Cannot get full path: /photos/trip"});
}

TEST_F(ProgressTest, AMissingQueueIsNotWorthResolvingTheFolder) {
    EXPECT_EQ(StatusOf(), "finished");
    EXPECT_EQ(platform.Calls("VANOShareGet"), 3U);
}

TEST_F(ProgressTest, AnUnreadableQueueIsLoggedAndHoldsNothing) {
    PutFile(kPhotoQueue, kWaiting);
    Fault::FailPath(Call::Open, "VANO@file_index_queue", EACCES);
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({std::string("status_mgr:37 Failed to open queue=") + kPhotoQueue +
               ", reason=Permission denied"});
    PutFile(kPhotoTaken, kWaiting);
    EXPECT_EQ(StatusOf(), "processing");
    ExpectLog({std::string("status_mgr:37 Failed to open queue=") + kPhotoQueue +
               ", reason=Permission denied"});
    Fault::FailPath(Call::Open, ".tmp", ENFILE);
    PutFile(kPhotoQueue, "");
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({std::string("status_mgr:37 Failed to open queue=") + kPhotoTaken +
               ", reason=Too many open files in system"});
}

TEST_F(ProgressTest, OnlyARegularFileIsAQueue) {
    MakeDirs("/volume1/photos/@eaDir");
    PutFile("/volume2/target", kWaiting);
    ASSERT_EQ(::symlink("/volume2/target", kPhotoQueue), 0);
    EXPECT_EQ(StatusOf(), "finished");
    ASSERT_EQ(::unlink(kPhotoQueue), 0);
    ASSERT_EQ(::mkfifo(kPhotoQueue, 0600), 0);
    EXPECT_EQ(StatusOf(), "finished");
    ASSERT_EQ(::unlink(kPhotoQueue), 0);
    MakeDirs(kPhotoQueue);
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({});
}

TEST_F(ProgressTest, ALinkPutInPlaceOfTheQueueIsNotFollowed) {
    PutFile(kPhotoQueue, Event("/volume1/photos/other"));
    PutFile("/volume2/target", kWaiting);
    // After the look at what it is, before it is opened.
    Fault::Before(Call::Open, [](CallInfo &info) {
        if (info.path == kPhotoQueue) {
            ::unlink(kPhotoQueue);
            EXPECT_EQ(::symlink("/volume2/target", kPhotoQueue), 0);
        }
    });
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({std::string("status_mgr:37 Failed to open queue=") + kPhotoQueue +
               ", reason=Too many levels of symbolic links"});
}

TEST_F(ProgressTest, AnEventBelongsToTheFolderAtOrAboveIt) {
    const struct {
        const char *path;
        bool waits;
    } kRows[] = {
        {"/volume1/photos/trip", true},
        {"/volume1/photos/trip/", true},
        {"/volume1/photos/trip/a.jpg", true},
        {"/volume1/photos/trip/deep/er/a.jpg", true},
        {"/volume1/photos/trip2", false},
        {"/volume1/photos/trip2/a.jpg", false},
        {"/volume1/photos/tri", false},
        {"/volume1/photos", false},
        {"/volume1/photos/Trip/a.jpg", false},
        {"/volume1/photos//trip", false},
        {"/x/volume1/photos/trip", false},
        {"/photos/trip", false},
        {"", false},
    };
    for (const auto &row : kRows) {
        PutFile(kPhotoQueue, Event(row.path));
        EXPECT_EQ(StatusOf(), row.waits ? "processing" : "finished") << row.path;
    }
}

TEST_F(ProgressTest, ANeighbourWithALongerNameIsNotTheFolder) {
    MakeDirs("/volume1/photos/trip2");
    PutFile(kPhotoQueue, Event("/volume1/photos/trip2/a.jpg"));
    EXPECT_EQ(StatusOf("/photos/trip"), "finished");
    EXPECT_EQ(StatusOf("/photos/trip2"), "processing");
}

TEST_F(ProgressTest, EveryCodeIsAnEvent) {
    for (const char *code :
         {"0", "1", "256", "65536", "131072", "4294967295", "65536.0", "true", "null"}) {
        PutFile(kPhotoQueue, std::string(R"({"event":)") + code +
                                 R"(,"path":"/volume1/photos/trip/a"})"
                                 "\n");
        EXPECT_EQ(StatusOf(), "processing") << code;
    }
}

TEST_F(ProgressTest, ANonUtf8PathIsComparedByBytes) {
    MakeDirs("/volume1/photos/\xff\xfe");
    PutFile(kPhotoQueue, Event("/volume1/photos/\xff\xfe/a"));
    EXPECT_EQ(StatusOf("/photos/\xff\xfe"), "processing");
    EXPECT_EQ(StatusOf("/photos/trip"), "finished");
}

TEST_F(ProgressTest, AFormerPathCountsForAMove) {
    PutFile(kPhotoQueue, Moved("/volume1/photos/other/b", "/volume1/photos/trip/a"));
    EXPECT_EQ(StatusOf(), "processing");
    PutFile(kPhotoQueue, Moved("/volume1/photos/other", "/volume1/photos/trip"));
    EXPECT_EQ(StatusOf(), "processing");
    PutFile(kPhotoQueue, Moved("/volume1/photos/other/b", "/volume1/photos/trip2/a"));
    EXPECT_EQ(StatusOf(), "finished");
    PutFile(kPhotoQueue, Moved("/volume1/photos/trip/b", "/volume1/photos/other/a"));
    EXPECT_EQ(StatusOf(), "processing");
}

TEST_F(ProgressTest, AFormerPathCountsForNoOtherCode) {
    for (const int code : {0, 1, 255, 257, 512, 65536, 131072}) {
        PutFile(kPhotoQueue, Moved("/volume1/photos/other/b", "/volume1/photos/trip/a", code));
        EXPECT_EQ(StatusOf(), "finished") << code;
    }
}

TEST_F(ProgressTest, TheLastFormerPathIsCarriedOverLaterEvents) {
    PutFile(kPhotoQueue, Moved("/volume1/photos/other/b", "/volume1/photos/trip/a") +
                             Event("/volume1/photos/other/c") + Event("/volume1/photos/other/d"));
    EXPECT_EQ(StatusOf(), "processing");
    PutFile(kPhotoQueue, Moved("/volume1/photos/x", "/volume1/photos/trip/a") +
                             Moved("/volume1/photos/x", "/volume1/photos/y"));
    EXPECT_EQ(StatusOf(), "processing");
    PutFile(kPhotoQueue,
            Moved("/volume1/photos/x", "/volume1/photos/y") + Event("/volume1/photos/z"));
    EXPECT_EQ(StatusOf(), "finished");
}

TEST_F(ProgressTest, AFormerPathThatIsNoTextCountsAsEmpty) {
    for (const char *former : {"null", "[]", "{}", "[\"/volume1/photos/trip\"]", "5", "true"}) {
        PutFile(kPhotoQueue, std::string(R"({"event":256,"path":"/volume1/photos/x","path_old":)") +
                                 former + "}\n");
        EXPECT_EQ(StatusOf(), "finished") << former;
        PutFile(kPhotoQueue,
                std::string(R"({"event":256,"path":"/volume1/photos/trip","path_old":)") + former +
                    "}\n");
        EXPECT_EQ(StatusOf(), "processing") << former;
        ExpectLog({});
    }
}

TEST_F(ProgressTest, AMalformedMovesFormerPathIsNotCarriedOver) {
    for (const std::string line :
         {R"({"event":256,"path_old":"/volume1/photos/trip/a"})",
          R"({"event":256,"path":5,"path_old":"/volume1/photos/trip/a"})"}) {
        PutFile(kPhotoQueue, line + "\n" + Event("/volume1/photos/other"));
        EXPECT_EQ(StatusOf(), "finished") << line;
        ExpectLog({Malformed(line)});
    }
}

TEST_F(ProgressTest, AMoveWithoutAFormerPathIsAnEvent) {
    PutFile(kPhotoQueue, Event("/volume1/photos/trip/a", 256));
    EXPECT_EQ(StatusOf(), "processing");
    PutFile(kPhotoQueue, Event("/volume1/photos/other", 256));
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({});
}

TEST_F(ProgressTest, AMalformedLineIsLoggedAndSkipped) {
    for (const std::string line : {"",
                                   " ",
                                   "x",
                                   "{",
                                   "[]",
                                   "5",
                                   "null",
                                   "\"text\"",
                                   "{}",
                                   R"({"path":"/volume1/photos/trip"})",
                                   R"({"event":1})",
                                   R"({"event":1,"path":null})",
                                   R"({"event":1,"path":5})",
                                   R"({"event":1,"path":["/volume1/photos/trip"]})",
                                   R"({"event":"1","path":"/volume1/photos/trip"})",
                                   R"({"event":-1,"path":"/volume1/photos/trip"})",
                                   R"({"event":4294967296,"path":"/volume1/photos/trip"})",
                                   R"({"event":1e300,"path":"/volume1/photos/trip"})",
                                   R"({"event":{},"path":"/volume1/photos/trip"})",
                                   R"({"event":[1],"path":"/volume1/photos/trip"})",
                                   R"({"Event":1,"Path":"/volume1/photos/trip"})",
                                   R"({"event":1,"path":"/volume1/photos/trip"} {})",
                                   R"({"event":1,"path":"/volume1/photos/trip",})",
                                   R"({"event":1,"path":"/volume1/photos/trip"} // why)",
                                   R"(/* why */ {"event":1,"path":"/volume1/photos/trip"})",
                                   R"([{"event":1,"path":"/volume1/photos/trip"}])",
                                   "\xff\xfe",
                                   "%s%n%d"}) {
        PutFile(kPhotoQueue, line + "\n");
        EXPECT_EQ(StatusOf(), "finished") << line;
        ExpectLog({Malformed(line)});
        PutFile(kPhotoQueue, line + "\n" + kWaiting);
        EXPECT_EQ(StatusOf(), "processing") << line;
        ExpectLog({Malformed(line)});
    }
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ProgressTest, TheWholeFileIsReadAfterAHit) {
    PutFile(kPhotoQueue, std::string("first\n") + kWaiting + "second\n" +
                             Event("/volume1/photos/other") + "third");
    EXPECT_EQ(StatusOf(), "processing");
    ExpectLog({Malformed("first"), Malformed("second"), Malformed("third")});
}

TEST_F(ProgressTest, BothQueuesMalformedLinesAreLogged) {
    PutFile(kPhotoQueue, "one\n");
    PutFile(kPhotoTaken, "two\n");
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({Malformed("one"), Malformed("two")});
}

TEST_F(ProgressTest, TheLastLineNeedsNoNewline) {
    std::string line = kWaiting;
    line.pop_back();
    PutFile(kPhotoQueue, line);
    EXPECT_EQ(StatusOf(), "processing");
    ExpectLog({});
}

TEST_F(ProgressTest, AnEmptyQueueHoldsNothing) {
    PutFile(kPhotoQueue, "");
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({});
}

TEST_F(ProgressTest, AReadErrorEndsTheQueue) {
    PutFile(kPhotoQueue, kWaiting);
    Fault::FailPath(Call::Read, kPhotoQueue, EIO);
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({});
}

TEST_F(ProgressTest, APauseThatCannotBeReadIsNone) {
    PutFile(kPhotoQueue, kWaiting);
    PutFile(kStatusFile, R"({"resume_time":"0"})");
    EXPECT_EQ(StatusOf(), "processing");
    ExpectLog({"status:66 json exception"});
    PutFile(kStatusFile, "{");
    EXPECT_EQ(StatusOf(), "processing");
    const char *const kFailed =
        "config:22 Failed to load json from /usr/vano/etc/fileindex/status.conf";
    ExpectLog({kFailed, kFailed});
    ExpectError(FILEINDEX_ERR_LOAD);
}

TEST_F(ProgressTest, ThePauseIsReadBeforeTheQueue) {
    PutFile(kStatusFile, R"({"resume_time":"0"})");
    PutFile(kPhotoQueue, "malformed\n");
    EXPECT_EQ(StatusOf(), "finished");
    ExpectLog({"status:66 json exception", Malformed("malformed")});
}

TEST_F(ProgressTest, AskingTakesNoLockAndChangesNothing) {
    SetResumeTime(0);
    PutFile(kPhotoQueue, kWaiting);
    EventTrace::Get().WatchFile(kStatusFile);
    EventTrace::Get().WatchFile(kPhotoQueue);
    const HoldLock queueLock(kPhotoQueue);
    const HoldLock statusLock(kStatusLock);
    const HoldLock folderLock(kFolderLock);
    EXPECT_EQ(StatusOf(), "paused");
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/photos/@eaDir)"));
}

TEST_F(ProgressTest, ALongLineIsAnEventToo) {
    const std::string data((std::size_t{1} << 20) - 100, 'x');
    PutFile(kPhotoQueue, R"({"event":1,"path":"/volume1/photos/trip","data":")" + data + "\"}\n");
    EXPECT_EQ(StatusOf(), "processing");
    ExpectLog({});
}

TEST_F(ProgressTest, AVeryLongMalformedLineIsLoggedCut) {
    PutFile(kPhotoQueue, std::string(std::size_t{10} << 20, 'x') + "\n" + kWaiting);
    EXPECT_EQ(StatusOf(), "processing");
    const std::vector<LogLine> lines = SystemLog::Get().Lines();
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_THAT(lines[0].text, StartsWith(Malformed(std::string(1000, 'x'))));
}

// --- GetStatus ------------------------------------------------------------------------------

class ServiceStatusTest : public ProgressTest {
  protected:
    static void SetFolders(const std::vector<std::string> &paths) {
        Json::Value folders(Json::objectValue);
        for (const std::string &path : paths) {
            folders[path] = Json::Value(Json::objectValue);
        }
        PutFile(kFolderFile, folders.toStyledString());
    }

    // The status, or "failed" when it could not be told; a failure must not touch the output.
    static std::string ServiceStatus() {
        std::string status = "untouched";
        if (StatusMgr::GetStatus(status)) {
            return status;
        }
        EXPECT_EQ(status, "untouched");
        return "failed";
    }

    void AddShareWithFolder(const std::string &share) {
        platform.AddShare(share, "/volume1/" + share);
        MakeDirs("/volume1/" + share + "/x");
    }
};

TEST_F(ServiceStatusTest, WithoutFoldersEverythingIsFinished) {
    PutFile(kPhotoQueue, kWaiting);
    EXPECT_EQ(ServiceStatus(), "finished");
    PutFile(kFolderFile, "{}");
    EXPECT_EQ(ServiceStatus(), "finished");
}

TEST_F(ServiceStatusTest, UnreadableSettingsFail) {
    PutFile(kFolderFile, "{");
    EXPECT_EQ(ServiceStatus(), "failed");
    ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/folder.conf"});
    ExpectError(FILEINDEX_ERR_LOAD);
    PutFile(kFolderFile, "[]");
    EXPECT_EQ(ServiceStatus(), "failed");
    ExpectLog({"folders:80 Malformed folders: []"});
    ExpectError(FILEINDEX_ERR_MALFORMED);
}

TEST_F(ServiceStatusTest, WithoutQueuesEverythingIsFinished) {
    SetFolders({"/photos/trip"});
    for (const PauseRow &row : kPauses) {
        PutFile(kStatusFile, row.status);
        EXPECT_EQ(ServiceStatus(), "finished") << row.status;
    }
}

TEST_F(ServiceStatusTest, AQueueFollowsThePause) {
    SetFolders({"/photos/trip"});
    PutFile(kPhotoQueue, kWaiting);
    EXPECT_EQ(ServiceStatus(), "processing");
    for (const PauseRow &row : kPauses) {
        PutFile(kStatusFile, row.status);
        EXPECT_EQ(ServiceStatus(), row.expected) << row.status;
    }
}

TEST_F(ServiceStatusTest, ATakenOverQueueAloneIsWork) {
    SetFolders({"/photos/trip"});
    PutFile(kPhotoTaken, "");
    EXPECT_EQ(ServiceStatus(), "processing");
}

TEST_F(ServiceStatusTest, TheQueuesAreNotRead) {
    SetFolders({"/photos/trip"});
    PutFile(kPhotoQueue, "malformed\n");
    PutFile(kPhotoTaken, Event("/volume1/photos/other"));
    Fault::Count(Call::Open);
    EXPECT_EQ(ServiceStatus(), "processing");
    for (const CallInfo &call : Fault::Log(Call::Open)) {
        EXPECT_NE(call.path, kPhotoQueue);
        EXPECT_NE(call.path, kPhotoTaken);
    }
    ExpectLog({});
}

TEST_F(ServiceStatusTest, OnlyARegularFileIsAQueue) {
    SetFolders({"/photos/trip"});
    MakeDirs(kPhotoQueue);
    PutFile("/volume2/target", kWaiting);
    ASSERT_EQ(::symlink("/volume2/target", kPhotoTaken), 0);
    EXPECT_EQ(ServiceStatus(), "finished");
}

TEST_F(ServiceStatusTest, AFolderThatCannotBeIndexedDoesNotCount) {
    SetFolders({"/photos/trip"});
    PutFile(kPhotoQueue, kWaiting);
    platform.FindShare("photos")->encrypted = true;
    EXPECT_EQ(ServiceStatus(), "finished");
    EXPECT_EQ(platform.Calls("VANOEAMKDir"), 0U);
}

TEST_F(ServiceStatusTest, AFolderOfAGoneShareDoesNotCount) {
    AddShareWithFolder("a");
    SetFolders({"/a/x", "/gone/x"});
    EXPECT_EQ(ServiceStatus(), "finished");
    ExpectLog({"utils:191 GetFullPath failed, path=/gone/x"});
    ExpectError(FILEINDEX_ERR_PATH);
    PutFile("/volume1/a/@eaDir/VANO@file_index_queue", "");
    EXPECT_EQ(ServiceStatus(), "processing");
    ExpectLog({"utils:191 GetFullPath failed, path=/gone/x"});
}

TEST_F(ServiceStatusTest, AFolderWithoutAShareNameFails) {
    PutFile(kPhotoQueue, kWaiting);
    SetFolders({"", "/photos/trip"});
    EXPECT_EQ(ServiceStatus(), "failed");
    ExpectLog({"utils:389 GetShareNameByPath failed, path=",
               "status_mgr:135 Failed to get share name from path: "});
    EXPECT_EQ(platform.Calls("VANOEAMKDir"), 0U);
}

TEST_F(ServiceStatusTest, AnUnknownQueueLocationFails) {
    SetFolders({"/photos/trip"});
    PutFile(kPhotoQueue, kWaiting);
    platform.Answer("VANOShareGet", {0, 0, 0, -1});
    EXPECT_EQ(ServiceStatus(), "failed");
    ExpectLog({"utils:772 VANOShareGet failed, name=photos, code=0",
               "status_mgr:146 FILEIDXQueuePathGet failed, share=photos"});
}

TEST_F(ServiceStatusTest, EveryShareIsLookedAtOnceInByteOrder) {
    for (const char *share : {"b", "a", "B"}) {
        AddShareWithFolder(share);
    }
    MakeDirs("/volume1/b/y");
    SetFolders({"/b/y", "/b/x", "/a/x", "/B/x"});
    EXPECT_EQ(ServiceStatus(), "finished");
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/B/@eaDir)",
                                       "VANOEAMKDir(0, /volume1/a/@eaDir)",
                                       "VANOEAMKDir(0, /volume1/b/@eaDir)"));
}

TEST_F(ServiceStatusTest, TheFirstWaitingShareEndsTheScan) {
    AddShareWithFolder("a");
    AddShareWithFolder("b");
    SetFolders({"/a/x", "/b/x"});
    PutFile("/volume1/a/@eaDir/VANO@file_index_queue.tmp", "");
    EXPECT_EQ(ServiceStatus(), "processing");
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/a/@eaDir)"));
}

TEST_F(ServiceStatusTest, ALaterShareIsWorkToo) {
    AddShareWithFolder("a");
    AddShareWithFolder("b");
    SetFolders({"/a/x", "/b/x"});
    PutFile("/volume1/b/@eaDir/VANO@file_index_queue", "");
    SetResumeTime(0);
    EXPECT_EQ(ServiceStatus(), "paused");
}

TEST_F(ServiceStatusTest, ThePauseIsReadOnlyWhenWorkWaits) {
    SetFolders({"/photos/trip"});
    PutFile(kStatusFile, R"({"resume_time":"0"})");
    EXPECT_EQ(ServiceStatus(), "finished");
    ExpectLog({});
    PutFile(kPhotoQueue, kWaiting);
    EXPECT_EQ(ServiceStatus(), "failed");
    ExpectLog({"status:66 json exception"});
}

TEST_F(ServiceStatusTest, AnUnreadableStatusFileFailsWhenWorkWaits) {
    SetFolders({"/photos/trip"});
    PutFile(kStatusFile, "");
    PutFile(kPhotoQueue, kWaiting);
    EXPECT_EQ(ServiceStatus(), "failed");
    ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/status.conf"});
    ExpectError(FILEINDEX_ERR_LOAD);
}

TEST_F(ServiceStatusTest, SharesOutOfSpaceAreNotMentioned) {
    SetFolders({"/photos/trip"});
    PutFile(kStatusFile, R"({"no_space":{"photos":true}})");
    EXPECT_EQ(ServiceStatus(), "finished");
    PutFile(kPhotoQueue, kWaiting);
    EXPECT_EQ(ServiceStatus(), "processing");
}

TEST_F(ServiceStatusTest, AnEndedPauseStaysInTheFile) {
    SetFolders({"/photos/trip"});
    SetResumeTime(kNow - 1);
    PutFile(kPhotoQueue, kWaiting);
    EventTrace::Get().Clear();
    EventTrace::Get().WatchFile(kStatusFile);
    Fault::Count(Call::Flock);
    EXPECT_EQ(StatusOf(), "processing");
    EXPECT_EQ(ServiceStatus(), "processing");
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/photos/@eaDir)",
                                       "VANOEAMKDir(0, /volume1/photos/@eaDir)"));
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
    EXPECT_EQ(ReadText(kStatusFile), R"({"resume_time":1699999999})");
}

TEST_F(ServiceStatusTest, AskingTakesNoLock) {
    SetFolders({"/photos/trip"});
    PutFile(kPhotoQueue, kWaiting);
    const HoldLock queueLock(kPhotoQueue);
    const HoldLock statusLock(kStatusLock);
    const HoldLock folderLock(kFolderLock);
    EXPECT_EQ(ServiceStatus(), "processing");
}

} // namespace

} // namespace VANO::TESTS
