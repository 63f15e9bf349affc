// The indexing peer of the examples: nothing that it is to be told gets lost.

#include <algorithm>
#include <array>
#include <csignal>
#include <cstdint>
#include <cstring>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <memory>
#include <random>
#include <set>
#include <sys/socket.h>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>

#include "support/appliance.h"
#include "support/files.h"
#include "support/matchers.h"
#include "support/sockets.h"
#include "system/child.h"

namespace VANO::TESTS {
namespace {

const std::string kQueue = kPhotoQueue;
const std::string kTaken = kPhotoTaken;
const std::string kOut = "/tmp/peer.out";
const std::string kErrors = "/tmp/peer.err";

std::string EventLine(int number) {
    return R"({"data":{"n":)" + std::to_string(number) +
           R"(},"event":131072,"path":"/volume1/photos/)" + std::to_string(number) + "\"}\n";
}

// Without the count, which begins anew with each peer.
std::string Printed(int number) {
    return kQueue + ": 131072 /volume1/photos/" + std::to_string(number) + R"( {"n":)" +
           std::to_string(number) + "}";
}

// What the peer printed after "event N ".
std::vector<std::string> Events() {
    std::vector<std::string> events;
    for (const std::string &line : LinesOf(ReadIfThere(kOut).value_or(""))) {
        if (line.rfind("event ", 0) == 0) {
            events.push_back(line.substr(line.find(' ', sizeof("event")) + 1));
        }
    }
    return events;
}

std::vector<std::string> Lines() {
    return LinesOf(ReadIfThere(kOut).value_or(""));
}

class Connection {
  public:
    Connection() : fd_(ConnectTo(kDaemonSocket)) { EXPECT_GE(fd_, 0); }
    ~Connection() { ::close(fd_); }
    Connection(const Connection &) = delete;
    Connection &operator=(const Connection &) = delete;

    void Send(const std::string &bytes) const {
        EXPECT_EQ(::send(fd_, bytes.data(), bytes.size(), MSG_NOSIGNAL),
                  static_cast<ssize_t>(bytes.size()));
    }

  private:
    int fd_;
};

std::string Length(std::uint32_t length) {
    return std::string(reinterpret_cast<const char *>(&length), sizeof(length));
}

class PeerTest : public ::testing::Test {
  protected:
    void SetUp() override {
        peer_.reset();
        for (const std::string &path : {std::string(kDaemonSocket), std::string(kStatusFile), kOut,
                                        kErrors, std::string("/volume1/photos")}) {
            RemoveTree(path);
        }
        PutShares({{"photos", kPhotos}});
    }

    void TearDown() override { RemoveTree(kDaemonSocket); }

    void Start(const std::vector<std::string> &arguments = {"--interval", "2"},
               const std::string &out = kOut) {
        std::vector<std::string> command{PEER_PATH};
        command.insert(command.end(), arguments.begin(), arguments.end());
        peer_ = std::make_unique<Child>(command, out, kErrors);
    }

    void StartAndWait() {
        Start();
        ASSERT_TRUE(Eventually([] { return Exists(kDaemonSocket); }));
    }

    int Stop(int signal = SIGTERM) {
        peer_->Signal(signal);
        return peer_->Wait();
    }

