// What the commands that change something answer in JSON.

#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

struct Answer {
    const char *what;
    Words arguments;
    const char *facts; // beside "done" and "dry_run"

    friend void PrintTo(const Answer &answer, std::ostream *out) { *out << answer.what; }
};

class ChangeTest : public CtlTest, public ::testing::WithParamInterface<Answer> {
  protected:
    void SetUp() override {
        CtlTest::SetUp();
        StartDaemon();
        Save(kTwo);
        PutFile(kStatus, kMarked);
        PutFile(kShares, R"({"photos":"/volume1/photos","media":"/volume2/media",)"
                         R"("music":"/volume2/music"})");
    }

    static Outcome Run(const Words &options) {
        Words arguments = GetParam().arguments;
        arguments.insert(arguments.end(), options.begin(), options.end());
        return Ctl(arguments);
    }

    static std::string Expected(bool isDryRun) {
        Json::Value answer = Json(GetParam().facts);
        answer["done"] = !isDryRun;
        answer["dry_run"] = isDryRun;
        return CompactText(answer) + "\n";
    }

    static constexpr char kMarked[] = R"({"no_space":{"photos":true}})";
};

TEST_P(ChangeTest, OfADryRunTellsWhatWouldBeDone) {
    const Outcome outcome = Run({"--dry-run", "--json"});
    EXPECT_EQ(outcome.status, kDone) << outcome.error;
    EXPECT_EQ(outcome.out, Expected(true));
    EXPECT_EQ(outcome.error, "");
    EXPECT_EQ(ReadText(kFolders), kTwo);
    EXPECT_EQ(ReadText(kStatus), kMarked);
    EXPECT_FALSE(Exists(kPhotoQueue));
}

TEST_P(ChangeTest, TellsWhatWasDone) {
    const Outcome outcome = Run({"--json"});
    EXPECT_EQ(outcome.status, kDone) << outcome.error;
    EXPECT_EQ(outcome.out, Expected(false));
    EXPECT_THAT(outcome.error, HasSubstr("fileindexctl: ")); // as without the option
}

INSTANTIATE_TEST_SUITE_P(
    Commands, ChangeTest,
    ::testing::Values(
        Answer{"Add",
               {"add", "/PHOTOS", "/media/films", "--all"},
               R"({"command":"add","paths":["/photos","/media/films"]})"},
        Answer{"Set",
               {"set", "/volume1/photos", "--photo=no"},
               R"({"command":"set","paths":["/photos"]})"},
        Answer{"Remove",
               {"remove", "/photos"},
               R"({"command":"remove","paths":["/photos"],"shares":["photos"]})"},
        Answer{"Reindex", {"reindex", "/photos"}, R"({"command":"reindex","paths":["/photos"]})"},
        Answer{"ReindexAll",
               {"reindex", "--all"},
               R"({"command":"reindex","paths":["/media/films","/photos"]})"},
        Answer{"Pause",
               {"pause", "--until", "2037-12-24 18:00"},
               R"({"command":"pause","resume_time":2145290400})"},
        Answer{"PauseForever", {"pause"}, R"({"command":"pause","resume_time":0})"},
        Answer{"Resume", {"resume"}, R"({"command":"resume"})"},
        Answer{"MarksSet", {"marks", "set", "a b"}, R"({"command":"marks set","marks":["a b"]})"},
        Answer{"SharePause",
               {"share", "pause", "Photos"},
               R"({"command":"share pause","shares":["photos"]})"},
        Answer{"ShareResume",
               {"share", "resume", "photos"},
               R"({"command":"share resume","shares":["photos"]})"},
        Answer{"ShareClean",
               {"share", "clean", "photos"},
               R"({"command":"share clean","shares":["photos"]})"},
        Answer{"ShareRemove",
               {"share", "remove", "photos"},
               R"({"command":"share remove","paths":["/photos"],"shares":["photos"]})"},
        Answer{"ShareRename",
               {"share", "rename", "photos", "music"},
               R"({"command":"share rename","paths":["/photos"],"shares":["photos","music"]})"},
        Answer{"NoSpace",
               {"share", "no-space", "media", "--set"},
               R"({"command":"share no-space","shares":["media"]})"},
        Answer{"Revive",
               {"share", "no-space", "photos", "--revive"},
               R"({"command":"share no-space","shares":["photos"]})"},
        Answer{"NeedReindex",
               {"share", "need-reindex", "photos", "--set"},
               R"({"command":"share need-reindex","shares":["photos"]})"}),
    [](const auto &row) { return row.param.what; });

TEST_F(CtlTest, AChangeThatFailsAnswersThatItIsNotDone) {
    Save(kTwo);
    const Outcome halfWay = Ctl({"add", "/photos", "--all", "--json"}); // nobody listens
    EXPECT_EQ(halfWay.status, kFailed);
    EXPECT_EQ(halfWay.out, R"({"command":"add","done":false,"dry_run":false,"paths":["/photos"]})"
                           "\n");
    const Outcome notSet = Ctl({"remove", "/nix", "-j"});
    EXPECT_EQ(notSet.status, kNotFound);
    EXPECT_EQ(notSet.out, R"({"command":"remove","done":false,"dry_run":false,"paths":["/nix"]})"
                          "\n");
}

TEST_F(CtlTest, AChangeInPrettyJsonIsIndented) {
    EXPECT_EQ(Ctl({"resume", "--dry-run", "--json=pretty"}).out, "{\n"
                                                                 "  \"command\": \"resume\",\n"
                                                                 "  \"done\": false,\n"
                                                                 "  \"dry_run\": true\n"
                                                                 "}\n");
    EXPECT_EQ(Ctl({"resume", "--dry-run", "--json=off"}).out,
              "Would end the pause, if any, and tell the daemon.\n");
}

} // namespace
} // namespace VANO::TESTS
