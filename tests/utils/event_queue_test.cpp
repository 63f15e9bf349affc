// Appending an event to a share's queue, and the mark that stands in for one that cannot be.

#include <fileindex/event_queue.h>

#include "support/fixture.h"

#include <climits>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <set>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <thread>
#include <unistd.h>

namespace VANO::TESTS {

namespace {

constexpr char kTrip[] = "/volume1/photos/trip";
constexpr char kTripLine[] = R"({"data":{},"event":131072,"path":"/volume1/photos/trip"})"
                             "\n";

bool AddTrip() {
    return AddCustomEvent(kSettingEvent, kTrip, Json::Value(Json::objectValue));
}

class EventQueueTest : public LibraryTest {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        platform.AddShare("photos", "/volume1/photos");
        MakeDirs("/volume1/photos/@eaDir");
        EventTrace::Get().Clear();
    }

    // The event was replaced by the mark, with nothing else in the status file.
    static void ExpectMark(const std::string &share) {
        Json::Value expected(Json::objectValue);
        expected["need_reindex"][share] = true;
        EXPECT_EQ(ReadJson(kStatusFile), expected);
    }

    static void ExpectNoMark() { EXPECT_FALSE(Exists(kStatusFile)); }

    // The lock on the queue fails that often; the status file's is left alone.
    static void FailQueueLock(int times, int error) {
        Fault::FailWhen(Call::Flock, error, [times](const CallInfo &info) mutable {
            return info.path == kPhotoQueue && (info.number & LOCK_EX) != 0 && times-- > 0;
        });
    }

    static std::size_t QueueCalls(Call call) {
        std::size_t calls = 0;
        for (const CallInfo &info : Fault::Log(call)) {
            calls += info.path == kPhotoQueue ? 1 : 0;
        }
        return calls;
    }
};

// --- the line -------------------------------------------------------------------------------

TEST_F(EventQueueTest, AppendsOneLineOfJson) {
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoQueue), kTripLine);
    EXPECT_TRUE(AddCustomEvent(kReindexEvent, "/volume1/photos/x", Json(R"({"a":[1,null]})")));
    EXPECT_EQ(ReadText(kPhotoQueue),
              std::string(kTripLine) +
                  R"({"data":{"a":[1,null]},"event":65536,"path":"/volume1/photos/x"})"
                  "\n");
    EXPECT_FALSE(Exists(kPhotoTaken));
    ExpectNoMark();
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(EventQueueTest, AnyEventIsOneLineThatReadsBack) {
    const std::string paths[] = {"/volume1/photos", "/volume1/photos/a \"b\"\\\nc",
                                 "/volume1/photos/gr\xc3\xbc\xc3\x9f", "/volume1/photos/\xff\xfe"};
    for (const int event : {0, 1, -1, INT_MIN, INT_MAX, kSettingEvent}) {
        for (const std::string &path : paths) {
            for (const char *data :
                 {"null", "{}", "[]", "\"a\\nb\"", "-5", "{\"\xff\":\"\xfe\"}"}) {
                RemoveTree(kPhotoQueue);
                EXPECT_TRUE(AddCustomEvent(event, path, Json(data)));
                const std::string text = ReadText(kPhotoQueue);
                EXPECT_EQ(text.find('\n'), text.size() - 1) << text;
                const Json::Value line = Json(text);
                EXPECT_THAT(line.getMemberNames(), ElementsAre("data", "event", "path"));
                EXPECT_EQ(line["event"].asInt(), event);
                EXPECT_EQ(line["path"].asString(), path);
                EXPECT_EQ(line["data"], Json(data));
            }
        }
    }
}

TEST_F(EventQueueTest, WhatIsThereStays) {
    PutFile(kPhotoQueue, "not an event\n{\"half\":");
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoQueue), std::string("not an event\n{\"half\":") + kTripLine);
    ExpectLog({});
}

TEST_F(EventQueueTest, ANewQueueHasTheModeThatTheUmaskLeaves) {
    for (const mode_t mask : {022U, 0U, 077U}) {
        RemoveTree(kPhotoQueue);
        const mode_t old = ::umask(mask);
        EXPECT_TRUE(AddTrip());
        ::umask(old);
        EXPECT_EQ(ModeOf(kPhotoQueue), 0666U & ~mask);
    }
}

TEST_F(EventQueueTest, TheModeOfAnExistingQueueStays) {
    PutFile(kPhotoQueue, "");
    ASSERT_EQ(::chmod(kPhotoQueue, 0600), 0);
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ModeOf(kPhotoQueue), 0600U);
}

