#include <ctime>
#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

std::string LocalText(std::time_t time) {
    std::tm local{};
    char text[64];
    std::strftime(text, sizeof(text), "%Y-%m-%d %H:%M", ::localtime_r(&time, &local));
    return text;
}

TEST_F(CtlTest, PauseWithoutATimeHasNoEnd) {
    StartDaemon();
    for (const Words &arguments : {Words{"pause"}, Words{"pause", "--forever"}}) {
        RemoveTree(kStatus);
        const Outcome outcome = Ctl(arguments);
        EXPECT_EQ(outcome.status, kDone);
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(outcome.error, "fileindexctl: Indexing is paused, until fileindexctl resume.\n");
        EXPECT_EQ(ReadText(kStatus), R"({"resume_time":0})");
    }
    EXPECT_THAT(Told(), ElementsAre(R"(command pause {"resume_time":0})",
                                    R"(command pause {"resume_time":0})"));
}

TEST_F(CtlTest, PauseForHoursSaysUntilWhen) {
    StartDaemon();
    const std::time_t before = std::time(nullptr);
    const Outcome outcome = Ctl({"pause", "--for", "8h"});
    EXPECT_EQ(outcome.status, kDone);
    const std::time_t until = ReadJson(kStatus)["resume_time"].asInt64();
    EXPECT_GE(until, before + 8 * 3600);
    EXPECT_LE(until, std::time(nullptr) + 8 * 3600);
    EXPECT_EQ(outcome.error, "fileindexctl: Indexing is paused until " + LocalText(until) + ".\n");
}

TEST_F(CtlTest, ResumeEndsThePause) {
    StartDaemon();
    PutFile(kStatus, R"({"resume_time":0})");
    const Outcome outcome = Ctl({"resume"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Indexing goes on.\n");
    EXPECT_EQ(ReadText(kStatus), R"({"resume_time":-1})");
    EXPECT_THAT(Told(), ElementsAre("command resume {}"));
}

TEST_F(CtlTest, WithoutADaemonThePauseIsSavedOnly) {
    for (const char *command : {"pause", "resume"}) {
        const Outcome outcome = Ctl({command});
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_THAT(outcome.error, AllOf(HasSubstr("pause is saved, but not every part"),
                                         HasSubstr("is fileindexd running?")));
        EXPECT_EQ(ReadJson(kStatus)["resume_time"].asInt(),
                  std::string(command) == "pause" ? 0 : -1);
    }
}

TEST_F(CtlTest, PauseOfABrokenStatusFileFails) {
    StartDaemon();
    PutFile(kStatus, "{");
    for (const char *command : {"pause", "resume"}) {
        const Outcome outcome = Ctl({command});
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_THAT(outcome.error, HasSubstr("a settings file cannot be read"));
    }
    EXPECT_EQ(ReadText(kStatus), "{");
    EXPECT_THAT(Told(), IsEmpty());
}

struct Length {
    const char *what;
    const char *text;
    long long hours; // that the library is asked for

    friend void PrintTo(const Length &length, std::ostream *out) { *out << length.what; }
};

class PauseLengthTest : public CtlTest, public ::testing::WithParamInterface<Length> {};

TEST_P(PauseLengthTest, IsRoundedUpToWholeHours) {
    StartDaemon();
    const std::time_t before = std::time(nullptr);
    ASSERT_EQ(Ctl({"pause", "--for", GetParam().text}).status, kDone);
    const std::time_t until = ReadJson(kStatus)["resume_time"].asInt64();
    EXPECT_GE(until, before + GetParam().hours * 3600);
    EXPECT_LE(until, std::time(nullptr) + GetParam().hours * 3600);
}

INSTANTIATE_TEST_SUITE_P(Lengths, PauseLengthTest,
                         ::testing::Values(Length{"Hours", "8h", 8}, Length{"Days", "2d", 48},
                                           Length{"Minutes", "60m", 1},
                                           Length{"PartOfAnHour", "1m", 1},
                                           Length{"MoreThanAnHour", "61m", 2},
                                           Length{"Several", "1d1h30m", 26}),
                         [](const auto &row) { return row.param.what; });

TEST_F(CtlTest, PauseSaysThatItRoundsUp) {
    StartDaemon();
    EXPECT_THAT(Ctl({"pause", "--for", "90m"}).error,
                HasSubstr("\n  The service counts whole hours: rounded up to 2 h.\n"));
    EXPECT_THAT(Ctl({"pause", "--for", "2h"}).error, Not(HasSubstr("rounded")));
}

TEST_F(CtlTest, PauseUntilATimeOfTheDayLastsAtMostADay) {
    StartDaemon();
    const std::time_t soon = std::time(nullptr) + 90; // never the minute that is running
    const std::time_t ago = std::time(nullptr) - 90;
    ASSERT_EQ(Ctl({"pause", "--until", LocalText(soon).substr(11)}).status, kDone);
    EXPECT_LE(ReadJson(kStatus)["resume_time"].asInt64(), std::time(nullptr) + 3600);
    ASSERT_EQ(Ctl({"pause", "--until", LocalText(ago).substr(11)}).status, kDone);
    EXPECT_GT(ReadJson(kStatus)["resume_time"].asInt64(), std::time(nullptr) + 23 * 3600);
    EXPECT_LE(ReadJson(kStatus)["resume_time"].asInt64(), std::time(nullptr) + 24 * 3600);
}

TEST_F(CtlTest, PauseUntilADayReachesIt) {
    StartDaemon();
    const std::time_t day = std::time(nullptr) + 10 * 24 * 3600;
    ASSERT_EQ(Ctl({"pause", "--until", LocalText(day)}).status, kDone);
    const std::time_t until = ReadJson(kStatus)["resume_time"].asInt64();
    EXPECT_GE(until, day - day % 60);
    EXPECT_LE(until, day + 3600);
}

TEST_F(CtlTest, PauseAndResumeDryRunTellAndDoNothing) {
    StartDaemon();
    EXPECT_EQ(Ctl({"pause", "--dry-run"}).out, "Would pause indexing until fileindexctl resume.\n");
    EXPECT_THAT(Ctl({"pause", "--for", "1h", "--dry-run"}).out,
                StartsWith("Would pause indexing until 2"));
    EXPECT_EQ(Ctl({"resume", "--dry-run"}).out, "Would end any pause and tell the daemon.\n");
    EXPECT_FALSE(Exists(kStatus));
    EXPECT_THAT(Told(), IsEmpty());
}

} // namespace
} // namespace VANO::TESTS
