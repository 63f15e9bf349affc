#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

struct Kind {
    const char *command;
    const char *key;
    const char *words;

    friend void PrintTo(const Kind &kind, std::ostream *out) { *out << kind.command; }
};

class ShareMarkTest : public CtlTest, public ::testing::WithParamInterface<Kind> {
  protected:
    static Outcome Run(const Words &options) {
        Words arguments = {"share", GetParam().command, "photos"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        return Ctl(arguments);
    }
};

TEST_P(ShareMarkTest, IsToldSetAndCleared) {
    const std::string yes = std::string("hare photos is marked as ") + GetParam().words + ".\n";
    const std::string no = std::string("hare photos is not marked as ") + GetParam().words + ".\n";
    EXPECT_EQ(Run({}).status, kNotFound);
    EXPECT_EQ(Run({}).out, "S" + no);

    EXPECT_EQ(Run({"--set"}).error, "fileindexctl: S" + yes);
    EXPECT_TRUE(ReadJson(kStatus)[GetParam().key]["photos"].asBool());
    EXPECT_EQ(Run({}).status, kDone);
    EXPECT_EQ(Run({}).out, "S" + yes);

    EXPECT_EQ(Run({"--clear", "--dry-run"}).out, "Would ensure that s" + no);
    EXPECT_EQ(Run({}).status, kDone);
    EXPECT_EQ(Run({"--clear"}).error, "fileindexctl: S" + no);
    EXPECT_FALSE(ReadJson(kStatus)[GetParam().key].isMember("photos"));
    EXPECT_EQ(Run({"--clear"}).status, kDone); // once more is no mistake
}

TEST_P(ShareMarkTest, IsToldAsJson) {
    const std::string key = GetParam().key;
    EXPECT_EQ(Run({"--json"}).out, R"({"name":"photos",")" + key + "\":false}\n");
    ASSERT_EQ(Run({"--set"}).status, kDone);
    EXPECT_EQ(Run({"--json"}).out, R"({"name":"photos",")" + key + "\":true}\n");
}

TEST_P(ShareMarkTest, OfAnUnknownShareIsNotSet) {
    const Outcome outcome = Ctl({"share", GetParam().command, "nix", "--set"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("No share has the name nix."));
    EXPECT_FALSE(Exists(kStatus));
}

TEST_P(ShareMarkTest, OfAShareThatIsGoneCanBeCleared) {
    PutFile(kStatus, std::string("{\"") + GetParam().key + R"(":{"gone":true}})");
    EXPECT_EQ(Ctl({"share", GetParam().command, "gone", "--clear"}).status, kDone);
    EXPECT_FALSE(ReadJson(kStatus)[GetParam().key].isMember("gone"));
}

TEST_P(ShareMarkTest, IsNotSetWhileTheStatusIsLocked) {
    const HoldLock other(kStatusLock);
    const Outcome outcome = Run({"--set"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error,
                HasSubstr("Cannot change the mark of share photos: the settings are locked"));
    EXPECT_FALSE(Exists(kStatus));
}

TEST_P(ShareMarkTest, OfABrokenStatusFileIsAFailureNotACrash) {
    PutFile(kStatus, std::string("{\"") + GetParam().key + R"(":"word"})");
    const Outcome outcome = Run({"--set"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("A settings file holds a value of the wrong type"));
}

INSTANTIATE_TEST_SUITE_P(Marks, ShareMarkTest,
                         ::testing::Values(Kind{"no-space", "no_space", "out of space"},
                                           Kind{"need-reindex", "need_reindex",
                                                "needing reindexing"}),
                         [](const auto &row) {
                             return row.param.key == std::string("no_space") ? "NoSpace"
                                                                             : "NeedReindex";
                         });

TEST_F(CtlTest, ReviveClearsTheMarkAndTellsTheDaemon) {
    StartDaemon();
    PutFile(kStatus, R"({"no_space":{"photos":true}})");
    EXPECT_EQ(Ctl({"share", "no-space", "photos", "--revive", "--dry-run"}).status, kDone);
    EXPECT_EQ(ReadText(kStatus), R"({"no_space":{"photos":true}})");
    EXPECT_EQ(Ctl({"share", "no-space", "photos", "--revive"}).status, kDone);
    EXPECT_THAT(ReadJson(kStatus)["no_space"].getMemberNames(), IsEmpty());
    EXPECT_THAT(Told(), ElementsAre(R"(command revive_share_worker {"share_name":"photos"})"));
}

TEST_F(CtlTest, ReviveWithoutADaemonSaysThatOnlyTheMarkIsCleared) {
    PutFile(kStatus, R"({"no_space":{"photos":true}})");
    const Outcome outcome = Ctl({"share", "no-space", "photos", "--revive"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("The mark is cleared, but not every part"));
    EXPECT_THAT(ReadJson(kStatus)["no_space"].getMemberNames(), IsEmpty());
}

} // namespace
} // namespace VANO::TESTS