TEST_F(EventQueueTest, WritesOnceUnderTheLock) {
    Fault::Record(Call::Open);
    Fault::Record(Call::Flock);
    Fault::Record(Call::Write);
    Fault::Record(Call::Close);
    EXPECT_TRUE(AddTrip());
    const std::string queue = kPhotoQueue;
    EXPECT_THAT(
        platform.Trace(),
        ElementsAre("VANOShareNamePathGet(/volume1/photos/trip, 492, 4096)", "VANOShareGet(photos)",
                    "VANOEAMKDir(0, /volume1/photos/@eaDir)", "VANOShareFree(photos)",
                    StartsWith("open(" + queue + ", "),
                    "flock(" + queue + ", " + std::to_string(LOCK_EX | LOCK_NB) + ")",
                    "write(" + queue + ", " + std::to_string(std::string(kTripLine).size()) + ")",
                    "flock(" + queue + ", " + std::to_string(LOCK_UN) + ")", "close(" + queue + ")",
                    "close(/volume1/photos/@eaDir)"));
    const long flags = Fault::Log(Call::Open)[0].number;
    EXPECT_EQ(flags & O_ACCMODE, O_WRONLY);
    for (const int flag : {O_APPEND, O_CREAT, O_NOFOLLOW, O_NONBLOCK, O_NOCTTY, O_CLOEXEC}) {
        EXPECT_EQ(flags & flag, flag);
    }
    EXPECT_EQ(flags & O_TRUNC, 0);
}

TEST_F(EventQueueTest, TheMetadataDirectoryIsMadeFirst) {
    RemoveTree("/volume1/photos/@eaDir");
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoQueue), kTripLine);
}

TEST_F(EventQueueTest, TheQueueBelongsToTheShareOfThePath) {
    platform.AddShare("video", "/volume2/video");
    EXPECT_TRUE(AddCustomEvent(kSettingEvent, "/volume2/video/x", Json("{}")));
    EXPECT_TRUE(Exists("/volume2/video/@eaDir/VANO@file_index_queue"));
    EXPECT_FALSE(Exists(kPhotoQueue));
}

// --- a pending re-index ---------------------------------------------------------------------

struct PendingRow {
    std::string line; // without its newline
    bool covers;
};

const std::vector<PendingRow> &PendingRows() {
    static const std::vector<PendingRow> kRows = {
        {R"({"event":65536,"path":"/volume1/photos/trip","data":{}})", true},
        {R"({"path":"/volume1/photos/trip","event":65536})", true},
        {R"({"event":65536.0,"path":"/volume1/photos/trip"})", true},
        {R"({"event":1,"path":"/volume1/photos/trip","event":65536})", true},
        {R"({"event":65536,"path":"\/volume1\/photos\/trip"})"
         "\r",
         true},
        {R"({"event":65536,"path":"\u002fvolume1/photos/\u0074rip"})", true},
        {R"({"event":131072,"path":"/volume1/photos/trip"})", false},
        {R"({"event":65536,"path":"/volume1/photos","data":"/volume1/photos/trip"})", false},
        {R"({"event":65536,"path":"/volume1/photos","data":"\n"})", false},
        {R"({"event":256,"path":"/volume1/photos/trip"})", false},
        {R"({"event":256,"path":"/x","path_old":"/volume1/photos/trip"})", false},
        {R"({"event":65536,"path":"/volume1/photos"})", false},
        {R"({"event":65536,"path":"/volume1/photos/trip/"})", false},
        {R"({"event":65536,"path":"/volume1/photos/trip/a"})", false},
        {R"({"event":65536,"path":"/volume1/photos/Trip"})", false},
        {R"({"event":65536,"path":"/volume1/photos/tri"})", false},
        {R"({"event":"65536","path":"/volume1/photos/trip"})", false},
        {R"({"event":true,"path":"/volume1/photos/trip"})", false},
        {R"({"event":null,"path":"/volume1/photos/trip"})", false},
        {R"({"event":-65536,"path":"/volume1/photos/trip"})", false},
        {R"({"event":4295032832,"path":"/volume1/photos/trip"})", false}, // 65536 in 32 bits
        {R"({"event":65536,"path":["/volume1/photos/trip"]})", false},
        {R"({"event":65536})", false},
        {R"({"path":"/volume1/photos/trip"})", false},
        {R"([{"event":65536,"path":"/volume1/photos/trip"}])", false},
        {R"({"event":65536,"path":"/volume1/photos/trip"} x)", false},
        {R"({"event":65536,"path":"/volume1/photos/trip"} // c)", false},
        {R"({"event":65536,"path":"/volume1/photos/trip","event":1})", false},
        {R"({"event":65536,"path":"/volume1/photos/trip","data":)" + std::string(5000, '[') +
             std::string(5000, ']') + "}",
         false},
        {"", false},
        {"\xff\xfe", false},
    };
    return kRows;
}

