// The locked operations on status.conf and the commands that they send to the daemon.

#include "support/fixture.h"

#include <climits>
#include <functional>
#include <json/json.h>
#include <sys/file.h>

#include <fileindex/status_mgr.h>

namespace VANO::TESTS {

namespace {

constexpr long long kNow = 1700000000;

class StatusMgrTest : public LibraryTest {
  protected:
    static void SetClock(long long now) {
        Fault::On(Call::Time, [now](CallInfo &) { return static_cast<long>(now); });
    }

    // Records when the lock is taken and released, the file changes and commands arrive.
    static void Watch() {
        EventTrace::Get().Clear();
        EventTrace::Get().WatchFile(kStatusFile);
        Fault::Record(Call::Flock);
    }

    static std::string Locked() { return LockCall(LOCK_EX | LOCK_NB); }
    static std::string Unlocked() { return LockCall(LOCK_UN); }
    static std::string Saved() { return std::string("file: ") + kStatusFile; }

  private:
    static std::string LockCall(int operation) {
        return std::string("flock(") + kStatusLock + ", " + std::to_string(operation) + ")";
    }
};

struct Writer {
    const char *name;
    std::function<bool()> run;
    const char *saved;   // status.conf after it ran on an empty one
    const char *command; // null when the daemon is not told
    int failureLine;
};

void PrintTo(const Writer &writer, std::ostream *out) {
    *out << writer.name;
}

const std::vector<Writer> &Writers() {
    static const std::vector<Writer> kWriters = {
        {"Pause", [] { return StatusMgr::Pause(0); }, R"({"resume_time":0})",
         R"({"data":{"resume_time":0},"type":"pause"})", 198},
        {"Resume", [] { return StatusMgr::Resume(); }, R"({"resume_time":-1})",
         R"({"data":{},"type":"resume"})", 221},
        {"ShareRevive", [] { return StatusMgr::ShareRevive("photos"); }, R"({})",
         R"({"data":{"share_name":"photos"},"type":"revive_share_worker"})", 321},
        {"ShareSetNoSpace", [] { return StatusMgr::ShareSetNoSpace("photos", true); },
         R"({"no_space":{"photos":true}})", nullptr, 0},
        {"ShareClearNoSpace", [] { return StatusMgr::ShareSetNoSpace("photos", false); }, R"({})",
         nullptr, 0},
        {"ShareSetNeedReindex", [] { return StatusMgr::ShareSetNeedReindex("photos", true); },
         R"({"need_reindex":{"photos":true}})", nullptr, 0},
        {"ShareClearNeedReindex", [] { return StatusMgr::ShareSetNeedReindex("photos", false); },
         R"({})", nullptr, 0},
        {"SetUpdated", [] { return StatusMgr::SetUpdated("step"); }, R"({"step":true})", nullptr,
         0},
    };
    return kWriters;
}

class StatusMgrWriterTest : public StatusMgrTest, public ::testing::WithParamInterface<Writer> {};

TEST_P(StatusMgrWriterTest, SavesAndTellsTheDaemonUnderTheLock) {
    DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(GetParam().run());
    std::vector<std::string> expected = {Locked()};
    if (platform.Calls("VLIBCExecv") > 0) {
        ASSERT_EQ(Effects().size(), 4U);
        expected.push_back(Effects()[1]);
        EXPECT_EQ(expected.back().rfind("VLIBCExecv(", 0), 0U);
    }
    expected.push_back(Saved());
    if (GetParam().command != nullptr) {
        expected.push_back(std::string("socket: ") + GetParam().command);
    }
    expected.push_back(Unlocked());
    EXPECT_EQ(Effects(), expected);
    EXPECT_EQ(ReadJson(kStatusFile), Json(GetParam().saved));
    EXPECT_EQ(ModeOf(kStatusFile), 0644U);
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_P(StatusMgrWriterTest, KeepsEverythingElseInTheFile) {
    PutFile(kStatusFile, R"({"resume_time":-1,"no_space":{"a":true},"need_reindex":{"b":true},
                             "old_step":true,"unknown":[1,{"x":null}]})");
    Json::Value expected = ReadJson(kStatusFile);
    const Json::Value changed = Json(GetParam().saved);
    for (const std::string &member : changed.getMemberNames()) {
        if (!changed[member].isObject()) {
            expected[member] = changed[member];
            continue;
        }
        for (const std::string &share : changed[member].getMemberNames()) {
            expected[member][share] = changed[member][share];
        }
    }
    DaemonPeer daemon;
    EXPECT_TRUE(GetParam().run());
    EXPECT_EQ(ReadJson(kStatusFile), expected);
}

TEST_P(StatusMgrWriterTest, ABusyLockChangesNothing) {
    DaemonPeer daemon;
    const HoldLock lock(kStatusLock);
    EventTrace::Get().Clear();
    EXPECT_FALSE(GetParam().run());
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({"config:74 Failed to lock folder"});
    EXPECT_FALSE(Exists(kStatusFile));
    EXPECT_THAT(daemon.Connections(), IsEmpty());
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 0U);
    ExpectLeakedDescriptors(2); // all attempts but the last, which is unlocked
}

TEST_P(StatusMgrWriterTest, AFailedLockIsUnlockedToo) {
    const HoldLock lock(kStatusLock);
    Watch();
    EXPECT_FALSE(GetParam().run());
    EXPECT_THAT(Effects(), ElementsAre(Locked(), Locked(), Locked(),
                                       "log: config:74 Failed to lock folder", Unlocked()));
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({"config:74 Failed to lock folder"});
    ExpectLeakedDescriptors(2);
}

TEST_P(StatusMgrWriterTest, ASharedLockOfAnotherKeepsItOut) {
    const HoldLock lock(kStatusLock, false);
    EXPECT_FALSE(GetParam().run());
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({"config:74 Failed to lock folder"});
    ExpectLeakedDescriptors(2);
}

TEST_P(StatusMgrWriterTest, AnUnreadableFileStaysAsItIs) {
    PutFile(kStatusFile, "{\"resume_time\":");
    DaemonPeer daemon;
    EXPECT_FALSE(GetParam().run());
    ExpectError(FILEINDEX_ERR_LOAD);
    ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/status.conf"});
    EXPECT_EQ(ReadText(kStatusFile), "{\"resume_time\":");
    EXPECT_THAT(daemon.Connections(), IsEmpty());
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 0U);
}

