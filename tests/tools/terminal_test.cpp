#include <gmock/gmock.h>
#include <unistd.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

TEST_F(CtlTest, TablesOnATerminalHaveHeadings) {
    Save(kPhotos);
    const std::string rows = "/photos  Photos  photo  finished\r\n";
    EXPECT_EQ(CtlOnTerminal("TERM=xterm", "list"),
              "\033[1mPATH     NAME    TYPES  STATUS\033[0m\r\n" + rows);
    EXPECT_EQ(CtlOnTerminal("TERM=dumb", "list"), "PATH     NAME    TYPES  STATUS\r\n" + rows);
    EXPECT_EQ(CtlOnTerminal("TERM=xterm NO_COLOR=1", "list"),
              "PATH     NAME    TYPES  STATUS\r\n" + rows);
    EXPECT_EQ(CtlOnTerminal("TERM=xterm NO_COLOR=", "list"), // empty is as if it were not there
              CtlOnTerminal("TERM=xterm", "list"));
}

TEST_F(CtlTest, OnATerminalJIsPretty) {
    Save(kPhotos);
    EXPECT_THAT(CtlOnTerminal("TERM=xterm", "list -j"), HasSubstr("  \"total\": 1\r\n"));
    EXPECT_THAT(CtlOnTerminal("TERM=xterm", "list --json"), HasSubstr("\"total\":1}\r\n"));
}

TEST_F(CtlTest, OnATerminalChangesSayAtOnceWhatIsWaitedFor) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(CtlOnTerminal("TERM=xterm", "resume"),
              "Telling the daemon ...\r\033[Kfileindexctl: Indexing goes on.\r\n");
    EXPECT_EQ(CtlOnTerminal("TERM=dumb", "resume"), "fileindexctl: Indexing goes on.\r\n");
}

TEST_F(CtlTest, OffATerminalNoEscapeCodeIsWritten) {
    StartDaemon();
    Save("{\"/photos\":{\"name\":\"\\u001b[31m\",\"photo\":true}}");
    for (const Words &arguments :
         {Words{"list"}, Words{"show", "/photos"}, Words{"share", "list"}, Words{"--help"},
          Words{"query", "--why", "/photos"}, Words{"set", "/photos", "--name", "\x1b]0;x\a"}}) {
        const Outcome outcome = Ctl(arguments);
        EXPECT_EQ(outcome.status, kDone);
        EXPECT_THAT(outcome.out + outcome.error, Not(HasSubstr("\x1b")));
    }
}

// DEL, two C1 controls, a line separator and a change of direction are UTF-8 and come as escapes;
// letters do not, and the last byte, which is none, stays.
TEST_F(CtlTest, JsonCannotDriveTheTerminalAndGivesNamesBack) {
    const std::string name = "\x7f\xc2\x80\xc2\x9b\xe2\x80\xa8\xe2\x80\xae\xc3\xa4\xff";
    Save("{\"/photos\":{\"photo\":true,\"name\":\"" + name + "\"}}");
    for (const char *mode : {"--json=short", "--json=pretty"}) {
        const std::string out = Ctl({"list", mode}).out;
        EXPECT_THAT(out, HasSubstr(R"("\u007f\u0080\u009b\u2028\u202e)"
                                   "\xc3\xa4\xff\""));
        EXPECT_EQ(Json(out)["folder"][0]["name"].asString(), name);
    }
}

TEST_F(CtlTest, OnATerminalMessagesBreakBetweenWords) {
    Save(kPhotos);
    ASSERT_EQ(::symlink("2016", "/volume1/photos/link"), 0);
    EXPECT_EQ(CtlOnTerminal("TERM=xterm", "query --why /photos/link"),
              "indexed  /photos/link\r\n"
              "  by /photos, for photo\r\n"
              "  but left out: its path has symbolic links or other detours; it leads to\r\n"
              "    /volume1/photos/2016\r\n");
    RemoveTree("/volume1/photos");
    EXPECT_THAT(CtlOnTerminal("TERM=xterm", "show /photos"),
                HasSubstr("fileindexctl: /photos cannot be indexed: there is no such directory:\r\n"
                          "  /volume1/photos.\r\n"));
}

} // namespace
} // namespace VANO::TESTS