TEST_F(EventQueueTest, APendingReindexOfThePathCoversAnyEvent) {
    for (const PendingRow &row : PendingRows()) {
        for (const int event : {kReindexEvent, kSettingEvent, 0, -1}) {
            for (const std::string &text :
                 {row.line, row.line + "\n", "\nmalformed\n" + row.line + "\nlast\n"}) {
                PutFile(kPhotoQueue, text);
                EXPECT_TRUE(AddCustomEvent(event, kTrip, Json("{}")));
                EXPECT_EQ(ReadText(kPhotoQueue) == text, row.covers) << text;
            }
        }
    }
    ExpectLog({});
}

TEST_F(EventQueueTest, APendingReindexInTheTakenOverQueueCoversToo) {
    for (const PendingRow &row : PendingRows()) {
        RemoveTree(kPhotoQueue);
        PutFile(kPhotoTaken, row.line + "\n");
        EXPECT_TRUE(AddTrip());
        EXPECT_EQ(Exists(kPhotoQueue), !row.covers) << row.line;
        EXPECT_EQ(ReadText(kPhotoTaken), row.line + "\n") << "belongs to the daemon";
    }
    ExpectLog({});
    ExpectNoMark();
}

TEST_F(EventQueueTest, AFoundReindexSparesTheTakenOverQueue) {
    PutFile(kPhotoQueue, PendingRows()[0].line + "\n");
    PutFile(kPhotoTaken, "");
    Fault::Count(Call::Open);
    EXPECT_TRUE(AddTrip());
    ASSERT_EQ(Fault::Calls(Call::Open), 1U);
    EXPECT_EQ(Fault::Log(Call::Open)[0].path, kPhotoQueue);
}

TEST_F(EventQueueTest, APathOfOtherBytesIsAnotherPath) {
    EXPECT_TRUE(AddCustomEvent(kReindexEvent, "/volume1/photos/\xff", Json("{}")));
    const std::string text = ReadText(kPhotoQueue);
    EXPECT_TRUE(AddCustomEvent(kSettingEvent, "/volume1/photos/\xff", Json("{}")));
    EXPECT_EQ(ReadText(kPhotoQueue), text);
    EXPECT_TRUE(AddCustomEvent(kSettingEvent, "/volume1/photos/\xfe", Json("{}")));
    EXPECT_NE(ReadText(kPhotoQueue), text);
}

TEST_F(EventQueueTest, AQueueThatCannotBeReadIsLoggedAndAppendedTo) {
    const std::string covered = PendingRows()[0].line + "\n";
    for (const std::string queue : {kPhotoQueue, kPhotoTaken}) {
        RemoveTree(kPhotoQueue);
        PutFile(queue, covered);
        Fault::FailWhen(Call::Open, EACCES, [queue](const CallInfo &info) {
            return info.path == queue && (info.number & O_ACCMODE) == O_RDONLY;
        });
        EXPECT_TRUE(AddTrip());
        ExpectLog({"utils:95 Failed to open queue=" + queue + ", reason=Permission denied"});
        EXPECT_EQ(ReadText(kPhotoQueue), queue == kPhotoQueue ? covered + kTripLine : kTripLine);
        Fault::Reset();
        RemoveTree(queue);
    }
    ExpectNoMark();
}

// --- the mark in place of the event ---------------------------------------------------------

TEST_F(EventQueueTest, APathOutsideAnyShareMarksTheEmptyShare) {
    for (const std::string path : {"/elsewhere/trip", "", "/volume1", "/volume1/photos2/a"}) {
        RemoveTree(kStatusFile);
        EXPECT_FALSE(AddCustomEvent(kSettingEvent, path, Json("{}")));
        ExpectLog({"utils:472 VANOShareNamePathGet failed, path=" + path});
        ExpectMark("");
    }
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_EQ(platform.Calls("VANOShareGet"), 0U);
}

TEST_F(EventQueueTest, AnUnknownQueueLocationMarksTheShare) {
    platform.Answer("VANOShareGet", {-1});
    EXPECT_FALSE(AddTrip());
    ExpectLog({"utils:772 VANOShareGet failed, name=photos, code=0",
               "utils:478 FILEIDXQueuePathGet failed, share=photos"});
    ExpectMark("photos");
    EXPECT_FALSE(Exists(kPhotoQueue));
}

