#include "watch/frame.h"

#include <algorithm>
#include <gmock/gmock.h>

#include "support/files.h"
#include "terminal/text.h"

namespace VANO::TESTS {
namespace {

using namespace CTL;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsSupersetOf;
using ::testing::Not;

constexpr Style kAscii{};

FolderState FolderAt(const std::string &path, const std::string &status, std::uint64_t pending) {
    FolderState folder;
    folder.path = path;
    folder.setting = Json(R"({"audio":true,"document":true,"photo":true,"video":true})");
    folder.status = status;
    folder.isValid = true;
    folder.pending = pending;
    return folder;
}

// A share with as many events as a minute ago, less those done.
void AddShare(WatchedState &state, const std::string &name, std::uint64_t pending,
              std::uint64_t done) {
    ShareState share;
    share.name = name;
    share.pending = pending;
    state.service.shares.push_back(share);
    state.progress.emplace_back();
    state.progress.back().Observe(0, pending + done);
    state.progress.back().Observe(60, pending);
}

WatchedState TwoShares() {
    WatchedState state;
    state.service.now = 1795167000;
    state.service.daemon = DaemonState::kRunning;
    state.service.resumeTime = -1;
    AddShare(state, "media", 0, 0);
    AddShare(state, "photos", 1204, 986);
    state.service.folders = {FolderAt("/media/films", "finished", 0),
                             FolderAt("/photos", "processing", 1204)};
    return state;
}

TEST(FrameTest, Looks80ColumnsWideLikeThis) {
    EXPECT_THAT(
        FrameOf(TwoShares(), {24, 80}, kAscii),
        ElementsAre("Daemon:   running", "Indexing: not paused", "", "SHARE   PENDING  PROGRESS",
                    "media         0                                        finished",
                    "photos     1204  [############----------------]  45 %  73 s left", "",
                    "PATH          STATE       TYPES                       VALID  PENDING",
                    "/media/films  finished    document,audio,video,photo  yes          0",
                    "/photos       processing  document,audio,video,photo  yes       1204"));
}

TEST(FrameTest, LeavesOutWhatANarrowTerminalHasNoRoomFor) {
    EXPECT_THAT(FrameOf(TwoShares(), {24, 65}, kAscii),
                IsSupersetOf({"photos     1204  [##########--------------]  45 %  73 s left",
                              "PATH          STATE       TYPES                       PENDING",
                              "/photos       processing  document,audio,video,photo     1204"}));
    EXPECT_THAT(FrameOf(TwoShares(), {24, 47}, kAscii),
                IsSupersetOf({"photos     1204  [##----]  45 %  73 s left",
                              "PATH          STATE       PENDING"}));
    EXPECT_THAT(FrameOf(TwoShares(), {24, 40}, kAscii),
                Contains("photos     1204  45 %  73 s left")); // no bar
}

TEST(FrameTest, CutsLongPathsAndNamesInTheMiddle) {
    WatchedState state = TwoShares();
    state.service.folders[1].path = "/photos/" + std::string(100, 'x') + "/end";
    state.service.shares[1].name = std::string(100, 'y');
    const auto lines = FrameOf(state, {24, 80}, kAscii);
    for (const std::string &line : lines) {
        EXPECT_LE(Columns(line), 80U) << line;
    }
    EXPECT_THAT(lines, Contains(HasSubstr("/end")));
    EXPECT_THAT(lines, Contains(HasSubstr("yyy...yyy")));
}

TEST(FrameTest, EscapesNames) {
    WatchedState state = TwoShares();
    state.service.folders[1].path = "/photos/\033[2J";
    state.service.shares[1].name = "a\nb";
    const auto lines = FrameOf(state, {24, 80}, kAscii);
    EXPECT_THAT(lines, Contains(HasSubstr("/photos/\\x1b[2J")));
    EXPECT_THAT(lines, Contains(HasSubstr("a\\nb")));
}

TEST(FrameTest, SaysHowManyRowsALowTerminalLeavesOut) {
    WatchedState state = TwoShares();
    for (int i = 0; i < 50; ++i) {
        AddShare(state, "s" + std::to_string(i), 0, 0);
        state.service.folders.push_back(FolderAt("/s" + std::to_string(i), "finished", 0));
    }
    const auto lines = FrameOf(state, {22, 80}, kAscii);
    EXPECT_EQ(lines.size(), 22U);
    EXPECT_THAT(lines, Contains(HasSubstr("and 45 more shares")));
    EXPECT_EQ(lines.back(), "and 45 more folders");
}

TEST(FrameTest, NeverHasMoreRowsOrColumnsThanTheTerminal) {
    WatchedState state = TwoShares();
    state.service.shares[0].isOutOfSpace = true;
    state.service.shares[0].needsReindex = true;
    state.service.folders[0].path = "/写真/夏休み/とても長い名前のフォルダ";
    for (std::size_t rows = 0; rows < 20; ++rows) {
        for (std::size_t columns = 1; columns < 100; ++columns) {
            const auto lines = FrameOf(state, {rows, columns}, kAscii);
            ASSERT_LE(lines.size(), rows);
            for (const std::string &line : lines) {
                ASSERT_LE(Columns(line), columns) << line;
            }
        }
    }
}

TEST(FrameTest, ColoursTakeNoRoom) {
    const auto plain = FrameOf(TwoShares(), {24, 60}, kAscii);
    const auto coloured = FrameOf(TwoShares(), {24, 60}, {false, true});
    ASSERT_EQ(plain.size(), coloured.size());
    EXPECT_EQ(coloured[0], "Daemon:   \033[32mrunning\033[0m");
    EXPECT_EQ(coloured[3], "\033[1m" + plain[3] + "\033[0m");
}

struct Outlook {
    const char *what;
    void (*change)(WatchedState &state);
    const char *text;
};

TEST(FrameTest, TellsWhatTheWorkOnAShareWaitsFor) {
    const Outlook rows[] = {
        {"pause", [](WatchedState &state) { state.service.resumeTime = 0; }, "  paused"},
        {"space", [](WatchedState &state) { state.service.shares[1].isOutOfSpace = true; },
         "  out of space"},
        {"daemon", [](WatchedState &state) { state.service.daemon = DaemonState::kStopped; },
         "  daemon stopped"},
        {"queue",
         [](WatchedState &state) {
             state.service.shares[1].pending.reset();
             state.service.shares[1].queueError = 13;
         },
         "cannot be read"},
        {"counting",
         [](WatchedState &state) {
             state.service.shares[1].pending.reset();
             state.service.counted = 0.5;
         },
         "  counting"},
        {"gone", [](WatchedState &state) { state.service.shares[1].pending.reset(); },
         "  unknown share"},
    };
    for (const Outlook &row : rows) {
        WatchedState state = TwoShares();
        row.change(state);
        const auto lines = FrameOf(state, {24, 80}, kAscii);
        const auto line = std::find_if(lines.begin(), lines.end(), [](const std::string &text) {
            return text.rfind("photos", 0) == 0;
        });
        ASSERT_NE(line, lines.end()) << row.what;
        EXPECT_THAT(*line, HasSubstr(row.text)) << row.what;
        EXPECT_THAT(*line, Not(HasSubstr(" left"))) << row.what;
    }
}

} // namespace
} // namespace VANO::TESTS