    std::unique_ptr<Child> peer_;
};

// --- queues -------------------------------------------------------------------------------------

TEST_F(PeerTest, TakesTheQueueOverAndPrintsItsEventsInOrder) {
    PutFile(kQueue, EventLine(1) + EventLine(2));
    Start();
    EXPECT_TRUE(Eventually([] { return Events().size() == 2 && !Exists(kTaken); }));
    EXPECT_THAT(Events(), ElementsAre(Printed(1), Printed(2)));
    EXPECT_FALSE(Exists(kQueue));
    EXPECT_EQ(Stop(), 0);
}

TEST_F(PeerTest, CountsTheEventsOfAllQueues) {
    PutFile(kQueue, EventLine(1));
    PutFile("/tmp/other_queue", EventLine(2));
    Start({"--queue", kQueue, "--queue", "/tmp/other_queue"});
    EXPECT_TRUE(Eventually([] { return Lines().size() == 2; }));
    EXPECT_THAT(Lines(),
                ElementsAre("event 1 " + Printed(1),
                            "event 2 /tmp/other_queue: 131072 /volume1/photos/2 {\"n\":2}"));
}

TEST_F(PeerTest, WorksOffWhatADeadPeerLeftBeforeTheQueue) {
    PutFile(kTaken, EventLine(1));
    PutFile(kQueue, EventLine(2));
    Start();
    EXPECT_TRUE(Eventually([] { return Events().size() == 2; }));
    EXPECT_THAT(Events(), ElementsAre(Printed(1), Printed(2)));
}

TEST_F(PeerTest, NeverRenamesOverATakenQueueThatItCannotRead) {
    MakeDirs(kTaken);
    PutFile(kQueue, EventLine(1));
    Start();
    EXPECT_TRUE(Eventually([] { return ReadIfThere(kErrors).value_or("") != ""; }));
    EXPECT_THAT(ReadText(kErrors), HasSubstr(".tmp: not a regular file"));
    EXPECT_EQ(ReadText(kQueue), EventLine(1));
    EXPECT_THAT(Events(), IsEmpty());
}

TEST_F(PeerTest, NeverRenamesOverATakenQueueThatAnotherHolds) {
    PutFile(kTaken, EventLine(1));
    PutFile(kQueue, EventLine(2));
    {
        const HoldLock other(kTaken);
        StartAndWait();
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
        EXPECT_EQ(ReadText(kTaken), EventLine(1));
        EXPECT_EQ(ReadText(kQueue), EventLine(2));
    }
    EXPECT_TRUE(Eventually([] { return Events().size() == 2; }));
    EXPECT_THAT(Events(), ElementsAre(Printed(1), Printed(2)));
}

TEST_F(PeerTest, FollowsNoSymbolicLinkInTheQueuesPlace) {
    PutFile("/tmp/elsewhere", EventLine(1));
    ASSERT_EQ(::symlink("/tmp/elsewhere", kQueue.c_str()), 0);
    Start();
    EXPECT_TRUE(Eventually([] { return ReadIfThere(kErrors).value_or("") != ""; }));
    EXPECT_THAT(Events(), IsEmpty());
    EXPECT_EQ(ReadText("/tmp/elsewhere"), EventLine(1));
}

TEST_F(PeerTest, TheLastLineNeedsNoNewline) {
    const std::string line = EventLine(1);
    PutFile(kQueue, line.substr(0, line.size() - 1));
    Start();
    EXPECT_TRUE(Eventually([] { return !Events().empty(); }));
    EXPECT_THAT(Events(), ElementsAre(Printed(1)));
}

TEST_F(PeerTest, AnEventBehindATornLineIsFound) {
    PutFile(kQueue, EventLine(7).substr(0, 20) + EventLine(1) + "[]\n" + EventLine(2));
    Start();
    EXPECT_TRUE(Eventually([] { return Events().size() == 2; }));
    EXPECT_THAT(Lines(), ElementsAre("malformed 1 " + kQueue + R"(: {"data":{"n":7},"eve)",
                                     "event 2 " + Printed(1), "malformed 3 " + kQueue + ": []",
                                     "event 4 " + Printed(2)));
}

// A power failure can leave zero bytes where a line should have been.
TEST_F(PeerTest, AnEventBehindZeroBytesIsFound) {
    const std::string torn = EventLine(7).substr(0, EventLine(7).size() - 1);
    PutFile(kQueue, torn + std::string(3, '\0') + EventLine(1));
    Start();
    EXPECT_TRUE(Eventually([] { return !Events().empty(); }));
    EXPECT_THAT(Events(), ElementsAre(Printed(1)));
}