TEST_F(EventQueueTest, AQueueThatCannotBeOpenedMarksTheShareWithoutAMessage) {
    for (const int level : {3, 7}) {
        LOG_LEVEL = level;
        RemoveTree(kStatusFile);
        Fault::Count(Call::Flock);
        Fault::FailPath(Call::Open, "VANO@file_index_queue", EACCES);
        EXPECT_FALSE(AddTrip());
        EXPECT_EQ(QueueCalls(Call::Open), 1U) << "tried again";
        Fault::Reset();
        ExpectMark("photos");
        ExpectLog({});
    }
    EXPECT_FALSE(Exists(kPhotoQueue));
}

TEST_F(EventQueueTest, AMissingMetadataDirectoryMarksTheShare) {
    RemoveTree("/volume1/photos/@eaDir");
    platform.AnswerAlways("VANOEAMKDir", -1);
    EXPECT_FALSE(AddTrip());
    ExpectLog({"utils:779 VANOEAMKDir failed, path=/volume1/photos/@eaDir, code=0"});
    ExpectMark("photos");
}

TEST_F(EventQueueTest, TheMarkKeepsTheRestOfTheStatus) {
    PutFile(kStatusFile, R"({"resume_time":5,"need_reindex":{"a":true}})");
    platform.Answer("VANOShareNamePathGet", {-1});
    EXPECT_FALSE(AddTrip());
    ExpectLog({"utils:472 VANOShareNamePathGet failed, path=/volume1/photos/trip"});
    EXPECT_EQ(ReadJson(kStatusFile),
              Json(R"({"resume_time":5,"need_reindex":{"":true,"a":true}})"));
}

TEST_F(EventQueueTest, AMarkThatCannotBeSetIsLogged) {
    platform.AnswerAlways("VANOShareGet", -1);
    const HoldLock lock(kStatusLock);
    EXPECT_FALSE(AddTrip());
    ExpectLog({"utils:772 VANOShareGet failed, name=photos, code=0",
               "utils:478 FILEIDXQueuePathGet failed, share=photos",
               "config:74 Failed to lock folder",
               "utils:522 ShareSetNeedReindex failed, share=photos"});
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectNoMark();
    ExpectLeakedDescriptors(2); // of the status lock
}

TEST_F(EventQueueTest, AStatusFileOfAnotherShapeThrowsNothing) {
    for (const char *status :
         {"[]", "5", R"({"need_reindex":5})", R"({"need_reindex":["photos"]})"}) {
        PutFile(kStatusFile, status);
        platform.Answer("VANOShareNamePathGet", {-1});
        EXPECT_NO_THROW(EXPECT_FALSE(AddTrip()));
        ExpectLog({"utils:472 VANOShareNamePathGet failed, path=/volume1/photos/trip",
                   "utils:522 ShareSetNeedReindex failed, share="});
        EXPECT_EQ(ReadText(kStatusFile), status);
        EXPECT_FALSE(IsLocked(kStatusLock));
    }
}

TEST_F(EventQueueTest, ALongShareNameIsKeptWhole) {
    const std::string name(255, 's'); // as long as a directory's name can be
    platform.AddShare(name, "/volume1/" + name);
    platform.Answer("VANOShareGet", {-1});
    EXPECT_FALSE(AddCustomEvent(kSettingEvent, "/volume1/" + name + "/x", Json("{}")));
    (void)SystemLog::Get().Lines();
    ExpectMark(name);
}

// --- the lock -------------------------------------------------------------------------------

TEST_F(EventQueueTest, ABusyLockIsTriedAgainAfterAPause) {
    for (const int error : {EAGAIN, EINTR}) {
        RemoveTree(kPhotoQueue);
        Fault::Reset();
        FailQueueLock(2, error);
        Fault::Return(Call::Rand, {1234567, 29});
        Fault::Quiet(Call::Usleep);
        Fault::Count(Call::Open);
        LOG_LEVEL = 7;
        EXPECT_TRUE(AddTrip());
        EXPECT_EQ(ReadText(kPhotoQueue), kTripLine);
        EXPECT_EQ(QueueCalls(Call::Open), 3U) << "opened afresh for each attempt";
        ASSERT_EQ(Fault::Calls(Call::Usleep), 2U);
        EXPECT_EQ(Fault::Log(Call::Usleep)[0].number, 7000);
        EXPECT_EQ(Fault::Log(Call::Usleep)[1].number, 9000);
        ExpectLog({});
        ExpectNoMark();
    }
}