TEST_P(StatusMgrWriterTest, AFailedSaveTellsNobody) {
    PutFile(kStatusFile, "{\"old\":true}");
    DaemonPeer daemon;
    Fault::FailAlways(Call::Mkostemp, ENOSPC);
    EXPECT_FALSE(GetParam().run());
    ExpectError(FILEINDEX_ERR_SAVE);
    ExpectLog({"config:38 Failed to save json to /usr/vano/etc/fileindex/status.conf"});
    EXPECT_EQ(ReadText(kStatusFile), "{\"old\":true}");
    EXPECT_THAT(daemon.Connections(), IsEmpty());
}

TEST_P(StatusMgrWriterTest, WithoutADaemonTheChangeStaysOnDisk) {
    Watch();
    const bool toldNobody = GetParam().command == nullptr;
    EXPECT_EQ(GetParam().run(), toldNobody);
    EXPECT_EQ(ReadJson(kStatusFile), Json(GetParam().saved));
    ExpectError(FILEINDEX_ERR_NONE);
    if (toldNobody) {
        ExpectLog({});
        return;
    }
    const std::string message =
        "status_mgr:" + std::to_string(GetParam().failureLine) + " SendCammandToDaemon failed";
    EXPECT_THAT(Effects(), ElementsAre(Locked(), Saved(), "log: " + message, Unlocked()));
    ExpectLog({message});
}

TEST_P(StatusMgrWriterTest, AnExceptionPassesWithTheLockReleased) {
    PutFile(kStatusFile, "[]");
    DaemonPeer daemon;
    Watch();
    EXPECT_THROW((void)GetParam().run(), Json::Exception);
    EXPECT_THAT(Effects(), ElementsAre(Locked(), Unlocked()));
    EXPECT_FALSE(IsLocked(kStatusLock));
    EXPECT_EQ(ReadText(kStatusFile), "[]");
}

