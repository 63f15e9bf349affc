#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

class HelpTest : public CtlTest, public ::testing::WithParamInterface<const char *> {};

TEST_P(HelpTest, ShowsUsageAndExamples) {
    Words words = LinesOf(GetParam());
    words.emplace_back("--help");
    const Outcome outcome = Ctl(words);
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.out, HasSubstr("Usage: fileindexctl"));
    EXPECT_THAT(outcome.out, HasSubstr("Examples:\n  fileindexctl "));
    EXPECT_EQ(outcome.error, "");
    for (const std::string &line : LinesOf(outcome.out)) {
        EXPECT_LE(line.size(), 80U) << line;
    }
}

INSTANTIATE_TEST_SUITE_P(Commands, HelpTest,
                         ::testing::Values("", "add", "list", "show", "set", "remove", "reindex",
                                           "pause", "resume", "query", "share", "share\nlist",
                                           "status", "watch", "share\nrename", "share\nremove",
                                           "share\nclean", "share\npause", "share\nresume",
                                           "share\nno-space", "share\nneed-reindex", "marks",
                                           "marks\nlist", "marks\nset", "migrate", "doctor"));

class MistakeTest : public CtlTest, public ::testing::WithParamInterface<Mistake> {};

TEST_P(MistakeTest, IsNamedAndNothingIsDone) {
    Save(kPhotos);
    const Outcome outcome = Ctl(GetParam().arguments);
    EXPECT_EQ(outcome.status, kUsage);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.error, AllOf(StartsWith("fileindexctl: "), HasSubstr(GetParam().message),
                                     HasSubstr("--help")));
    EXPECT_EQ(ReadText(kFolders), kPhotos);
    EXPECT_FALSE(Exists(kStatus));
    EXPECT_FALSE(Exists(kPhotoQueue));
}

