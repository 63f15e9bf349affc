#include "terminal/times.h"

#include <cstdlib>
#include <gtest/gtest.h>

#include "support/files.h"

namespace VANO::TESTS {
namespace {

using namespace CTL;

// Local time is that of a place while this lives.
class Place {
  public:
    explicit Place(const char *zone) { Set(zone); }
    ~Place() { Set("UTC"); }
    Place(const Place &) = delete;
    Place &operator=(const Place &) = delete;

  private:
    static void Set(const char *zone) {
        (void)::setenv("TZ", zone, 1);
        ::tzset();
    }
};

std::time_t Utc(const char *text) {
    std::tm time{};
    EXPECT_NE(::strptime(text, "%Y-%m-%d %H:%M", &time), nullptr);
    return ::timegm(&time);
}

std::string UtcText(std::time_t time) {
    char text[64] = "";
    std::tm utc{};
    (void)std::strftime(text, sizeof(text), "%Y-%m-%d %H:%M", ::gmtime_r(&time, &utc));
    return text;
}

struct Question {
    const char *zone;
    const char *now; // UTC
    const char *text;
    const char *moment; // UTC
};

class ClockTest : public ::testing::TestWithParam<Question> {
  protected:
    void SetUp() override {
        if (!Exists("/usr/share/zoneinfo/Europe/Berlin")) {
            GTEST_SKIP() << "no tzdata: all places have the same time";
        }
    }
};

TEST_P(ClockTest, ATimeOfTheDayIsTheNextOneThatTheClockShows) {
    const auto &[zone, now, text, expected] = GetParam();
    const Place place(zone);
    std::time_t moment = 0;
    ASSERT_TRUE(ReadMoment(moment, text, Utc(now) + 7)); // within the minute
    EXPECT_EQ(UtcText(moment), expected);
    EXPECT_EQ(moment % 60, 0);
}

INSTANTIATE_TEST_SUITE_P(
    Places, ClockTest,
    ::testing::Values(Question{"UTC", "2026-11-20 09:30", "09:31", "2026-11-20 09:31"},
                      Question{"UTC", "2026-11-20 09:30", "09:30", "2026-11-21 09:30"},
                      Question{"UTC", "2026-11-30 09:30", "07:00", "2026-12-01 07:00"},
                      Question{"UTC", "2026-12-31 23:59", "00:00", "2027-01-01 00:00"},
                      Question{"Asia/Kolkata", "2026-02-28 20:30", "01:30", "2026-03-01 20:00"},
                      // The day that has 25 hours: 24 hours later it is still that day.
                      Question{"Europe/Berlin", "2026-10-24 22:30", "00:15", "2026-10-25 23:15"},
                      Question{"Europe/Berlin", "2026-10-24 22:30", "07:30", "2026-10-25 06:30"},
                      // 02:30 comes twice.
                      Question{"Europe/Berlin", "2026-10-24 23:30", "02:30", "2026-10-25 00:30"},
                      Question{"Europe/Berlin", "2026-10-25 00:45", "02:30", "2026-10-25 01:30"},
                      Question{"Europe/Berlin", "2026-10-25 01:45", "02:30", "2026-10-26 01:30"},
                      Question{"Europe/Dublin", "2026-10-24 22:30", "01:30", "2026-10-25 00:30"},
                      // The day that has 23 hours: 24 hours later it is the day after.
                      Question{"Europe/Berlin", "2027-03-27 22:30", "23:15", "2027-03-28 21:15"},
                      Question{"America/New_York", "2027-03-14 04:30", "23:15", "2027-03-15 03:15"},
                      // 02:30 does not come.
                      Question{"Europe/Berlin", "2027-03-27 23:30", "02:30", "2027-03-29 00:30"}),
    [](const auto &row) { return "Row" + std::to_string(row.index); });

TEST(TimesTest, ADayAndATimeAreLocal) {
    const Place place("CET-1CEST,M3.5.0,M10.5.0/3");
    std::time_t moment = 0;
    for (const char *text : {"2026-12-24 18:00", "2026-12-24T18:00"}) {
        ASSERT_TRUE(ReadMoment(moment, text, Utc("2026-11-20 09:30")));
        EXPECT_EQ(UtcText(moment), "2026-12-24 17:00");
    }
    ASSERT_TRUE(ReadMoment(moment, "2026-07-24 18:00", Utc("2026-11-20 09:30")));
    EXPECT_EQ(UtcText(moment), "2026-07-24 16:00");
}

TEST(TimesTest, WhatIsNoTimeIsRefused) {
    std::time_t moment = 0;
    for (const char *text : {"", "noon", "25:00", "07:60", "7", "07:30 ", "07:30:00",
                             "2026-02-30 10:00", "2026-13-01 10:00", "2026-12-24", "12-24 18:00"}) {
        EXPECT_FALSE(ReadMoment(moment, text, Utc("2026-11-20 09:30"))) << text;
    }
}

TEST(TimesTest, DurationsAddUp) {
    const std::pair<const char *, long long> rows[] = {
        {"8h", 8 * 3600}, {"90m", 90 * 60},  {"2d", 2 * 86400},
        {"1h30m", 5400},  {"1d1h1m", 90060}, {"30m1h", 5400},
        {"0h", 0},        {"007m", 420},     {"999999999d", 999999999LL * 86400}};
    for (const auto &[text, expected] : rows) {
        long long seconds = -1;
        EXPECT_TRUE(ReadDuration(seconds, text)) << text;
        EXPECT_EQ(seconds, expected) << text;
    }
}

TEST(TimesTest, WhatIsNoDurationIsRefused) {
    long long seconds = -1;
    for (const char *text :
         {"", "8", "h", "8s", "-1h", "1.5h", "1h ", "8 h", "1h30", "hh", "1000000000m"}) {
        EXPECT_FALSE(ReadDuration(seconds, text)) << text;
    }
}

} // namespace
} // namespace VANO::TESTS