TEST_F(PeerTest, PathsCannotForgeLines) {
    PutFile(kQueue, R"({"data":null,"event":1,"path":"/volume1/photos/a\nevent 9"})");
    Start();
    EXPECT_TRUE(Eventually([] { return !Lines().empty(); }));
    EXPECT_THAT(Lines(),
                ElementsAre("event 1 " + kQueue + R"(: 1 "/volume1/photos/a\nevent 9" null)"));
}

TEST_F(PeerTest, LeavesTheQueueToAWriterThatHoldsItsLock) {
    PutFile(kQueue, EventLine(1));
    {
        const HoldLock writer(kQueue);
        StartAndWait();
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
        EXPECT_TRUE(Exists(kQueue));
        EXPECT_FALSE(Exists(kTaken));
    }
    EXPECT_TRUE(Eventually([] { return !Events().empty(); }));
}

TEST_F(PeerTest, HoldsTheLockOnWhatItReads) {
    PutFile(kQueue, EventLine(1));
    ASSERT_EQ(::mkfifo("/tmp/slow", 0600), 0);
    const int reader = ::open("/tmp/slow", O_RDWR | O_CLOEXEC);
    ASSERT_EQ(::fcntl(reader, F_SETPIPE_SZ, 4096), 4096);
    const std::string full(4096, 'x');
    ASSERT_EQ(::write(reader, full.data(), full.size()), 4096);
    Start({"--interval", "2"}, "/tmp/slow"); // cannot print
    ASSERT_TRUE(Eventually([] { return Exists(kTaken); }));
    EXPECT_TRUE(IsLocked(kTaken));
    EXPECT_FALSE(Exists(kQueue));
    EXPECT_EQ(Stop(SIGKILL), 128 + SIGKILL);
    EXPECT_EQ(ReadText(kTaken), EventLine(1));
    ::close(reader);
    RemoveTree("/tmp/slow");

    Start(); // the next one prints it
    EXPECT_TRUE(Eventually([] { return !Exists(kTaken); }));
    EXPECT_THAT(Events(), ElementsAre(Printed(1)));
}

TEST_F(PeerTest, AnEventThatCannotBePrintedStays) {
    PutFile(kQueue, EventLine(1));
    Start({"--interval", "2"}, "/dev/full");
    EXPECT_EQ(peer_->Wait(), 1);
    EXPECT_EQ(ReadText(kTaken), EventLine(1));
    EXPECT_THAT(ReadText(kErrors), HasSubstr("cannot print"));
}

TEST_F(PeerTest, LeavesTheQueuesAloneWhilePaused) {
    PutFile(kStatusFile, R"({"resume_time":0})");
    PutFile(kQueue, EventLine(1));
    StartAndWait();
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
    EXPECT_TRUE(Exists(kQueue));
    Connection().Send(CommandBytes(R"({"data":{},"type":"resume"})"));
    EXPECT_TRUE(Eventually([] { return !Events().empty(); }));
    EXPECT_THAT(Lines(), ElementsAre("command resume {}", "event 1 " + Printed(1)));
}