TEST_F(EventQueueTest, NothingIsHeldDuringThePause) {
    FailQueueLock(1, EAGAIN);
    std::vector<std::string> held;
    Fault::On(Call::Usleep, [&](CallInfo &) {
        for (const std::string &fd : NamesIn("/proc/self/fd")) {
            std::error_code error;
            const auto target = std::filesystem::read_symlink("/proc/self/fd/" + fd, error);
            if (target == kPhotoQueue) {
                held.push_back(fd);
            }
        }
        return 0;
    });
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(Fault::Calls(Call::Usleep), 1U);
    EXPECT_THAT(held, IsEmpty());
}

TEST_F(EventQueueTest, ThreeBusyLocksDropTheEvent) {
    PutFile(kPhotoQueue, "before\n");
    const HoldLock lock(kPhotoQueue);
    Fault::Quiet(Call::Usleep);
    Fault::Count(Call::Flock);
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoQueue), "before\n");
    EXPECT_EQ(Fault::Calls(Call::Flock), 3U);
    EXPECT_EQ(Fault::Calls(Call::Usleep), 3U) << "after the third too";
    for (const CallInfo &call : Fault::Log(Call::Usleep)) {
        EXPECT_EQ(call.number % 1000, 0);
        EXPECT_LE(call.number, 9000);
        EXPECT_GE(call.number, 0);
    }
    ExpectNoMark();
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(EventQueueTest, ASharedLockIsBusyToo) {
    PutFile(kPhotoQueue, "");
    const HoldLock lock(kPhotoQueue, false);
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoQueue), "");
    ExpectNoMark();
}

TEST_F(EventQueueTest, TheLockIsFreeAfterwards) {
    EXPECT_TRUE(AddTrip());
    EXPECT_FALSE(IsLocked(kPhotoQueue));
}

TEST_F(EventQueueTest, TheDropIsToldAfterTheLastPause) {
    LOG_LEVEL = 7;
    Fault::Quiet(Call::Usleep);
    Fault::Record(Call::Usleep);
    Fault::Return(Call::Rand, {0, 1, 2});
    FailQueueLock(3, EAGAIN);
    const std::string message = std::string("utils:516 try lock too many times, path=") +
                                kPhotoQueue + ", reason=Resource temporarily unavailable";
    EXPECT_TRUE(AddTrip());
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/photos/@eaDir)", "usleep(0)",
                                       "usleep(1000)", "usleep(2000)", "log: " + message));
    ExpectLog({message});
    ExpectNoMark();
}

TEST_F(EventQueueTest, TheReasonOfTheDropIsTheLastLocks) {
    LOG_LEVEL = 7;
    FailQueueLock(3, EINTR);
    // What comes between the lock and the message may fail for other reasons.
    Fault::FailAlways(Call::Usleep, EINVAL);
    EXPECT_TRUE(AddTrip());
    ExpectLog({std::string("utils:516 try lock too many times, path=") + kPhotoQueue +
               ", reason=Interrupted system call"});
}

TEST_F(EventQueueTest, AnotherLockErrorMarksTheShareAtOnce) {
    Fault::Count(Call::Usleep);
    FailQueueLock(1, ENOLCK);
    EXPECT_FALSE(AddTrip());
    EXPECT_EQ(Fault::Calls(Call::Usleep), 0U);
    EXPECT_EQ(ReadText(kPhotoQueue), "");
    ExpectMark("photos");
    ExpectLog({});
    LOG_LEVEL = 7;
    FailQueueLock(1, ENOLCK);
    EXPECT_FALSE(AddTrip());
    ExpectLog(
        {std::string("utils:507 flock fail, path=") + kPhotoQueue + ", reason=No locks available"});
}

TEST_F(EventQueueTest, TheLockErrorIsToldBeforeTheMark) {
    LOG_LEVEL = 7;
    EventTrace::Get().WatchFile(kStatusFile);
    FailQueueLock(1, ENOLCK);
    EXPECT_FALSE(AddTrip());
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/photos/@eaDir)",
                                       StartsWith("log: utils:507 flock fail, "),
                                       std::string("file: ") + kStatusFile));
    (void)SystemLog::Get().Lines();
}

