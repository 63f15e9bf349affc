#include <ctime>
#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

std::string LocalText(std::time_t time, const char *format = "%Y-%m-%d %H:%M") {
    std::tm local{};
    char text[64];
    std::strftime(text, sizeof(text), format, ::localtime_r(&time, &local));
    return text;
}

TEST_F(CtlTest, PauseWithoutATimeHasNoEnd) {
    StartDaemon();
    const Outcome outcome = Ctl({"pause"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Indexing is paused until resumed.\n"
                             "  fileindexctl resume ends the pause.\n");
    EXPECT_EQ(ReadText(kStatus), R"({"resume_time":0})");
    EXPECT_THAT(Told(), ElementsAre(R"(command pause {"resume_time":0})"));
}

TEST_F(CtlTest, PauseSaysUntilWhenAsStatusDoes) {
    StartDaemon();
    const Outcome outcome = Ctl({"pause", "--for", "8h"});
    EXPECT_EQ(outcome.status, kDone);
    const std::time_t until = ReadJson(kStatus)["resume_time"].asInt64();
    const std::string text = "paused until " + LocalText(until, "%a %H:%M") + ", 8 h left";
    EXPECT_EQ(outcome.error, "fileindexctl: Indexing is " + text + ".\n");
    EXPECT_THAT(Ctl({"status"}).out, HasSubstr("Indexing: " + text + "\n"));
    EXPECT_THAT(Told(),
                ElementsAre("command pause {\"resume_time\":" + std::to_string(until) + "}"));
}

TEST_F(CtlTest, ResumeEndsThePause) {
    StartDaemon();
    PutFile(kStatus, R"({"resume_time":0})");
    const Outcome outcome = Ctl({"resume"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Indexing is resumed.\n");
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

TEST_F(CtlTest, PauseOfALockedStatusFileFails) {
    StartDaemon();
    const HoldLock other(kStatusLock);
    const Outcome outcome = Ctl({"pause"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot pause indexing: the settings are locked"));
    EXPECT_FALSE(Exists(kStatus));
    EXPECT_THAT(Told(), IsEmpty());
}

struct Length {
    const char *what;
    const char *text;
    long long seconds;

    friend void PrintTo(const Length &length, std::ostream *out) { *out << length.what; }
};

class PauseLengthTest : public CtlTest, public ::testing::WithParamInterface<Length> {};

TEST_P(PauseLengthTest, IsKeptToTheSecond) {
    StartDaemon();
    const std::time_t before = std::time(nullptr);
    ASSERT_EQ(Ctl({"pause", "--for", GetParam().text}).status, kDone);
    const std::time_t until = ReadJson(kStatus)["resume_time"].asInt64();
    EXPECT_GE(until, before + GetParam().seconds);
    EXPECT_LE(until, std::time(nullptr) + GetParam().seconds);
    EXPECT_FALSE(IsLocked(kStatusLock));
}

INSTANTIATE_TEST_SUITE_P(Lengths, PauseLengthTest,
                         ::testing::Values(Length{"Hours", "8h", 8 * 3600},
                                           Length{"Days", "2d", 48 * 3600},
                                           Length{"Minute", "1m", 60},
                                           Length{"Several", "1d1h30m", 25 * 3600 + 1800}),
                         [](const auto &row) { return row.param.what; });

TEST_F(CtlTest, PauseUntilATimeEndsThen) {
    StartDaemon();
    const std::time_t now = std::time(nullptr);
    for (const std::time_t end : {now + 90, now + 10 * 24 * 3600}) {
        const std::string text = LocalText(end);
        ASSERT_EQ(Ctl({"pause", "--until", text}).status, kDone);
        EXPECT_EQ(ReadJson(kStatus)["resume_time"].asInt64(), end - end % 60) << text;
    }
    ASSERT_EQ(Ctl({"pause", "--until", LocalText(now + 90).substr(11)}).status, kDone);
    EXPECT_EQ(ReadJson(kStatus)["resume_time"].asInt64(), now + 90 - (now + 90) % 60);
}

TEST_F(CtlTest, PauseAndResumeDryRunTellAndDoNothing) {
    StartDaemon();
    EXPECT_EQ(Ctl({"pause", "--dry-run"}).out, "Would pause indexing until resumed.\n");
    EXPECT_EQ(Ctl({"pause", "--until", "2037-12-24 18:00", "--dry-run"}).out,
              "Would pause indexing until 2037-12-24 18:00.\n");
    EXPECT_EQ(Ctl({"resume", "--dry-run"}).out,
              "Would end the pause, if any, and tell the daemon.\n");
    EXPECT_FALSE(Exists(kStatus));
    EXPECT_THAT(Told(), IsEmpty());
}

} // namespace
} // namespace VANO::TESTS