INSTANTIATE_TEST_SUITE_P(All, StatusMgrWriterTest, ::testing::ValuesIn(Writers()),
                         [](const auto &row) { return row.param.name; });

TEST_F(StatusMgrTest, AMarkOfAnotherShapeThrowsWithTheLockReleased) {
    PutFile(kStatusFile, R"({"no_space":5,"need_reindex":"x"})");
    DaemonPeer daemon;
    EXPECT_THROW((void)StatusMgr::ShareSetNoSpace("a", true), Json::Exception);
    EXPECT_FALSE(IsLocked(kStatusLock));
    EXPECT_THROW((void)StatusMgr::ShareRevive("a"), Json::Exception);
    EXPECT_FALSE(IsLocked(kStatusLock));
    EXPECT_THROW((void)StatusMgr::ShareSetNeedReindex("a", true), Json::Exception);
    EXPECT_FALSE(IsLocked(kStatusLock));
    EXPECT_EQ(ReadText(kStatusFile), R"({"no_space":5,"need_reindex":"x"})");
    EXPECT_THAT(daemon.Connections(), IsEmpty());
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 0U);
}

TEST_F(StatusMgrTest, ALockThatComesFreeIsTaken) {
    int attempts = 0;
    Fault::FailWhen(Call::Flock, EAGAIN, [&](const CallInfo &info) {
        return (info.number & LOCK_EX) != 0 && ++attempts != 3;
    });
    EXPECT_TRUE(StatusMgr::SetUpdated("step"));
    EXPECT_EQ(attempts, 3);
    EXPECT_TRUE(StatusMgr::IsUpdated("step"));
    ExpectLeakedDescriptors(2);
}

TEST_F(StatusMgrTest, AMissingDirectoryForTheFileFailsTheSave) {
    RemoveTree(kSettingsDirectory);
    EXPECT_FALSE(StatusMgr::SetUpdated("step"));
    ExpectError(FILEINDEX_ERR_SAVE);
    ExpectLog({"config:38 Failed to save json to /usr/vano/etc/fileindex/status.conf"});
}

TEST_F(StatusMgrTest, APauseEndsHoursFromNowIn32Bits) {
    const struct {
        long long now;
        int hours;
        long long resumeTime;
    } kRows[] = {
        {kNow, 0, 0},
        {kNow, 1, kNow + 3600},
        {kNow, 24, kNow + 86400},
        {2147480047, 1, 2147483647},       // the last second of 32 bits
        {2147480048, 1, -2147483648LL},    // and one beyond
        {2000000000, 100000, -1934967296}, // 2360000000 wraps
        {kNow, INT_MAX, kNow - 3600},      // the product wraps as well
        {kNow, 596523, -447484496},        // the smallest product beyond 32 bits
        {4294967301, 1, 3605},             // a clock beyond 32 bits is cut
        {2147483648, 1, -2147483648LL + 3600},
    };
    DaemonPeer daemon;
    for (const auto &row : kRows) {
        daemon.Clear();
        SetClock(row.now);
        EXPECT_TRUE(StatusMgr::Pause(row.hours)) << row.hours;
        long long resumeTime = 77;
        EXPECT_TRUE(StatusMgr::GetPauseInfo(resumeTime));
        EXPECT_EQ(resumeTime, row.resumeTime) << row.now << " + " << row.hours << " h";
        EXPECT_THAT(daemon.Commands(),
                    ElementsAre(R"({"data":{"resume_time":)" + std::to_string(row.resumeTime) +
                                R"(},"type":"pause"})"));
    }
}

TEST_F(StatusMgrTest, APauseCountsFromBeforeItHeldTheLock) {
    DaemonPeer daemon;
    Fault::Record(Call::Time);
    Watch();
    EXPECT_TRUE(StatusMgr::Pause(1));
    const std::vector<std::string> effects = Effects();
    ASSERT_GE(effects.size(), 2U);
    EXPECT_EQ(effects[0].rfind("time(", 0), 0U) << effects[0];
    EXPECT_EQ(effects[1], Locked());
    EXPECT_EQ(Fault::Calls(Call::Time), 1U);
}

