#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, MarksListShowsWhatIsDone) {
    PutFile(kStatus, R"({"b":true,"a":true,"c":false,"d":1,"e":"text","resume_time":0,)"
                     R"("no_space":{},"need_reindex":{}})");
    const Outcome outcome = Ctl({"marks", "list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "a  done\nb  done\nc  not done\nd  done\ne  not done\n");
    EXPECT_EQ(outcome.error, "");
}

TEST_F(CtlTest, MarksListAsJson) {
    EXPECT_EQ(Ctl({"marks", "list", "--json"}).out, "{\"mark\":[]}\n");
    PutFile(kStatus, R"({"a":true})");
    EXPECT_EQ(Ctl({"marks", "list", "--json"}).out, R"({"mark":[{"done":true,"name":"a"}]})"
                                                    "\n");
}

TEST_F(CtlTest, MarksListOfNothingSaysSo) {
    const Outcome outcome = Ctl({"marks", "list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: No mark is set.\n");
}

TEST_F(CtlTest, MarksSetMarksAStepAsDone) {
    EXPECT_EQ(Ctl({"marks", "set", "step 1", "--dry-run"}).out, "Would mark step 1 as done.\n");
    EXPECT_FALSE(Exists(kStatus));
    const Outcome outcome = Ctl({"marks", "set", "step 1"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Marked step 1 as done.\n");
    EXPECT_EQ(ReadText(kStatus), R"({"step 1":true})");
}

TEST_F(CtlTest, MarksOfABrokenStatusFileFail) {
    for (const char *broken : {"{", "[]"}) {
        PutFile(kStatus, broken);
        const Outcome outcome = Ctl({"marks", "list"});
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_THAT(outcome.error, HasSubstr("Cannot list the marks: a settings file"));
        EXPECT_EQ(Ctl({"marks", "set", "a"}).status, kFailed);
        EXPECT_EQ(ReadText(kStatus), broken);
    }
}

} // namespace
} // namespace VANO::TESTS
