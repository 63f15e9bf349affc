// The bytes of a daemon command, and every way in which sending one ends.

#include <fileindex/daemon_socket.h>

#include "support/fixture.h"

#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstring>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <sys/un.h>
#include <thread>
#include <unistd.h>

namespace VANO::TESTS {

namespace {

// A command whose JSON text has that many bytes.
Json::Value PaddingFor(std::size_t textBytes) {
    static const std::size_t kBare = std::strlen(R"({"data":"","type":"x"})");
    return std::string(textBytes - kBare, 'p');
}

bool SendText(std::size_t textBytes) {
    return SendCammandToDaemon("x", PaddingFor(textBytes));
}

std::vector<std::size_t> SizesOfWrites() {
    std::vector<std::size_t> sizes;
    for (const CallInfo &call : Fault::Log(Call::Write)) {
        sizes.push_back(call.size);
    }
    return sizes;
}

class DaemonSocketTest : public LibraryTest {
  protected:
    // Failures of sending are the callers' to report.
    void TearDown() override {
        ExpectLog({});
        ExpectError(FILEINDEX_ERR_NONE);
        LibraryTest::TearDown();
    }

    // Answers the writes that the list has results for: 0 and -1 with their errno, more than 0 a
    // write of that many bytes at most, kWhole one as asked for.
    struct Result {
        long value;
        int error;
    };
    static constexpr Result kWhole = {1 << 30, 0};
    static constexpr Result kInterrupted = {0, EINTR};
    static constexpr Result kFailed = {-1, EAGAIN};

    static void AnswerWrites(std::vector<Result> results) {
        Fault::On(Call::Write,
                  [results, next = std::size_t{0}](CallInfo &info) mutable -> std::optional<long> {
                      if (next == results.size()) {
                          return std::nullopt;
                      }
                      const Result result = results[next++];
                      if (result.value > 0) {
                          info.size = std::min(info.size, static_cast<std::size_t>(result.value));
                          return std::nullopt;
                      }
                      errno = result.error;
                      return result.value;
                  });
    }
};

TEST_F(DaemonSocketTest, SendsLengthTextAndAZeroByte) {
    DaemonPeer daemon;
    Json::Value data(Json::objectValue);
    data["share_name"] = "photos";
    EXPECT_TRUE(SendCammandToDaemon("delete_share_worker", data));
    const std::string text = R"({"data":{"share_name":"photos"},"type":"delete_share_worker"})";
    ASSERT_EQ(daemon.Connections().size(), 1U);
    EXPECT_EQ(daemon.Connections()[0].bytes, CommandBytes(text));
    EXPECT_TRUE(daemon.Connections()[0].closed);
}

TEST_F(DaemonSocketTest, EveryCommandHasAConnectionOfItsOwn) {
    DaemonPeer daemon;
    EXPECT_TRUE(SendCammandToDaemon("one", Json::Value(Json::objectValue)));
    EXPECT_TRUE(SendCammandToDaemon("two", Json::Value(Json::objectValue)));
    EXPECT_THAT(daemon.Commands(),
                ElementsAre(R"({"data":{},"type":"one"})", R"({"data":{},"type":"two"})"));
    EXPECT_THAT(daemon.Connections(), Each(Field(&PeerConnection::closed, true)));
}

TEST_F(DaemonSocketTest, AnyDataAndAnyNameArrive) {
    DaemonPeer daemon;
    for (const char *data :
         {"{}", "null", "[]", "0", "-1", "9223372036854775807", "true", "\"\"",
          R"(["a",{"b":[null]}])", "\"\\n\\u0001\\\"\\\\\"", "\"\xff\xfe gr\xc3\xbc\xc3\x9f\""}) {
        for (const std::string command : {"resume", "", "a\n\"b\"", "\xff\xfe"}) {
            daemon.Clear();
            EXPECT_TRUE(SendCammandToDaemon(command, Json(data))) << data;
            ASSERT_EQ(daemon.Messages().size(), 1U);
            const Json::Value message = daemon.Messages()[0];
            EXPECT_THAT(message.getMemberNames(), ElementsAre("data", "type"));
            EXPECT_EQ(message["data"], Json(data));
            EXPECT_EQ(message["type"].asString(), command);
        }
    }
}

TEST_F(DaemonSocketTest, WithoutADaemonTheCallFails) {
    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(SendText(100));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(900));
}

TEST_F(DaemonSocketTest, WhatIsNoListeningSocketFails) {
    PutFile(kDaemonSocket, "a file");
    EXPECT_FALSE(SendText(100));
    EXPECT_EQ(ReadText(kDaemonSocket), "a file");
    RemoveTree(kDaemonSocket);
    MakeDirs(kDaemonSocket);
    EXPECT_FALSE(SendText(100));
    RemoveTree(kDaemonSocket);
    ASSERT_EQ(::mkfifo(kDaemonSocket, 0600), 0);
    EXPECT_FALSE(SendText(100));
    RemoveTree(kDaemonSocket);
    // Left behind by a daemon that died.
    ::close(ListenAt(kDaemonSocket));
    EXPECT_FALSE(SendText(100));
    RemoveTree(kDaemonSocket);
}

TEST_F(DaemonSocketTest, ConnectsWithTheWholeAddress) {
    DaemonPeer daemon;
    Fault::On(Call::Connect, [](CallInfo &info) -> std::optional<long> {
        EXPECT_EQ(info.path, "/var/run/fileindexd.sock");
        EXPECT_EQ(info.number, 110);
        sockaddr_un expected{}; // zeros behind the path
        expected.sun_family = AF_UNIX;
        (void)info.path.copy(expected.sun_path, sizeof(expected.sun_path) - 1);
        EXPECT_EQ(std::memcmp(info.data, &expected, sizeof(expected)), 0);
        int type = 0;
        socklen_t size = sizeof(type);
        EXPECT_EQ(::getsockopt(info.fd, SOL_SOCKET, SO_TYPE, &type, &size), 0);
        EXPECT_EQ(type, SOCK_STREAM);
        return std::nullopt;
    });
    EXPECT_TRUE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Connect), 1U);
}