TEST_F(StatusMgrTest, ANegativePauseTouchesNothing) {
    DaemonPeer daemon;
    for (const int hours : {-1, INT_MIN}) {
        EXPECT_FALSE(StatusMgr::Pause(hours));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
    }
    ExpectLog({});
    EXPECT_FALSE(Exists(kStatusFile));
    EXPECT_FALSE(Exists(kStatusLock)) << "no lock is taken";
    EXPECT_THAT(daemon.Connections(), IsEmpty());
}

TEST_F(StatusMgrTest, ResumeReplacesAnyPause) {
    DaemonPeer daemon;
    EXPECT_TRUE(StatusMgr::Pause(0));
    EXPECT_TRUE(StatusMgr::Resume());
    long long resumeTime = 77;
    EXPECT_TRUE(StatusMgr::GetPauseInfo(resumeTime));
    EXPECT_EQ(resumeTime, -1);
    EXPECT_EQ(ReadJson(kStatusFile), Json(R"({"resume_time":-1})"));
    EXPECT_TRUE(daemon.Messages()[1]["data"].isObject());
}

TEST_F(StatusMgrTest, ReviveClearsTheMarkBeforeTheDaemonHears) {
    PutFile(kStatusFile,
            R"({"no_space":{"photos":true,"video":true},"need_reindex":{"photos":true}})");
    DaemonPeer daemon;
    Watch();
    EXPECT_TRUE(StatusMgr::ShareRevive("photos"));
    EXPECT_THAT(
        Effects(),
        ElementsAre(Locked(), Saved(),
                    R"(socket: {"data":{"share_name":"photos"},"type":"revive_share_worker"})",
                    Unlocked()));
    EXPECT_EQ(ReadJson(kStatusFile),
              Json(R"({"no_space":{"video":true},"need_reindex":{"photos":true}})"));
}

TEST_F(StatusMgrTest, ShareNamesReachTheDaemonByteForByte) {
    DaemonPeer daemon;
    for (const std::string share : {"", "a \"b\"\\", "gr\xc3\xbc\xc3\x9f", "\xff\xfe"}) {
        daemon.Clear();
        EXPECT_TRUE(StatusMgr::ShareRevive(share));
        ASSERT_EQ(daemon.Messages().size(), 1U);
        EXPECT_EQ(daemon.Messages()[0]["data"]["share_name"].asString(), share);
    }
}

TEST_F(StatusMgrTest, OutOfSpaceIsToldOnceAcrossCalls) {
    EXPECT_TRUE(StatusMgr::ShareSetNoSpace("a", true));
    EXPECT_TRUE(StatusMgr::ShareSetNoSpace("a", true));
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 1U);
    EXPECT_TRUE(StatusMgr::ShareIsNoSpace("a"));
    EXPECT_FALSE(StatusMgr::ShareIsNoSpace("b"));
    EXPECT_TRUE(StatusMgr::ShareSetNoSpace("a", false));
    EXPECT_FALSE(StatusMgr::ShareIsNoSpace("a"));
    EXPECT_TRUE(StatusMgr::ShareSetNoSpace("a", true));
    EXPECT_EQ(platform.Calls("VLIBCExecv"), 2U);
}

TEST_F(StatusMgrTest, AFailedNotificationDoesNotFailTheMark) {
    platform.AnswerAlways("VLIBCExecv", 1);
    EXPECT_TRUE(StatusMgr::ShareSetNoSpace("a", true));
    ExpectLog({"status:88 NotifyNoSpace failed"});
    EXPECT_TRUE(StatusMgr::ShareIsNoSpace("a"));
}

TEST_F(StatusMgrTest, AMarkIsReadBack) {
    EXPECT_FALSE(StatusMgr::ShareIsNeedReindex("a"));
    EXPECT_TRUE(StatusMgr::ShareSetNeedReindex("a", true));
    EXPECT_TRUE(StatusMgr::ShareIsNeedReindex("a"));
    EXPECT_FALSE(StatusMgr::ShareIsNoSpace("a"));
    EXPECT_TRUE(StatusMgr::ShareSetNeedReindex("a", false));
    EXPECT_FALSE(StatusMgr::ShareIsNeedReindex("a"));
    EXPECT_FALSE(StatusMgr::IsUpdated("step"));
    EXPECT_TRUE(StatusMgr::SetUpdated("step"));
    EXPECT_TRUE(StatusMgr::IsUpdated("step"));
}