// A writer never rests while the peer is killed again and again, wherever it happens to be.
TEST_F(PeerTest, LosesNoEventHoweverOftenItIsKilled) {
    constexpr int kKills = 150;
    const std::string written = "/tmp/writer.out";
    RemoveTree(written);
    Child writer({EVENT_WRITER_PATH}, written, "/tmp/writer.err");
    std::minstd_rand random(1);
    std::uniform_int_distribution<int> delay(0, 40);
    int leftTaken = 0;
    for (int i = 0; i < kKills; ++i) {
        Start({"--interval", "1"});
        std::this_thread::sleep_for(std::chrono::milliseconds(delay(random)));
        EXPECT_EQ(Stop(SIGKILL), 128 + SIGKILL);
        leftTaken += Exists(kTaken) ? 1 : 0;
    }
    ASSERT_TRUE(writer.IsRunning());
    writer.Signal(SIGTERM);
    EXPECT_EQ(writer.Wait(), 0);
    Start({"--interval", "1"});
    EXPECT_TRUE(Eventually([] { return !Exists(kQueue) && !Exists(kTaken); }));
    EXPECT_EQ(Stop(), 0);

    std::set<std::string> printed;
    for (const std::string &event : Events()) {
        printed.insert(event);
    }
    int done = 0;
    std::vector<std::string> lost;
    for (const std::string &line : LinesOf(ReadText(written))) {
        if (line.rfind("done ", 0) != 0) {
            continue;
        }
        ++done;
        const std::string number = line.substr(sizeof("done"));
        if (printed.count(kQueue + ": 131072 /volume1/photos/" + number + " " + number) == 0) {
            lost.push_back(number);
        }
    }
    EXPECT_THAT(lost, IsEmpty());
    EXPECT_GT(done, kKills);
    EXPECT_GT(leftTaken, 0) << "no kill met the peer at work";
    RecordProperty("events_done", done);
    RecordProperty("kills_at_work", leftTaken);
}

// --- the socket ---------------------------------------------------------------------------------

TEST_F(PeerTest, PrintsACommand) {
    StartAndWait();
    Connection().Send(
        CommandBytes(R"({"data":{"folder_path":"/photos"},"type":"upsert_folder_setting"})"));
    EXPECT_TRUE(Eventually([] { return !Lines().empty(); }));
    EXPECT_THAT(Lines(), ElementsAre(R"(command upsert_folder_setting {"folder_path":"/photos"})"));
}

TEST_F(PeerTest, ReadsACommandThatComesByteByByte) {
    StartAndWait();
    const Connection connection;
    for (const char byte : CommandBytes(R"({"data":{},"type":"resume"})")) {
        connection.Send(std::string(1, byte));
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    EXPECT_TRUE(Eventually([] { return !Lines().empty(); }));
    EXPECT_THAT(Lines(), ElementsAre("command resume {}"));
}

struct Garbage {
    const char *what;
    std::string bytes;
    const char *refusal;

    friend void PrintTo(const Garbage &garbage, std::ostream *out) { *out << garbage.what; }
};

class GarbageTest : public PeerTest, public ::testing::WithParamInterface<Garbage> {};

TEST_P(GarbageTest, IsRefusedAndTheNextCommandHeard) {
    StartAndWait();
    Connection().Send(GetParam().bytes);
    EXPECT_TRUE(Eventually([] { return Lines().size() == 1; }));
    Connection().Send(CommandBytes(R"({"data":{},"type":"resume"})"));
    EXPECT_TRUE(Eventually([] { return Lines().size() == 2; }));
    EXPECT_THAT(Lines(), ElementsAre(std::string("refused command: ") + GetParam().refusal,
                                     "command resume {}"));
    EXPECT_EQ(Stop(), 0);
}

INSTANTIATE_TEST_SUITE_P(
    Messages, GarbageTest,
    ::testing::Values(Garbage{"Nothing", "", "ends after 0 bytes"},
                      Garbage{"HalfALength", "\1", "ends after 1 bytes"},
                      Garbage{"HugeLength", Length(0xFFFFFFFF), "length 4294967295"},
                      Garbage{"ZeroLength", Length(0), "length 0"},
                      Garbage{"HalfAMessage", Length(100) + "{", "ends after 5 bytes"},
                      Garbage{"NoZeroByte", Length(2) + "{}", "no zero byte at the end"},
                      Garbage{"NoJson", CommandBytes("{"), "no JSON"},
                      Garbage{"TwoValues", CommandBytes("{}{}"), "no JSON"},
                      Garbage{"ZeroByte", CommandBytes(std::string("{}\0{", 4)), "no JSON"},
                      Garbage{"TooDeep", CommandBytes(std::string(5000, '[')), "no JSON"},
                      Garbage{"NoObject", CommandBytes("[]"), "no command"},
                      Garbage{"NoType", CommandBytes(R"({"data":{}})"), "no command"},
                      Garbage{"TypeIsANumber", CommandBytes(R"({"data":{},"type":1})"),
                              "no command"},
                      Garbage{"NoData", CommandBytes(R"({"type":"resume"})"), "no command"}),
    [](const auto &row) { return row.param.what; });

TEST_F(PeerTest, HangingClientsDelayACommandOnly) {
    StartAndWait();
    std::array<Connection, 80> hanging; // more than it serves at a time
    hanging[0].Send(Length(100));
    Connection().Send(CommandBytes(R"({"data":{},"type":"resume"})"));
    EXPECT_TRUE(Eventually([] {
        const auto lines = Lines();
        return std::find(lines.begin(), lines.end(), "command resume {}") != lines.end();
    }));
    EXPECT_THAT(Lines(), Contains("refused command: not complete in time"));
}

TEST_F(PeerTest, RefusesToStartBesideALivingOne) {
    StartAndWait();
    const Outcome second = RunToEnd({PEER_PATH});
    EXPECT_EQ(second.status, 1);
    EXPECT_THAT(second.error, HasSubstr("another daemon"));
    Connection().Send(CommandBytes(R"({"data":{},"type":"resume"})"));
    EXPECT_TRUE(Eventually([] { return !Lines().empty(); }));
}

TEST_F(PeerTest, RefusesToStartBesideAnotherKindOfDaemon) {
    const int listener = ListenAt(kDaemonSocket);
    const Outcome outcome = RunToEnd({PEER_PATH});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.error, HasSubstr("another daemon listens"));
    EXPECT_TRUE(Exists(kDaemonSocket));
    ::close(listener);
}