TEST_F(DaemonSocketTest, TheSendTimeoutIsOneSecondWhileConnectingAndWriting) {
    DaemonPeer daemon;
    Fault::Record(Call::Socket);
    Fault::Record(Call::Connect);
    Fault::Record(Call::Setsockopt);
    Fault::Record(Call::Signal);
    timeval timeout{};
    Fault::Before(Call::Write, [&](CallInfo &info) {
        socklen_t size = sizeof(timeout);
        EXPECT_EQ(::getsockopt(info.fd, SOL_SOCKET, SO_SNDTIMEO, &timeout, &size), 0);
    });
    EXPECT_TRUE(SendText(100));
    EXPECT_EQ(timeout.tv_sec, 1);
    EXPECT_EQ(timeout.tv_usec, 0);
    std::vector<std::string> calls;
    for (const std::string &entry : EventTrace::Get().Entries()) {
        calls.push_back(entry.substr(0, entry.find('(')));
    }
    ASSERT_EQ(calls.size(), 6U);
    calls.pop_back(); // the command at the daemon
    EXPECT_THAT(calls, ElementsAre("signal", "socket", "setsockopt", "connect", "setsockopt"));
}

TEST_F(DaemonSocketTest, AFailedStepEndsTheCall) {
    DaemonPeer daemon;
    for (const Call call : {Call::Socket, Call::Connect, Call::Setsockopt}) {
        Fault::Reset();
        Fault::Count(Call::Write);
        Fault::Count(Call::Connect);
        Fault::FailAlways(call, EPERM);
        EXPECT_FALSE(SendText(100)) << static_cast<int>(call);
        EXPECT_EQ(Fault::Calls(Call::Connect), call == Call::Socket ? 0U : 1U) << "tried again";
        EXPECT_EQ(Fault::Calls(Call::Write), 0U);
    }
}

