#include "state/queue_pace.h"

#include <gtest/gtest.h>

namespace VANO::TESTS {
namespace {

using CTL::QueuePace;

TEST(QueuePaceTest, NothingWaitingIsAllDone) {
    QueuePace progress;
    EXPECT_EQ(progress.Fraction(), 1);
    EXPECT_EQ(progress.SecondsLeft(), std::nullopt);
    progress.Observe(0, 0);
    EXPECT_EQ(progress.Fraction(), 1);
    EXPECT_EQ(progress.SecondsLeft(), std::nullopt);
}

TEST(QueuePaceTest, CountsFromTheMostThatWaited) {
    QueuePace progress;
    progress.Observe(0, 100);
    EXPECT_EQ(progress.Fraction(), 0);
    progress.Observe(1, 75);
    EXPECT_DOUBLE_EQ(progress.Fraction(), 0.25);
    progress.Observe(2, 200);
    EXPECT_EQ(progress.Fraction(), 0);
    progress.Observe(3, 50);
    EXPECT_DOUBLE_EQ(progress.Fraction(), 0.75);
}

TEST(QueuePaceTest, BeginsAnewWhenTheQueueWasEmpty) {
    QueuePace progress;
    progress.Observe(0, 1000);
    progress.Observe(1, 0);
    progress.Observe(2, 10);
    progress.Observe(3, 5);
    EXPECT_DOUBLE_EQ(progress.Fraction(), 0.5);
    EXPECT_EQ(progress.SecondsLeft(), std::nullopt); // one second of this run is too little
}

TEST(QueuePaceTest, EstimatesOnceThePaceCanBeTold) {
    QueuePace progress;
    progress.Observe(0, 100);
    progress.Observe(2, 80);
    EXPECT_EQ(progress.SecondsLeft(), std::nullopt);
    progress.Observe(4, 60);
    EXPECT_EQ(progress.SecondsLeft(), 6);
}

TEST(QueuePaceTest, EstimatesNothingWhereMoreComesThanGoes) {
    QueuePace progress;
    progress.Observe(0, 100);
    progress.Observe(10, 100);
    EXPECT_EQ(progress.SecondsLeft(), std::nullopt);
    progress.Observe(20, 150);
    EXPECT_EQ(progress.SecondsLeft(), std::nullopt);
}

TEST(QueuePaceTest, TheLastMinuteIsWhatCounts) {
    QueuePace progress;
    for (int second = 0; second <= 100; ++second) {
        progress.Observe(second, 1000); // nothing happens
    }
    for (int second = 1; second <= 60; ++second) {
        progress.Observe(100 + second, static_cast<std::uint64_t>(1000 - 10 * second));
    }
    EXPECT_EQ(progress.SecondsLeft(), 40); // 400 at 10 a second
}

TEST(QueuePaceTest, LooksThatAreFarApartStillGiveAPace) {
    QueuePace progress;
    progress.Observe(0, 300);
    progress.Observe(100, 200);
    progress.Observe(200, 100);
    EXPECT_EQ(progress.SecondsLeft(), 100);
}

TEST(QueuePaceTest, AnEndlessEstimateStaysANumber) {
    QueuePace progress;
    progress.Observe(0, ~std::uint64_t{0});
    progress.Observe(10, ~std::uint64_t{0} - 1000000);
    EXPECT_EQ(progress.SecondsLeft(), 1000000000);
}

} // namespace
} // namespace VANO::TESTS
