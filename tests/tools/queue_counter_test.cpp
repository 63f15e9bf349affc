#include "state/queue_counter.h"

#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "support/files.h"

namespace VANO::TESTS {
namespace {

using CTL::Clock;
using CTL::QueueCounter;

const std::string kQueue = "/tmp/queues/queue";
const std::string kTaken = kQueue + ".tmp";
constexpr auto kForever = Clock::time_point::max();

std::string Event(const std::string &path) {
    return R"({"data":null,"event":131072,"path":")" + path + "\"}\n";
}

std::string Move(const std::string &from, const std::string &to) {
    return R"({"event":256,"path":")" + to + R"(","path_old":")" + from + "\"}\n";
}

std::string Times(int count, const std::string &text) {
    std::string all;
    for (int i = 0; i < count; ++i) {
        all += text;
    }
    return all;
}

void Append(const std::string &path, const std::string &text) {
    const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
    EXPECT_EQ(::write(fd, text.data(), text.size()), static_cast<ssize_t>(text.size()));
    ::close(fd);
}

void Rename(const std::string &from, const std::string &to) {
    EXPECT_EQ(::rename(from.c_str(), to.c_str()), 0);
}

class QueueCounterTest : public ::testing::Test {
  protected:
    void SetUp() override {
        RemoveTree("/tmp/queues");
        MakeDirs("/tmp/queues");
    }

    std::uint64_t Count() {
        EXPECT_TRUE(counter.Look(kForever));
        EXPECT_EQ(counter.Counted(), 1);
        return counter.Events();
    }

    QueueCounter counter{kQueue, {"/v/a", "/v/a/deep", "/v/b"}};
};

TEST_F(QueueCounterTest, NoFileIsAnEmptyQueue) {
    EXPECT_EQ(Count(), 0U);
    EXPECT_EQ(counter.Error(), 0);
}

TEST_F(QueueCounterTest, CountsTheQueueAndTheOneTakenOver) {
    PutFile(kTaken, Event("/v/a/1"));
    PutFile(kQueue, Event("/v/a/2") + Event("/v/c"));
    EXPECT_EQ(Count(), 3U);
    EXPECT_EQ(counter.EventsOf("/v/a"), 2U);
    EXPECT_EQ(counter.EventsOf("/v/a/deep"), 0U);
    EXPECT_EQ(counter.EventsOf(""), 0U); // of a folder whose share is gone
}

TEST_F(QueueCounterTest, AMoveCountsOnceOnEitherSide) {
    PutFile(kQueue, Move("/v/a/x", "/v/b/x") + Move("/v/a/x", "/v/a/y"));
    EXPECT_EQ(Count(), 2U);
    EXPECT_EQ(counter.EventsOf("/v/a"), 2U);
    EXPECT_EQ(counter.EventsOf("/v/b"), 1U);
}

// Only a second reading could see that.
void BlankTheFirst(std::size_t bytes) {
    const int fd = ::open(kQueue.c_str(), O_WRONLY | O_CLOEXEC);
    const std::string blanks(bytes, ' ');
    EXPECT_EQ(::pwrite(fd, blanks.data(), blanks.size(), 0), static_cast<ssize_t>(blanks.size()));
    ::close(fd);
}

TEST_F(QueueCounterTest, GoesOnWhereItStopped) {
    PutFile(kQueue, Event("/v/a"));
    EXPECT_EQ(Count(), 1U);
    Append(kQueue, Event("/v/a") + Event("/v/b"));
    EXPECT_EQ(Count(), 3U);
    EXPECT_EQ(Count(), 3U);
}

// What was counted is not looked at again: it may be gigabytes.
TEST_F(QueueCounterTest, DoesNotReadAgainWhatItHasCounted) {
    const std::string old = Event("/v/a");
    PutFile(kQueue, Times(100, old));
    EXPECT_EQ(Count(), 100U);
    BlankTheFirst(50 * old.size());
    Append(kQueue, Event("/v/a"));
    EXPECT_EQ(Count(), 101U);
}

TEST_F(QueueCounterTest, TheLastLineNeedsNoNewline) {
    const std::string event = Event("/v/a");
    PutFile(kQueue, event + event.substr(0, event.size() - 1));
    EXPECT_EQ(Count(), 2U);
    Append(kQueue, "\n");
    EXPECT_EQ(Count(), 2U);
    Append(kQueue, event);
    EXPECT_EQ(Count(), 3U);
}

TEST_F(QueueCounterTest, ALineMayComeInPieces) {
    const std::string event = Event("/v/a");
    PutFile(kQueue, event.substr(0, 10));
    EXPECT_EQ(Count(), 0U);
    Append(kQueue, event.substr(10, 10));
    EXPECT_EQ(Count(), 0U);
    Append(kQueue, event.substr(20) + event);
    EXPECT_EQ(Count(), 2U);
    EXPECT_EQ(counter.EventsOf("/v/a"), 2U);
}

TEST_F(QueueCounterTest, LinesMayCrossTheBoundsOfWhatIsReadAtOnce) {
    const std::string event = Event("/v/a/" + std::string(70, 'x'));
    PutFile(kQueue, Times(5000, event));
    EXPECT_EQ(Count(), 5000U);
    EXPECT_EQ(counter.EventsOf("/v/a"), 5000U);
}