TEST_F(DaemonSocketTest, TheReplyIsNotRead) {
    DaemonPeer daemon(DaemonPeer::Mode::Reply);
    Fault::Count(Call::Read);
    EXPECT_TRUE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Read), 0U);
    EXPECT_THAT(daemon.Connections(), ElementsAre(Field(&PeerConnection::complete, true)));
}

TEST_F(DaemonSocketTest, ADaemonThatDoesNotReadIsNotWaitedFor) {
    for (const auto mode : {DaemonPeer::Mode::NoAccept, DaemonPeer::Mode::NoRead}) {
        DaemonPeer daemon(mode);
        EXPECT_TRUE(SendText(2000));
    }
}

TEST_F(DaemonSocketTest, AStalledDaemonHoldsAWriteForASecond) {
    DaemonPeer daemon(DaemonPeer::Mode::NoRead);
    const char *last = nullptr;
    Fault::On(Call::Write, [&](CallInfo &info) -> std::optional<long> {
        const char *const data = static_cast<const char *>(info.data);
        const bool wentBack = info.size == 1024 && last != nullptr && data < last;
        last = info.size == 1024 ? data : nullptr;
        if (wentBack) { // the write before it gave up
            errno = 0;
            return 0;
        }
        return std::nullopt;
    });
    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(SendText(4 << 20));
    const auto held = std::chrono::steady_clock::now() - start;
    EXPECT_GT(held, std::chrono::milliseconds(900));
    EXPECT_LT(held, std::chrono::milliseconds(5000));
}

TEST_F(DaemonSocketTest, ADaemonThatAcceptsNoMoreHoldsTheCallForASecond) {
    std::vector<int> sockets = {ListenAt(kDaemonSocket, SOCK_STREAM, 0)};
    do { // until no more are let in
        sockets.push_back(ConnectTo(kDaemonSocket, SOCK_NONBLOCK));
    } while (sockets.back() >= 0);
    ASSERT_EQ(errno, EAGAIN);
    sockets.pop_back();
    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(SendText(100));
    const auto held = std::chrono::steady_clock::now() - start;
    EXPECT_GT(held, std::chrono::milliseconds(900));
    EXPECT_LT(held, std::chrono::milliseconds(5000));
    for (const int fd : sockets) {
        ::close(fd);
    }
    RemoveTree(kDaemonSocket);
}

TEST_F(DaemonSocketTest, SigpipeIsIgnoredFromTheFirstCallOn) {
    for (const bool withDaemon : {true, false}) {
        std::optional<DaemonPeer> daemon;
        if (withDaemon) {
            daemon.emplace();
        }
        ASSERT_NE(::signal(SIGPIPE, SIG_DFL), SIG_ERR);
        EXPECT_EQ(SendText(100), withDaemon);
        struct sigaction action {};
        ASSERT_EQ(::sigaction(SIGPIPE, nullptr, &action), 0);
        EXPECT_EQ(action.sa_handler, SIG_IGN);
    }
}

TEST_F(DaemonSocketTest, ADaemonThatHangsUpFailsTheCall) {
    DaemonPeer daemon(DaemonPeer::Mode::CloseAtOnce);
    Fault::Before(Call::Write, [&](CallInfo &) { daemon.Sync(); }); // it has hung up now
    EXPECT_FALSE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Write), 1U);
}

TEST_F(DaemonSocketTest, WritesPiecesOf1024Bytes) {
    const struct {
        std::size_t textBytes;
        std::vector<std::size_t> writes;
    } kRows[] = {
        {22, {4, 23}},        {1022, {4, 1023}},       {1023, {4, 1024}},
        {1024, {4, 1024, 1}}, {2047, {4, 1024, 1024}}, {2048, {4, 1024, 1024, 1}},
    };
    DaemonPeer daemon;
    for (const auto &row : kRows) {
        daemon.Clear();
        Fault::Reset();
        Fault::Count(Call::Write);
        EXPECT_TRUE(SendText(row.textBytes)) << row.textBytes;
        EXPECT_EQ(SizesOfWrites(), row.writes) << row.textBytes;
        ASSERT_EQ(daemon.Connections().size(), 1U);
        const PeerConnection connection = daemon.Connections()[0];
        EXPECT_TRUE(connection.complete);
        EXPECT_EQ(connection.length, row.textBytes + 1);
    }
}