TEST_F(StatusMgrTest, ReadersTakeNoLockAndWriteNothing) {
    PutFile(kStatusFile,
            R"({"resume_time":5,"no_space":{"a":true},"need_reindex":{"a":true},"step":true})");
    Watch();
    long long resumeTime = 77;
    EXPECT_TRUE(StatusMgr::GetPauseInfo(resumeTime));
    EXPECT_EQ(resumeTime, 5);
    EXPECT_TRUE(StatusMgr::ShareIsNoSpace("a"));
    EXPECT_TRUE(StatusMgr::ShareIsNeedReindex("a"));
    EXPECT_TRUE(StatusMgr::IsUpdated("step"));
    EXPECT_THAT(Effects(), IsEmpty());
    EXPECT_FALSE(Exists(kStatusLock));
}

TEST_F(StatusMgrTest, ReadersOfAMissingFileFindNothing) {
    long long resumeTime = 77;
    EXPECT_TRUE(StatusMgr::GetPauseInfo(resumeTime));
    EXPECT_EQ(resumeTime, -1);
    EXPECT_FALSE(StatusMgr::ShareIsNoSpace("a"));
    EXPECT_FALSE(StatusMgr::ShareIsNeedReindex("a"));
    EXPECT_FALSE(StatusMgr::IsUpdated("step"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(StatusMgrTest, ReadersOfAnUnreadableFileAnswerNo) {
    PutFile(kStatusFile, R"({"resume_time":5,"no_space":{"a":true}} trailing)");
    const char *const kFailed =
        "config:22 Failed to load json from /usr/vano/etc/fileindex/status.conf";
    long long resumeTime = 77;
    EXPECT_FALSE(StatusMgr::GetPauseInfo(resumeTime));
    EXPECT_EQ(resumeTime, 77);
    EXPECT_FALSE(StatusMgr::ShareIsNoSpace("a"));
    EXPECT_FALSE(StatusMgr::ShareIsNeedReindex("a"));
    EXPECT_FALSE(StatusMgr::IsUpdated("step"));
    ExpectLog({kFailed, kFailed, kFailed, kFailed});
    ExpectError(FILEINDEX_ERR_LOAD);
}

TEST_F(StatusMgrTest, ReadersOfAnotherShapeAnswerNo) {
    PutFile(kStatusFile, "[1]");
    long long resumeTime = 77;
    EXPECT_FALSE(StatusMgr::GetPauseInfo(resumeTime));
    EXPECT_EQ(resumeTime, 77);
    ExpectLog({"status:66 json exception"});
    EXPECT_FALSE(StatusMgr::ShareIsNoSpace("a"));
    EXPECT_FALSE(StatusMgr::ShareIsNeedReindex("a"));
    EXPECT_FALSE(StatusMgr::IsUpdated("step"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(StatusMgrTest, AStepMarkThatConvertsToNoBooleanThrows) {
    PutFile(kStatusFile, R"({"step":"true"})");
    EXPECT_THROW((void)StatusMgr::IsUpdated("step"), Json::Exception);
    EXPECT_FALSE(StatusMgr::IsUpdated("other"));
    EXPECT_FALSE(Exists(kStatusLock));
}

TEST_F(StatusMgrTest, EachCallReadsTheFileAnew) {
    for (const bool marked : {true, false, true}) {
        PutFile(kStatusFile,
                marked ? R"({"resume_time":0,"no_space":{"a":true},"need_reindex":{"a":true},
                             "step":true})"
                       : "{}");
        long long resumeTime = 77;
        EXPECT_TRUE(StatusMgr::GetPauseInfo(resumeTime));
        EXPECT_EQ(resumeTime, marked ? 0 : -1);
        EXPECT_EQ(StatusMgr::ShareIsNoSpace("a"), marked);
        EXPECT_EQ(StatusMgr::ShareIsNeedReindex("a"), marked);
        EXPECT_EQ(StatusMgr::IsUpdated("step"), marked);
    }
}

} // namespace

} // namespace VANO::TESTS
