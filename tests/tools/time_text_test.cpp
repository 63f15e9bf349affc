#include "terminal/times.h"

#include <cstdlib>
#include <gtest/gtest.h>

namespace VANO::TESTS {
namespace {

using namespace CTL;

constexpr std::time_t kFriday = 1795167000; // 2026-11-20 09:30:00 UTC
constexpr long long kHour = 3600;

TEST(TimeTextTest, DurationsAreOneRoundedNumber) {
    const std::pair<long long, const char *> rows[] = {
        {-5, "0 s"},        {0, "0 s"},           {99, "99 s"},           {100, "2 min"},
        {149, "2 min"},     {150, "3 min"},       {99 * 60, "99 min"},    {100 * 60, "2 h"},
        {6 * kHour, "6 h"}, {47 * kHour, "47 h"}, {48 * kHour, "2 days"}, {60 * kHour, "3 days"}};
    for (const auto &[seconds, text] : rows) {
        EXPECT_EQ(DurationText(seconds), text) << seconds;
    }
}

TEST(TimeTextTest, APauseNamesTheWeekdayAndWhatIsLeft) {
    EXPECT_EQ(PauseText(kFriday + 22 * kHour, kFriday), "paused until Sat 07:30, 22 h left");
    EXPECT_EQ(PauseText(kFriday + 1, kFriday), "paused until Fri 09:30, 1 s left");
}

TEST(TimeTextTest, APauseBeyondThisWeekNamesTheDate) {
    EXPECT_EQ(PauseText(kFriday + 6 * 24 * kHour - 1, kFriday),
              "paused until Thu 09:29, 6 days left");
    EXPECT_EQ(PauseText(kFriday + 6 * 24 * kHour, kFriday),
              "paused until 2026-11-26 09:30, 6 days left");
}

TEST(TimeTextTest, APauseWithoutEndSaysSo) {
    EXPECT_EQ(PauseText(0, kFriday), "paused until resumed");
}

TEST(TimeTextTest, WhatHasEndedIsNoPause) {
    for (const long long resumeTime : {-1LL, 1LL, static_cast<long long>(kFriday)}) {
        EXPECT_EQ(PauseText(resumeTime, kFriday), "not paused") << resumeTime;
    }
}

TEST(TimeTextTest, StampsBearTheirZone) {
    EXPECT_EQ(StampText(kFriday), "2026-11-20T09:30:00+0000");
}

} // namespace
} // namespace VANO::TESTS