TEST_F(EventQueueTest, ALockErrorAfterBusyLocksMarksTheShare) {
    LOG_LEVEL = 7;
    Fault::Quiet(Call::Usleep);
    Fault::On(Call::Flock, [attempt = 0](CallInfo &info) mutable -> std::optional<long> {
        if (info.path != kPhotoQueue) {
            return std::nullopt;
        }
        errno = ++attempt < 3 ? EAGAIN : ENOLCK;
        return -1;
    });
    EXPECT_FALSE(AddTrip());
    EXPECT_EQ(Fault::Calls(Call::Usleep), 2U);
    EXPECT_EQ(QueueCalls(Call::Flock), 3U);
    EXPECT_EQ(ReadText(kPhotoQueue), "");
    ExpectMark("photos");
    ExpectLog(
        {std::string("utils:507 flock fail, path=") + kPhotoQueue + ", reason=No locks available"});
}

TEST_F(EventQueueTest, AQueueThatCannotBeOpenedAgainMarksTheShareWithoutAMessage) {
    LOG_LEVEL = 7;
    Fault::Quiet(Call::Usleep);
    FailQueueLock(1, EAGAIN);
    Fault::FailWhen(Call::Open, EMFILE, [opened = 0](const CallInfo &info) mutable {
        return info.path == kPhotoQueue && ++opened > 1;
    });
    EXPECT_FALSE(AddTrip());
    EXPECT_EQ(QueueCalls(Call::Open), 2U);
    EXPECT_EQ(ReadText(kPhotoQueue), "");
    ExpectMark("photos");
    ExpectLog({});
}

TEST_F(EventQueueTest, LockMessagesNeedExactlyLevelSeven) {
    Fault::Quiet(Call::Usleep);
    for (const int level : {INT_MIN, -7, 0, 3, 6, 8, 70, INT_MAX}) {
        LOG_LEVEL = level;
        FailQueueLock(1, ENOLCK);
        EXPECT_FALSE(AddTrip());
        FailQueueLock(3, EAGAIN);
        EXPECT_TRUE(AddTrip());
        Fault::On(Call::Write, [](CallInfo &info) -> std::optional<long> {
            return info.path == kPhotoQueue ? std::optional<long>(5) : std::nullopt;
        });
        EXPECT_TRUE(AddTrip());
        ExpectLog({});
    }
}

// --- the write ------------------------------------------------------------------------------

TEST_F(EventQueueTest, AShortWriteCountsAsDone) {
    const std::string length = std::to_string(std::string(kTripLine).size());
    for (const int level : {3, 7}) {
        LOG_LEVEL = level;
        RemoveTree(kPhotoQueue);
        Fault::Reset();
        Fault::Record(Call::Flock);
        Fault::Before(Call::Write, [](CallInfo &info) { info.size = 5; });
        EXPECT_TRUE(AddTrip());
        EXPECT_EQ(ReadText(kPhotoQueue), std::string(kTripLine).substr(0, 5));
        EXPECT_EQ(Fault::Calls(Call::Write), 1U) << "one write, whatever it does";
        EXPECT_EQ(Fault::Log(Call::Flock).back().number, LOCK_UN);
        ExpectLog(level == 7 ? std::vector<std::string>{"utils:502 write fail, (5, " + length + ")"}
                             : std::vector<std::string>{});
        ExpectNoMark();
    }
}

TEST_F(EventQueueTest, AFailedWriteCountsAsDone) {
    LOG_LEVEL = 7;
    Fault::Fail(Call::Write, ENOSPC);
    EXPECT_TRUE(AddTrip());
    ExpectLog(
        {"utils:502 write fail, (-1, " + std::to_string(std::string(kTripLine).size()) + ")"});
    EXPECT_EQ(Fault::Calls(Call::Write), 1U);
    EXPECT_EQ(ReadText(kPhotoQueue), "");
    ExpectNoMark();
}

TEST_F(EventQueueTest, TheShortWriteIsToldBeforeTheUnlock) {
    LOG_LEVEL = 7;
    Fault::Record(Call::Flock);
    Fault::Fail(Call::Write, EIO);
    EXPECT_TRUE(AddTrip());
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/photos/@eaDir)",
                                       std::string("flock(") + kPhotoQueue + ", 6)",
                                       StartsWith("log: utils:502 write fail, "),
                                       std::string("flock(") + kPhotoQueue + ", 8)"));
    (void)SystemLog::Get().Lines();
}

TEST_F(EventQueueTest, AWholeWriteIsNoNews) {
    LOG_LEVEL = 7;
    EXPECT_TRUE(AddTrip());
    ExpectLog({});
}

