// The test kit itself: a kit that sees nothing would let everything pass.

#include "support/fixture.h"

#include <cerrno>
#include <cstring>
#include <dlfcn.h>
#include <fcntl.h>
#include <gtest/gtest-spi.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <syslog.h>
#include <unistd.h>

#include <fileindex/daemon_socket.h>

#include "platform/monitor_queue.h"
#include "platform/vano_platform.h"

namespace VANO::TESTS {

namespace {

// Shows what the teardown of a test would say.
class KitTest : public LibraryTest {
  public:
    void TearDownNow() { LibraryTest::TearDown(); }
    using LibraryTest::ExpectLeakedDescriptors;
    using LibraryTest::SetUp;
};

// A test inside the test: its teardown's failures are looked at, and it may be static data only
// because EXPECT_NONFATAL_FAILURE allows no locals.
KitTest *g_inner = nullptr;

class InnerTest : public KitTest {
    void TestBody() override {}
};

class TestKitTest : public LibraryTest {
  protected:
    TestKitTest() { g_inner = &inner_; }

  private:
    InnerTest inner_;
};

TEST_F(TestKitTest, TheLibrarysOwnCallsReachTheFakes) {
    void *library = ::dlopen("libfileindex.so.1", RTLD_LAZY | RTLD_NOLOAD);
    ASSERT_NE(library, nullptr);
    EXPECT_EQ(::dlsym(RTLD_DEFAULT, "VANOShareGet"), reinterpret_cast<void *>(&VANOShareGet));
    EXPECT_EQ(::dlsym(RTLD_DEFAULT, "flock"), reinterpret_cast<void *>(&::flock));
    ::dlclose(library);
    Fault::FailAlways(Call::Socket, EMFILE);
    EXPECT_FALSE(SendCammandToDaemon("resume", Json("{}")));
    EXPECT_EQ(Fault::Calls(Call::Socket), 1U);
}

TEST_F(TestKitTest, ALeftoverLogLineFailsTheTest) {
    g_inner->SetUp();
    ::syslog(LOG_ERR, "config:22 forgotten");
    EXPECT_NONFATAL_FAILURE(g_inner->TearDownNow(), "unexpected log line: config:22 forgotten");
}

TEST_F(TestKitTest, ALeftOpenDescriptorFailsTheTest) {
    g_inner->SetUp();
    ASSERT_GE(::open("/dev/zero", O_RDONLY), 0);
    EXPECT_NONFATAL_FAILURE(g_inner->TearDownNow(), "/dev/zero");
}

TEST_F(TestKitTest, AnUnreleasedShareRecordFailsTheTest) {
    g_inner->SetUp();
    platform.AddShare("photos", "/volume1/photos");
    static _tag_VANOSHARE *share = nullptr;
    ASSERT_EQ(VANOShareGet("photos", &share), 0);
    EXPECT_NONFATAL_FAILURE(g_inner->TearDownNow(), "share records were not released");
    VANOShareFree(share);
}

TEST_F(TestKitTest, AStrayFileFailsTheTest) {
    g_inner->SetUp();
    PutFile(kFolderFile + std::string(".Ab12cd"), "{}");
    EXPECT_NONFATAL_FAILURE(g_inner->TearDownNow(), "folder.conf.Ab12cd");
    RemoveTree(kFolderFile + std::string(".Ab12cd"));
}

TEST_F(TestKitTest, AHeldSettingsLockFailsTheTest) {
    g_inner->SetUp();
    g_inner->ExpectLeakedDescriptors(1);
    const int fd = ::open(kStatusLock, O_RDWR | O_CREAT | O_CLOEXEC, 0644);
    ASSERT_EQ(::flock(fd, LOCK_EX), 0);
    EXPECT_NONFATAL_FAILURE(g_inner->TearDownNow(), "the lock on the status was left");
}

TEST_F(TestKitTest, LogLinesAreReadWithPriorityAndWithoutPrefix) {
    ::syslog(LOG_ERR, "config:22 text: with colon\nand line");
    ::syslog(LOG_WARNING, "second");
    const std::vector<LogLine> lines = SystemLog::Get().Lines();
    ASSERT_EQ(lines.size(), 2U);
    EXPECT_EQ(lines[0].priority, LOG_ERR);
    EXPECT_EQ(lines[0].text, "config:22 text: with colon\nand line");
    EXPECT_EQ(lines[1].priority, LOG_WARNING);
}

TEST_F(TestKitTest, LogKeepsManyAndLongLines) {
    const std::string text(128 * 1024, 'x');
    for (int i = 0; i < 40; ++i) {
        ::syslog(LOG_ERR, "%s", text.c_str());
    }
    const std::vector<LogLine> lines = SystemLog::Get().Lines();
    ASSERT_EQ(lines.size(), 40U);
    EXPECT_EQ(lines[39].text, text);
}

TEST_F(TestKitTest, ExpectLogRefusesOtherLinesAndPriorities) {
    ::syslog(LOG_ERR, "config:22 a");
    EXPECT_NONFATAL_FAILURE(SystemLog::Get().Expect({"config:23 a"}), "config:22 a");
    ::syslog(LOG_INFO, "config:22 a");
    EXPECT_NONFATAL_FAILURE(SystemLog::Get().Expect({"config:22 a"}), "6 config:22 a");
    EXPECT_NONFATAL_FAILURE(SystemLog::Get().Expect({"config:22 a"}), "config:22 a");
    ::syslog(LOG_ERR, "config:22 a");
    ExpectLog({"config:* a"});
    EXPECT_FALSE(IsLogText("config: a", "config:* a"));
    EXPECT_FALSE(IsLogText("config:1 b", "config:* a"));
}

TEST_F(TestKitTest, ThePercentMInALogLineIsTheErrorOfTheCaller) {
    const std::string format = "%s=%m"; // no literal: the compilers do not know %m
    errno = ENOSPC;
    ::syslog(LOG_ERR, format.c_str(), "reason");
    ExpectLog({"reason=No space left on device"});
}

TEST_F(TestKitTest, TheTraceHoldsAllKindsOfEventsInTheirOrder) {
    const DaemonPeer daemon;
    EventTrace::Get().WatchFile(kFolderFile);
    Fault::Record(Call::Usleep);
    ::syslog(LOG_ERR, "utils:1 first");
    PutFile(kFolderFile, "{}");
    EXPECT_TRUE(SendCammandToDaemon("resume", Json("{}")));
    ::syslog(LOG_ERR, "utils:2 second");
    EXPECT_EQ(VLIBServiceStart("fileindexd", 1), 0);
    EXPECT_TRUE(SendCammandToDaemon("pause", Json("[1]")));
    ::usleep(1);
    PutFile(kFolderFile, "[]");
    ExpectLog({"utils:1 first", "utils:2 second"});
    EXPECT_THAT(Effects(),
                ElementsAre("log: utils:1 first", "file: /usr/vano/etc/fileindex/folder.conf",
                            R"(socket: {"data":{},"type":"resume"})", "log: utils:2 second",
                            "VLIBServiceStart(fileindexd, 1)",
                            R"(socket: {"data":[1],"type":"pause"})", "usleep(1)",
                            "file: /usr/vano/etc/fileindex/folder.conf"));
}

TEST_F(TestKitTest, QueriesAreInTheTraceButNoEffects) {
    EXPECT_EQ(VANOGetFSType("/x", 0), 1);
    EXPECT_EQ(VLIBServiceRestart("samba"), 0);
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOGetFSType(/x, 0)", "VLIBServiceRestart(samba)"));
    EXPECT_THAT(Effects(), ElementsAre("VLIBServiceRestart(samba)"));
    EXPECT_EQ(platform.Calls("VANOGetFSType"), 1U);
}

TEST_F(TestKitTest, PlatformAnswersComeFromHookThenQueueThenConstant) {
    platform.Answer("VLIBServiceStop", {-1, -2});
    platform.AnswerAlways("VLIBServiceStop", 7);
    EXPECT_EQ(VLIBServiceStop("a", 0), -1);
    platform.On("VLIBServiceStop", [](const std::string &entry) {
        return entry == "VLIBServiceStop(b, 0)" ? std::optional<int>(5) : std::nullopt;
    });
    EXPECT_EQ(VLIBServiceStop("b", 0), 5);
    EXPECT_EQ(VLIBServiceStop("c", 0), -2);
    EXPECT_EQ(VLIBServiceStop("c", 0), 7);
}

TEST_F(TestKitTest, SharesAreFoundByNameAndByPath) {
    platform.AddShare("photos", "/volume1/photos").readOnly = true;
    _tag_VANOSHARE *share = nullptr;
    EXPECT_LT(VANOShareGet("Photos", &share), 0);
    EXPECT_EQ(share, nullptr);
    platform.ignoreCase = true;
    ASSERT_EQ(VANOShareGet("Photos", &share), 0);
    EXPECT_STREQ(share->name, "photos");
    EXPECT_STREQ(share->path, "/volume1/photos");
    int flag = 9;
    EXPECT_EQ(VLIBShareIsReadOnlyGet(share, &flag), 0);
    EXPECT_EQ(flag, 1);
    EXPECT_EQ(platform.LiveRecords(), 1U);
    VANOShareFree(share);
    char name[492] = "";
    char path[4096] = "";
    EXPECT_EQ(VANOShareNamePathGet("/volume1/photos/a/b", name, sizeof(name), path, sizeof(path)),
              0);
    EXPECT_STREQ(name, "photos");
    EXPECT_LT(VANOShareNamePathGet("/volume1/photosx", name, sizeof(name), path, sizeof(path)), 0);
}

TEST_F(TestKitTest, ReleasingTwiceIsAViolation) {
    platform.AddShare("photos", "/volume1/photos");
    VANOShareFree(nullptr);
    EXPECT_THAT(platform.Violations(), ElementsAre("VANOShareFree of a null record"));
    platform.Reset();
}

TEST_F(TestKitTest, MonitorCallsAreKept) {
    const VANOTIFYD::MonitorQueue queue(Json(R"({"queue":"/q","config":[]})"));
    EXPECT_TRUE(
        VANOTIFYD::MonitorQueue::Upsert(queue, "fileindexd", VANOTIFYD::MONITOR_QUEUE_TYPE_FILE));
    platform.Answer("MonitorQueue::Delete", {0});
    EXPECT_FALSE(
        VANOTIFYD::MonitorQueue::Delete("/q", "fileindexd", VANOTIFYD::MONITOR_QUEUE_TYPE_FILE));
    EXPECT_THAT(Effects(),
                ElementsAre(R"(MonitorQueue::Upsert({"config":[],"queue":"/q"}, fileindexd, 1))",
                            "MonitorQueue::Delete(/q, fileindexd, 1)"));
    ASSERT_EQ(platform.monitorCalls.size(), 2U);
    EXPECT_EQ(platform.monitorCalls[0].queue, "/q");
}

TEST_F(TestKitTest, ProgramsAreRecordedWithTheirArguments) {
    const char *const arguments[] = {"/bin/x", "a b", nullptr};
    EXPECT_EQ(VLIBCExecv("/bin/x", arguments, 1), 0);
    EXPECT_EQ(VLIBCExec("/bin/rm", "-rf", "/q", nullptr, nullptr), 0);
    EXPECT_THAT(Effects(),
                ElementsAre("VLIBCExecv(/bin/x, [/bin/x, a b], 1)", "VLIBCExec(/bin/rm, -rf, /q)"));
}

TEST_F(TestKitTest, TheNthCallFails) {
    Fault::Fail(Call::Fsync, EIO, 2);
    const int fd = ::open("/tmp/fault", O_CREAT | O_RDWR, 0600);
    EXPECT_EQ(::fsync(fd), 0);
    EXPECT_EQ(::fsync(fd), -1);
    EXPECT_EQ(errno, EIO);
    EXPECT_EQ(::fsync(fd), 0);
    EXPECT_EQ(Fault::Calls(Call::Fsync), 3U);
    EXPECT_EQ(Fault::Log(Call::Fsync).front().path, "/tmp/fault");
    ::close(fd);
}

TEST_F(TestKitTest, AHookMayShortenAWrite) {
    Fault::Before(Call::Write, [](CallInfo &info) { info.size = 2; });
    const int fd = ::open("/tmp/fault", O_CREAT | O_TRUNC | O_RDWR, 0600);
    EXPECT_EQ(::write(fd, "abcdef", 6), 2);
    ::close(fd);
    EXPECT_EQ(ReadText("/tmp/fault"), "ab");
}

TEST_F(TestKitTest, ResultsCanReplaceCalls) {
    Fault::Return(Call::Rand, {3, 9});
    Fault::Return(Call::Time, {1000});
    Fault::Quiet(Call::Usleep);
    EXPECT_EQ(::rand(), 3);
    EXPECT_EQ(::rand(), 9);
    EXPECT_EQ(::time(nullptr), 1000);
    EXPECT_GT(::time(nullptr), 1000);
    EXPECT_EQ(::usleep(999999), 0);
    EXPECT_EQ(Fault::Log(Call::Usleep).front().number, 999999);
}

TEST_F(TestKitTest, WithoutAPeerNobodyListens) {
    { const DaemonPeer daemon; }
    EXPECT_EQ(ConnectTo(kDaemonSocket), -1);
}

TEST_F(TestKitTest, ThePeerTellsBrokenCommandsFromWholeOnes) {
    DaemonPeer daemon;
    const int fd = ConnectTo(kDaemonSocket);
    EXPECT_EQ(::write(fd, "\x05\0\0\0{}", 6), 6);
    EXPECT_FALSE(daemon.Connections().at(0).closed);
    ::close(fd);
    const std::vector<PeerConnection> connections = daemon.Connections();
    ASSERT_EQ(connections.size(), 1U);
    EXPECT_TRUE(connections[0].closed);
    EXPECT_FALSE(connections[0].complete);
    EXPECT_EQ(connections[0].length, 5U);
    EXPECT_THAT(daemon.Commands(), IsEmpty());
}

TEST_F(TestKitTest, ThePeerCanReplyCloseOrStall) {
    char buffer[16] = "";
    {
        const DaemonPeer daemon(DaemonPeer::Mode::Reply);
        const int fd = ConnectTo(kDaemonSocket);
        EXPECT_GT(::read(fd, buffer, sizeof(buffer)), 0);
        ::close(fd);
    }
    {
        const DaemonPeer daemon(DaemonPeer::Mode::CloseAtOnce);
        const int fd = ConnectTo(kDaemonSocket);
        EXPECT_EQ(::read(fd, buffer, sizeof(buffer)), 0);
        ::close(fd);
    }
    for (const auto mode : {DaemonPeer::Mode::NoAccept, DaemonPeer::Mode::NoRead}) {
        DaemonPeer daemon(mode);
        const int fd = ConnectTo(kDaemonSocket);
        EXPECT_EQ(::write(fd, "x", 1), 1);
        daemon.Sync();
        EXPECT_EQ(::recv(fd, buffer, sizeof(buffer), MSG_DONTWAIT), -1);
        ::close(fd);
    }
}

} // namespace

} // namespace VANO::TESTS
