#include <gmock/gmock.h>
#include <unistd.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

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

TEST_F(CtlTest, TablesFitATerminalAndAreWholeElsewhere) {
    const std::string deep = std::string(60, 'x') + "/end";
    MakeDirs("/volume1/photos/" + deep);
    MakeDirs("/volume2/" + deep + "/media");
    PutFile(kShares, R"({"photos":"/volume1/photos","media":"/volume2/)" + deep + R"(/media"})");
    Save("{\"/photos/" + deep + "\":{\"photo\":true,\"name\":\"" + std::string(60, 'y') + "\"}}");
    EXPECT_EQ(
        CtlOnTerminal("TERM=dumb LC_ALL=C", "list"),
        "PATH                            NAME                             TYPES  STATUS\r\n"
        "/photos/xxxxx...xxxxxxxxxx/end  yyyyyyyyyyyyyy...yyyyyyyyyyyyyy  photo  finished\r\n");
    EXPECT_EQ(CtlOnTerminal("TERM=dumb LC_ALL=C", "share list"),
              "SHARE   DIRECTORY                                                 FOLDERS  STATE\r\n"
              "media   /volume2/xxxxxxxxxxxxxxxxx...xxxxxxxxxxxxxxxxx/end/media  0        -\r\n"
              "photos  /volume1/photos                                           1        -\r\n");
    EXPECT_EQ(Ctl({"list"}).out,
              "/photos/" + deep + "  " + std::string(60, 'y') + "  photo  finished\n");
    EXPECT_THAT(Ctl({"share", "list"}).out, HasSubstr("media   /volume2/" + deep + "/media  0"));
}

TEST_F(CtlTest, WhatShowTellsIsNeverCut) {
    const std::string path = "/photos/" + std::string(120, 'x');
    MakeDirs("/volume1" + path);
    Save("{\"" + path + "\":{\"photo\":true}}");
    EXPECT_THAT(CtlOnTerminal("TERM=dumb", "show " + path),
                HasSubstr("full path  /volume1" + path + "\r\n"));
}

TEST_F(CtlTest, OnATerminalJIsPretty) {
    Save(kPhotos);
    EXPECT_THAT(CtlOnTerminal("TERM=xterm", "list -j"), HasSubstr("      \"video\": false\r\n"));
    EXPECT_THAT(CtlOnTerminal("TERM=xterm", "list --json"), HasSubstr("\"video\":false}]}\r\n"));
}

TEST_F(CtlTest, OnATerminalChangesSayAtOnceWhatIsWaitedFor) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(CtlOnTerminal("TERM=xterm", "resume"),
              "Telling the daemon ...\r\033[Kfileindexctl: Indexing is resumed.\r\n");
    EXPECT_EQ(CtlOnTerminal("TERM=dumb", "resume"), "fileindexctl: Indexing is resumed.\r\n");
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
              "  but left out: its path has symbolic links or the like; the real path is\r\n"
              "    /volume1/photos/2016\r\n");
    RemoveTree("/volume1/photos");
    EXPECT_THAT(
        CtlOnTerminal("TERM=xterm", "show /photos"),
        HasSubstr("fileindexctl: /photos cannot be indexed: the directory does not exist:\r\n"
                  "  /volume1/photos.\r\n"));
}

} // namespace
} // namespace VANO::TESTS
