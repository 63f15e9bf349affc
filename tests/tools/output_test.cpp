// Standard output that takes nothing.

#include <array>
#include <gmock/gmock.h>
#include <unistd.h>

#include "support/system_log.h"
#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

// Through a shell, that does to standard output what `redirection` says.
Outcome WithOutput(const std::string &redirection, const std::string &arguments) {
    return RunToEnd({"/bin/sh", "-c", "exec " FILEINDEXCTL_PATH " " + arguments + redirection});
}

class OutputTest : public CtlTest, public ::testing::WithParamInterface<const char *> {};

TEST_P(OutputTest, ThatCannotBeWrittenIsAFailure) {
    Save(kPhotos);
    std::array<int, 2> noReader{};
    ASSERT_EQ(::pipe(noReader.data()), 0);
    ASSERT_EQ(::dup2(noReader[1], 9), 9); // a number that every shell knows
    (void)::close(noReader[0]);
    (void)::close(noReader[1]);
    for (const char *redirection : {" >/dev/full", " >&-", " >&9"}) {
        const Outcome outcome = WithOutput(redirection, GetParam());
        EXPECT_EQ(outcome.status, kFailed) << redirection;
        EXPECT_EQ(outcome.error, "fileindexctl: Cannot write the output.\n") << redirection;
    }
    (void)::close(9);
    EXPECT_EQ(ReadText(kFolders), kPhotos);
}

INSTANTIATE_TEST_SUITE_P(Commands, OutputTest,
                         ::testing::Values("--help", "--version", "list", "add --help",
                                           "show /photos --json", "share list",
                                           "add /media --all --dry-run", "query /photos"));

TEST_F(CtlTest, NothingTakesThePlaceOfAClosedStandardOutput) {
    (void)SystemLog::Get(); // a connection to it would, and then swallow the answer
    Save(kPhotos);
    PutFile(kShares, "[]");
    EXPECT_EQ(WithOutput(" >&-", "list").status, kFailed);
    EXPECT_THAT(SystemLog::Get().Lines(), Not(IsEmpty()));
}

TEST_F(CtlTest, ACommandThatPrintsNothingNeedsNoStandardStreams) {
    StartDaemon();
    EXPECT_EQ(WithOutput(" <&- >&- 2>&-", "add /photos --photo").status, kDone);
    EXPECT_TRUE(ReadJson(kFolders)["/photos"]["photo"].asBool());
}

} // namespace
} // namespace VANO::TESTS