// A longer line would be malformed to whoever reads it.
TEST_F(EventQueueTest, AnEventBeyondAMebibyteMarksTheShare) {
    const std::size_t frame = std::string(kTripLine).size() - 1; // with "{}" as long as two quotes
    const std::string most((std::size_t{1} << 20) - frame, 'x');
    EXPECT_TRUE(AddCustomEvent(kSettingEvent, kTrip, most));
    EXPECT_EQ(ReadText(kPhotoQueue).size(), (std::size_t{1} << 20) + 1);
    EXPECT_EQ(ReadJson(kPhotoQueue)["data"], most);
    ExpectNoMark();
    EXPECT_FALSE(AddCustomEvent(kSettingEvent, kTrip, most + "x"));
    EXPECT_EQ(ReadText(kPhotoQueue).size(), (std::size_t{1} << 20) + 1);
    ExpectMark("photos");
    ExpectLog({});
}

TEST_F(EventQueueTest, ALongEventThatIsCoveredIsNoMark) {
    PutFile(kPhotoQueue, PendingRows()[0].line + "\n");
    EXPECT_TRUE(AddCustomEvent(kSettingEvent, kTrip, std::string(std::size_t{2} << 20, 'x')));
    ExpectNoMark();
}

TEST_F(EventQueueTest, ALineBeyondAMebibyteCoversNothing) {
    const std::string line = PendingRows()[0].line;
    PutFile(kPhotoQueue, line + std::string((std::size_t{1} << 20) - line.size(), ' ') + "\n");
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoQueue).size(), (std::size_t{1} << 20) + 1);
    PutFile(kPhotoQueue, line + std::string((std::size_t{1} << 20) - line.size() + 1, ' ') + "\n");
    EXPECT_TRUE(AddTrip());
    EXPECT_GT(ReadText(kPhotoQueue).size(), (std::size_t{1} << 20) + 2);
}

// --- what stands in the queue's place -------------------------------------------------------

TEST_F(EventQueueTest, ASymbolicLinkIsNotWrittenThrough) {
    PutFile("/volume2/target", "precious\n");
    for (const char *target : {"/volume2/target", "/volume2/missing", "/volume2", kPhotoTaken}) {
        RemoveTree(kStatusFile);
        RemoveTree(kPhotoQueue);
        ASSERT_EQ(::symlink(target, kPhotoQueue), 0);
        EXPECT_FALSE(AddTrip()) << target;
        ExpectMark("photos");
        ExpectLog({});
    }
    EXPECT_EQ(ReadText("/volume2/target"), "precious\n");
    EXPECT_FALSE(Exists("/volume2/missing"));
    EXPECT_FALSE(Exists(kPhotoTaken));
}

TEST_F(EventQueueTest, ALinkToAPendingReindexCoversNothing) {
    PutFile("/volume2/target", PendingRows()[0].line + "\n");
    ASSERT_EQ(::symlink("/volume2/target", kPhotoTaken), 0);
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoQueue), kTripLine);
}

TEST_F(EventQueueTest, OnlyARegularFileIsWrittenTo) {
    ASSERT_EQ(::mkfifo(kPhotoQueue, 0600), 0);
    EXPECT_FALSE(AddTrip()) << "a FIFO without a reader";
    ExpectMark("photos");
    {
        RemoveTree(kStatusFile);
        const int reader = ::open(kPhotoQueue, O_RDONLY | O_NONBLOCK | O_CLOEXEC);
        EXPECT_FALSE(AddTrip()) << "a FIFO with a reader";
        char byte = 0;
        EXPECT_EQ(::read(reader, &byte, 1), 0);
        ::close(reader);
        ExpectMark("photos");
    }
    RemoveTree(kStatusFile);
    RemoveTree(kPhotoQueue);
    MakeDirs(kPhotoQueue);
    EXPECT_FALSE(AddTrip()) << "a directory";
    ExpectMark("photos");
    RemoveTree(kStatusFile);
    RemoveTree(kPhotoQueue);
    const int socket = ListenAt(kPhotoQueue);
    EXPECT_FALSE(AddTrip()) << "a socket";
    ::close(socket);
    ExpectMark("photos");
    ExpectLog({});
}

TEST_F(EventQueueTest, ADeviceIsNotWrittenTo) {
    if (::mknod(kPhotoQueue, S_IFCHR | 0600, makedev(1, 3)) != 0) {
        GTEST_SKIP() << "device files cannot be made here";
    }
    Fault::Count(Call::Write);
    EXPECT_FALSE(AddTrip());
    EXPECT_EQ(QueueCalls(Call::Write), 0U);
    ExpectMark("photos");
    ExpectLog({});
}