TEST_F(DaemonSocketTest, ALongCommandArrivesWhole) {
    DaemonPeer daemon;
    EXPECT_TRUE(SendText(std::size_t{3} << 20));
    ASSERT_EQ(daemon.Messages().size(), 1U);
    EXPECT_EQ(daemon.Messages()[0]["data"], PaddingFor(std::size_t{3} << 20));
}

TEST_F(DaemonSocketTest, ShortWritesAreContinued) {
    DaemonPeer daemon;
    Fault::Before(Call::Write, [](CallInfo &info) { info.size = 1; });
    EXPECT_TRUE(SendText(1500));
    ASSERT_EQ(daemon.Messages().size(), 1U);
    EXPECT_EQ(daemon.Messages()[0]["data"], PaddingFor(1500));
    EXPECT_EQ(Fault::Calls(Call::Write), 4U + 1501U);
    EXPECT_EQ(Fault::Log(Call::Write)[4].size, 1024U);
    EXPECT_EQ(Fault::Log(Call::Write)[4 + 1501 - 1024].size, 1024U);
    EXPECT_EQ(Fault::Log(Call::Write)[4 + 1501 - 1023].size, 1023U);
}

TEST_F(DaemonSocketTest, AWriteOfNothingEndsTheCall) {
    DaemonPeer daemon;
    for (const int error : {0, EAGAIN, EPIPE}) {
        Fault::Reset();
        AnswerWrites({{0, error}});
        EXPECT_FALSE(SendText(100));
        EXPECT_EQ(Fault::Calls(Call::Write), 1U);
        Fault::Reset();
        AnswerWrites({kWhole, {0, error}});
        EXPECT_FALSE(SendText(100));
        EXPECT_EQ(Fault::Calls(Call::Write), 2U);
    }
}

TEST_F(DaemonSocketTest, AnInterruptedWriteOfNothingIsRepeatedThreeTimes) {
    DaemonPeer daemon;
    Fault::Count(Call::Usleep);
    AnswerWrites({kInterrupted, kInterrupted, kInterrupted});
    EXPECT_TRUE(SendText(2047));
    EXPECT_THAT(SizesOfWrites(), ElementsAre(4, 4, 4, 4, 1024, 1024));
    for (int repeated = 1; repeated < 4; ++repeated) {
        EXPECT_EQ(Fault::Log(Call::Write)[static_cast<std::size_t>(repeated)].data,
                  Fault::Log(Call::Write)[0].data);
    }
    EXPECT_EQ(Fault::Calls(Call::Usleep), 0U);
    EXPECT_THAT(daemon.Connections(), ElementsAre(Field(&PeerConnection::complete, true)));
}

TEST_F(DaemonSocketTest, TheFourthInterruptedWriteOfNothingEndsTheCall) {
    DaemonPeer daemon;
    AnswerWrites({kInterrupted, kInterrupted, kInterrupted, kInterrupted});
    EXPECT_FALSE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Write), 4U);
}

TEST_F(DaemonSocketTest, RepeatingEndsAtAnotherError) {
    DaemonPeer daemon;
    AnswerWrites({kInterrupted, {0, EAGAIN}});
    EXPECT_FALSE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Write), 2U);
}

TEST_F(DaemonSocketTest, TheRepetitionsAreSharedByAllPieces) {
    DaemonPeer daemon;
    AnswerWrites({kWhole, kInterrupted, kInterrupted, kWhole, kInterrupted, kWhole});
    EXPECT_TRUE(SendText(2047));
    EXPECT_THAT(SizesOfWrites(), ElementsAre(4, 1024, 1024, 1024, 1024, 1024));
    Fault::Reset();
    AnswerWrites({kWhole, kInterrupted, kInterrupted, kWhole, kInterrupted, kInterrupted});
    EXPECT_FALSE(SendText(2047));
    EXPECT_EQ(Fault::Calls(Call::Write), 6U);
}