INSTANTIATE_TEST_SUITE_P(
    Calls, MistakeTest,
    ::testing::Values(
        Mistake{"NoCommand", {}, "subcommand is required"},
        Mistake{"UnknownCommand", {"frobnicate"}, "There is no command 'frobnicate'"},
        Mistake{
            "HelpOnUnknownCommand", {"frobnicate", "--help"}, "There is no command 'frobnicate'"},
        Mistake{"HelpOnUnknownShareCommand", {"share", "nap", "-h"}, "There is no command 'nap'"},
        Mistake{"AbbreviatedCommand", {"rem", "/photos"}, "Did you mean 'remove'?"},
        Mistake{"UnknownOption", {"list", "--nonsense"}, "no option '--nonsense'"},
        Mistake{"AddNothing", {"add", "--all"}, "PATH is required"},
        Mistake{"AddNoTypes", {"add", "/photos"}, "Choose what to index"},
        Mistake{"AddRelativePath", {"add", "photos", "--all"}, "'photos' is not a share path"},
        Mistake{"AddEmptyPath", {"add", "", "--all"}, "'' is not a share path"},
        Mistake{"AddRoot", {"add", "/", "--all"}, "'/' is not a share path"},
        Mistake{"AddFinalSlash", {"add", "/photos/", "--all"}, "trailing slashes"},
        Mistake{"AddDots", {"add", "/photos/../x", "--all"}, "is not plain"},
        Mistake{"AddOneNameForTwo", {"add", "/a", "/b", "--all", "--name", "N"}, "single folder"},
        Mistake{"ShowNothing", {"show"}, "PATH is required"},
        Mistake{"ShowTwo", {"show", "/a", "/b"}, "/b"},
        Mistake{"RemoveNothing", {"remove"}, "PATH is required"},
        Mistake{"RemoveRelativePath", {"remove", "photos"}, "not a share path"},
        Mistake{"ReindexNothing", {"reindex"}, "PATH... or --all"},
        Mistake{"ReindexTooMuch", {"reindex", "/photos", "--all"}, "excludes"},
        Mistake{"PauseNegative", {"pause", "--for", "-1h"}, "not '-1h'"},
        Mistake{"PauseWord", {"pause", "--for", "long"}, "not 'long'"},
        Mistake{"PauseWithoutUnit", {"pause", "--for", "8"}, "such as 8h"},
        Mistake{"PauseEmpty", {"pause", "--for", ""}, "--for needs a time"},
        Mistake{"PauseNoTime", {"pause", "--for", "0h"}, "end immediately"},
        Mistake{"PauseBeyond2038", {"pause", "--for", "9999d"}, "after January 2038"},
        Mistake{"PauseHugeNumber", {"pause", "--for", "99999999999999999999h"}, "--for takes a"},
        Mistake{"PauseUntilWord", {"pause", "--until", "noon"}, "not 'noon'"},
        Mistake{"PauseUntilNoHour", {"pause", "--until", "25:00"}, "not '25:00'"},
        Mistake{"PauseUntilNoDay", {"pause", "--until", "2030-02-30 10:00"}, "not '2030-02-30"},
        Mistake{"PauseUntilPast", {"pause", "--until", "2020-01-01 10:00"}, "end immediately"},
        Mistake{"PauseUntilTheEpoch", {"pause", "--until", "1970-01-01 00:00"}, "end immediately"},
        Mistake{"PauseTwice", {"pause", "--for", "1h", "--until", "07:30"}, "excludes"},
        Mistake{"PauseSurplus", {"pause", "8"}, "8"},
        Mistake{"ResumeSurplus", {"resume", "now"}, "now"},
        Mistake{"QueryNothing", {"query"}, "PATH is required"},
        Mistake{"QueryTwoKinds", {"query", "--share", "--full-path", "/a"}, "excludes"},
        Mistake{"QueryRelativePath", {"query", "a"}, "not a share path"},
        Mistake{"QueryRelativeFullPath", {"query", "--full-path", "a"}, "does not begin with /"},
        Mistake{"ShareNoCommand", {"share"}, "subcommand is required"},
        Mistake{"ShareRenameOneName", {"share", "rename", "photos"}, "NEW is required"},
        Mistake{"ShareListSurplus", {"share", "list", "photos"}, "Unexpected argument 'photos'"},
        Mistake{"ShareMistypedCommand", {"share", "pasue", "photos"}, "Did you mean 'pause'?"},
        Mistake{
            "ShareMarkBothWays", {"share", "no-space", "photos", "--set", "--clear"}, "excludes"},
        Mistake{"ShareEmptyName", {"share", "remove", ""}, "'' is not a share name"},
        Mistake{"SetNothing", {"set", "/photos"}, "Choose what to change"},
        Mistake{"SetNoPath", {"set", "--photo=no"}, "PATH is required"},
        Mistake{"SetMaybe", {"set", "/photos", "--photo=maybe"}, "yes or no, not 'maybe'"},
        Mistake{"SetOneNameForTwo", {"set", "/a", "/b", "--name", "N"}, "single folder"},
        Mistake{"ListWithAnArgument", {"list", "/photos"}, "Unexpected argument '/photos'"},
        Mistake{"ListTwoForms", {"list", "--null", "--json"}, "excludes"},
        Mistake{"JsonUnknownForm", {"list", "--json=xml"}, "short, pretty or off, not 'xml'"},
        Mistake{"JsonTwice", {"list", "--json", "-j"}, "excludes"},
        Mistake{"MarksReservedName", {"marks", "set", "no_space"}, "cannot be a mark"},
        Mistake{"MarksEmptyName", {"marks", "set", ""}, "cannot be a mark"},
        Mistake{"MistypedCommand", {"reidnex", "/photos"}, "Did you mean 'reindex'?"},
        Mistake{"MistypedOption", {"add", "--vdieo", "/photos"}, "Did you mean '--video'?"},
        Mistake{"EscapedArgument", {"list", "\x1b[31m"}, "'\\x1b[31m'"},
        Mistake{"EscapedPath", {"show", "a\n\xff"}, "'a\\n\\xff'"},
        Mistake{"SharePath", {"share", "pause", "/photos"}, "not a share name"}),
    [](const auto &row) { return row.param.what; });

TEST_F(CtlTest, NothingNearIsNotSuggested) {
    EXPECT_THAT(Ctl({"frobnicate"}).error, Not(HasSubstr("Did you mean")));
    EXPECT_THAT(Ctl({"list", "--nonsense"}).error, Not(HasSubstr("Did you mean")));
}

TEST_F(CtlTest, VersionIsShown) {
    const Outcome outcome = Ctl({"--version"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.out, ::testing::MatchesRegex("fileindexctl [0-9]+\\.[0-9]+\\.[0-9]+\n"));
}

} // namespace
} // namespace VANO::TESTS