TEST_F(EventQueueTest, AQueueThatWasTakenOverBeforeTheLockIsLeftAlone) {
    PutFile(kPhotoQueue, "before\n");
    Fault::Before(Call::Flock, [first = true](CallInfo &info) mutable {
        if (first) {
            first = false;
            EXPECT_EQ(info.path, kPhotoQueue);
            EXPECT_EQ(::rename(kPhotoQueue, kPhotoTaken), 0);
        }
    });
    Fault::Count(Call::Usleep);
    LOG_LEVEL = 7;
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoTaken), "before\n") << "what is written there now is lost";
    EXPECT_EQ(ReadText(kPhotoQueue), kTripLine);
    EXPECT_EQ(Fault::Calls(Call::Usleep), 0U) << "nobody holds the lock";
    ExpectLog({});
    ExpectNoMark();
}

TEST_F(EventQueueTest, AQueueThatWasReplacedBeforeTheLockIsOpenedAfresh) {
    PutFile(kPhotoQueue, "before\n");
    Fault::Before(Call::Flock, [first = true](CallInfo &) mutable {
        if (first) {
            first = false;
            EXPECT_EQ(::rename(kPhotoQueue, kPhotoTaken), 0);
            PutFile(kPhotoQueue, "new\n");
        }
    });
    EXPECT_TRUE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoTaken), "before\n");
    EXPECT_EQ(ReadText(kPhotoQueue), std::string("new\n") + kTripLine);
}

TEST_F(EventQueueTest, AQueueThatIsTakenOverThreeTimesMarksTheShare) {
    LOG_LEVEL = 7;
    Fault::Before(Call::Flock, [](CallInfo &info) {
        if (info.path == kPhotoQueue && (info.number & LOCK_EX) != 0) {
            EXPECT_EQ(::rename(kPhotoQueue, kPhotoTaken), 0);
        }
    });
    EXPECT_FALSE(AddTrip());
    EXPECT_EQ(ReadText(kPhotoTaken), "");
    EXPECT_FALSE(Exists(kPhotoQueue));
    ExpectMark("photos");
    ExpectLog({});
}

TEST_F(EventQueueTest, BusyLocksAmongTakeoversMarkTheShare) {
    for (int busy = 0; busy < 3; ++busy) { // at that attempt; the queue is taken over at the others
        SCOPED_TRACE(busy);
        RemoveTree(kStatusFile);
        Fault::Reset();
        Fault::Quiet(Call::Usleep);
        LOG_LEVEL = 7;
        Fault::On(Call::Flock, [busy, attempt = 0](CallInfo &info) mutable -> std::optional<long> {
            if (info.path != kPhotoQueue || (info.number & LOCK_EX) == 0) {
                return std::nullopt;
            }
            if (attempt++ == busy) {
                errno = EAGAIN;
                return -1;
            }
            EXPECT_EQ(::rename(kPhotoQueue, kPhotoTaken), 0);
            return std::nullopt;
        });
        EXPECT_FALSE(AddTrip());
        EXPECT_EQ(Fault::Calls(Call::Usleep), 1U);
        ExpectMark("photos");
        ExpectLog({});
        RemoveTree(kPhotoQueue);
    }
}

TEST_F(EventQueueTest, AFileBelowTheMetadataDirectoryIsNoQueueDirectory) {
    RemoveTree("/volume1/photos/@eaDir");
    PutFile("/volume1/photos/@eaDir", "a file");
    EXPECT_FALSE(AddTrip());
    ExpectMark("photos");
    ExpectLog({});
    EXPECT_EQ(ReadText("/volume1/photos/@eaDir"), "a file");
}

// --- threads --------------------------------------------------------------------------------

TEST_F(EventQueueTest, ThreadsNeverMixTheirLines) {
    constexpr int kThreads = 4;
    constexpr int kEvents = 50;
    const std::string data(5000, 'x');
    std::vector<std::thread> threads;
    for (int thread = 0; thread < kThreads; ++thread) {
        threads.emplace_back([thread, &data] {
            for (int event = 0; event < kEvents; ++event) {
                EXPECT_TRUE(AddCustomEvent(
                    1, std::string(kTrip) + std::to_string(thread * kEvents + event), data));
            }
        });
    }
    for (std::thread &thread : threads) {
        thread.join();
    }
    std::ifstream queue(kPhotoQueue);
    std::string line;
    std::set<std::string> paths;
    while (std::getline(queue, line)) {
        const Json::Value event = Json(line);
        EXPECT_EQ(event["data"], Json::Value(data));
        EXPECT_TRUE(paths.insert(event["path"].asString()).second) << "twice: " << line;
    }
    EXPECT_FALSE(paths.empty()); // a busy lock may have dropped some, never all
    ExpectNoMark();
}

} // namespace

} // namespace VANO::TESTS