TEST_F(PeerTest, LeavesAFileInTheSocketsPlaceAlone) {
    PutFile(kDaemonSocket, "precious");
    const Outcome outcome = RunToEnd({PEER_PATH});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(ReadText(kDaemonSocket), "precious");
}

TEST_F(PeerTest, TakesThePlaceOfADeadOne) {
    StartAndWait();
    EXPECT_EQ(Stop(SIGKILL), 128 + SIGKILL);
    ASSERT_TRUE(Exists(kDaemonSocket));
    PutFile(kQueue, EventLine(1));
    Start();
    EXPECT_TRUE(Eventually([] { return !Events().empty(); })); // it listens before it works
    Connection().Send(CommandBytes(R"({"data":{},"type":"resume"})"));
    EXPECT_TRUE(Eventually([] { return Lines().size() == 2; }));
}

TEST_F(PeerTest, EndsCleanlyAtEitherSignal) {
    for (const int signal : {SIGTERM, SIGINT}) {
        StartAndWait();
        EXPECT_EQ(Stop(signal), 0);
        EXPECT_FALSE(Exists(kDaemonSocket));
    }
}

// --- the call -----------------------------------------------------------------------------------

TEST_F(PeerTest, HelpTellsWhatItPrints) {
    const Outcome outcome = RunToEnd({PEER_PATH, "--help"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.out, HasSubstr("Usage: indexing_peer"));
    EXPECT_EQ(outcome.error, "");
}

TEST_F(PeerTest, MistakesInTheCallAreRefused) {
    const std::vector<std::vector<std::string>> calls = {
        {"--interval", "0"}, {"--interval", "1x"}, {"--interval"}, {"--nonsense"}, {"surplus"}};
    for (const auto &arguments : calls) {
        std::vector<std::string> command{PEER_PATH};
        command.insert(command.end(), arguments.begin(), arguments.end());
        const Outcome outcome = RunToEnd(command);
        EXPECT_EQ(outcome.status, 2) << arguments[0];
        EXPECT_THAT(outcome.error, Not(IsEmpty())) << arguments[0];
        EXPECT_EQ(outcome.out, "") << arguments[0];
    }
}

} // namespace
} // namespace VANO::TESTS