TEST_F(QueueCounterTest, AQueueTakenOverIsNotCountedAgain) {
    const std::string old = Event("/v/a");
    PutFile(kQueue, Times(100, old));
    EXPECT_EQ(Count(), 100U);
    BlankTheFirst(50 * old.size());
    Rename(kQueue, kTaken);
    EXPECT_EQ(Count(), 100U);
    PutFile(kQueue, Event("/v/b"));
    EXPECT_EQ(Count(), 101U);
    RemoveTree(kTaken);
    EXPECT_EQ(Count(), 1U);
    RemoveTree(kQueue);
    EXPECT_EQ(Count(), 0U);
}

TEST_F(QueueCounterTest, ATakenQueueReplacesTheOneBeforeIt) {
    PutFile(kTaken, Times(7, Event("/v/a")));
    PutFile(kQueue, Times(2, Event("/v/b")));
    EXPECT_EQ(Count(), 9U);
    Rename(kQueue, kTaken);
    EXPECT_EQ(Count(), 2U);
    EXPECT_EQ(counter.EventsOf("/v/a"), 0U);
    EXPECT_EQ(counter.EventsOf("/v/b"), 2U);
}

TEST_F(QueueCounterTest, OneFileUnderBothNamesCountsOnce) {
    PutFile(kQueue, Event("/v/a"));
    ASSERT_EQ(::link(kQueue.c_str(), kTaken.c_str()), 0);
    EXPECT_EQ(Count(), 1U);
    EXPECT_EQ(Count(), 1U);
}

TEST_F(QueueCounterTest, AShorterFileIsCountedAnew) {
    PutFile(kQueue, Times(10, Event("/v/a")));
    EXPECT_EQ(Count(), 10U);
    PutFile(kQueue, Event("/v/b")); // in place
    EXPECT_EQ(Count(), 1U);
    EXPECT_EQ(counter.EventsOf("/v/a"), 0U);
}

TEST_F(QueueCounterTest, AFileThatWasFilledAgainIsCountedAnew) {
    PutFile(kQueue, Times(10, Event("/v/a")));
    EXPECT_EQ(Count(), 10U);
    PutFile(kQueue, Times(20, Event("/v/b"))); // the same file, and longer
    EXPECT_EQ(Count(), 20U);
    EXPECT_EQ(counter.EventsOf("/v/a"), 0U);
}

TEST_F(QueueCounterTest, AnotherFileInItsPlaceIsCountedAnew) {
    PutFile(kQueue, Times(10, Event("/v/a")));
    EXPECT_EQ(Count(), 10U);
    PutFile("/tmp/queues/new", Times(20, Event("/v/a")));
    Rename("/tmp/queues/new", kQueue);
    EXPECT_EQ(Count(), 20U);
}

TEST_F(QueueCounterTest, ALookEndsInTimeAndTheNextGoesOn) {
    PutFile(kQueue, Times(20000, Event("/v/a/some/file/of/a/usual/length")));
    double counted = 0;
    int looks = 1;
    while (!counter.Look(Clock::now())) { // each has time for one piece only
        EXPECT_GT(counter.Counted(), counted);
        counted = counter.Counted();
        EXPECT_LT(counted, 1.0 + 1e-9);
        ASSERT_LT(++looks, 1000);
    }
    EXPECT_GT(looks, 3);
    EXPECT_EQ(counter.Events(), 20000U);
}

TEST_F(QueueCounterTest, ALastLineCountsWhereverALookEnded) {
    const std::string event = Event("/v/a");
    PutFile(kQueue, event.substr(0, event.size() - 1));
    for (int look = 0; !counter.Look(Clock::now()); ++look) {
        ASSERT_LT(look, 10);
    }
    EXPECT_EQ(counter.Events(), 1U);
}

TEST_F(QueueCounterTest, FollowsNoSymbolicLink) {
    PutFile("/tmp/queues/elsewhere", Event("/v/a"));
    ASSERT_EQ(::symlink("/tmp/queues/elsewhere", kQueue.c_str()), 0);
    EXPECT_EQ(Count(), 0U);
    EXPECT_EQ(counter.Error(), ELOOP);
}

TEST_F(QueueCounterTest, NoDirectoryIsAnEmptyQueue) {
    RemoveTree("/tmp/queues");
    EXPECT_EQ(Count(), 0U);
    EXPECT_EQ(counter.Error(), 0);
}

TEST_F(QueueCounterTest, DoesNotWaitAtAPipe) {
    ASSERT_EQ(::mkfifo(kTaken.c_str(), 0600), 0);
    PutFile(kQueue, Event("/v/a"));
    EXPECT_EQ(Count(), 1U);
    EXPECT_EQ(counter.Error(), EINVAL);
    RemoveTree(kTaken);
    EXPECT_EQ(Count(), 1U);
    EXPECT_EQ(counter.Error(), 0);
}

TEST_F(QueueCounterTest, LocksNothingAndKeepsNothingOpen) {
    PutFile(kQueue, Event("/v/a"));
    const std::size_t open = NamesIn("/proc/self/fd").size();
    {
        const HoldLock writer(kQueue);
        EXPECT_EQ(Count(), 1U);
    }
    EXPECT_FALSE(IsLocked(kQueue));
    EXPECT_EQ(NamesIn("/proc/self/fd").size(), open);
}

} // namespace
} // namespace VANO::TESTS