TEST_F(DaemonSocketTest, LengthAndTextHaveRepetitionsOfTheirOwn) {
    DaemonPeer daemon;
    AnswerWrites({kInterrupted, kInterrupted, kInterrupted, kWhole, kInterrupted, kInterrupted,
                  kInterrupted, kWhole});
    EXPECT_TRUE(SendText(100));
    EXPECT_THAT(daemon.Connections(), ElementsAre(Field(&PeerConnection::complete, true)));
}

TEST_F(DaemonSocketTest, AFailureBeforeTheFirstByteEndsTheCall) {
    DaemonPeer daemon;
    AnswerWrites({kFailed});
    EXPECT_FALSE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Write), 1U);
    Fault::Reset();
    AnswerWrites({kWhole, {-1, EINTR}});
    EXPECT_FALSE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Write), 2U);
}

TEST_F(DaemonSocketTest, AFailureStepsBackOneByte) {
    DaemonPeer daemon;
    AnswerWrites({kWhole, kWhole, kFailed});
    EXPECT_TRUE(SendText(2047));
    EXPECT_THAT(SizesOfWrites(), ElementsAre(4, 1024, 1024, 1024, 1));
    const std::vector<CallInfo> writes = Fault::Log(Call::Write);
    const char *const text = static_cast<const char *>(writes[1].data);
    EXPECT_EQ(static_cast<const char *>(writes[2].data), text + 1024);
    EXPECT_EQ(static_cast<const char *>(writes[3].data), text + 1023);
    EXPECT_EQ(static_cast<const char *>(writes[4].data), text + 2047);
    ASSERT_EQ(daemon.Connections().size(), 1U);
    EXPECT_EQ(daemon.Connections()[0].bytes.size(), 4U + 2048U + 1U) << "one byte came twice";
}

TEST_F(DaemonSocketTest, TheFirstByteIsAsFarBackAsItGoes) {
    DaemonPeer daemon;
    AnswerWrites({kWhole, {2, 0}, kFailed, kFailed});
    EXPECT_TRUE(SendText(100));
    EXPECT_THAT(SizesOfWrites(), ElementsAre(4, 101, 99, 100, 101));
    EXPECT_EQ(Fault::Log(Call::Write)[4].data, Fault::Log(Call::Write)[1].data);
    Fault::Reset();
    AnswerWrites({kWhole, {2, 0}, kFailed, kFailed, kFailed});
    EXPECT_FALSE(SendText(100));
    EXPECT_EQ(Fault::Calls(Call::Write), 5U);
}

TEST_F(DaemonSocketTest, EndlessFailuresEndTheCall) {
    DaemonPeer daemon;
    Fault::On(Call::Write, [writes = 0](CallInfo &) mutable -> std::optional<long> {
        if (++writes <= 2) {
            return std::nullopt;
        }
        errno = EPIPE;
        return -1;
    });
    EXPECT_FALSE(SendText(4000));
    EXPECT_EQ(Fault::Calls(Call::Write), 2U + 1025U);
}

TEST_F(DaemonSocketTest, ThreadsSendAtTheSameTime) {
    constexpr int kThreads = 8;
    constexpr int kCommands = 25;
    DaemonPeer daemon;
    std::vector<std::thread> threads;
    std::vector<int> sent(kThreads, 0);
    for (int thread = 0; thread < kThreads; ++thread) {
        threads.emplace_back([thread, &sent] {
            for (int command = 0; command < kCommands; ++command) {
                const std::string name = std::to_string(thread) + "." + std::to_string(command);
                sent[static_cast<std::size_t>(thread)] +=
                    SendCammandToDaemon(name, PaddingFor(3000)) ? 1 : 0;
            }
        });
    }
    for (std::thread &thread : threads) {
        thread.join();
    }
    EXPECT_THAT(sent, Each(kCommands));
    const std::vector<PeerConnection> connections = daemon.Connections();
    EXPECT_EQ(connections.size(), std::size_t{kThreads} * kCommands);
    EXPECT_THAT(connections, Each(Field(&PeerConnection::complete, true)));
}

} // namespace

} // namespace VANO::TESTS
