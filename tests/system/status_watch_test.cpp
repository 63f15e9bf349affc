// `fileindexctl status` and `watch`, on a terminal and off it.

#include <algorithm>
#include <csignal>
#include <ctime>
#include <fcntl.h>
#include <filesystem>
#include <gmock/gmock.h>
#include <memory>
#include <regex>
#include <sys/stat.h>
#include <unistd.h>

#include "support/files.h"
#include "system/child.h"
#include "system/pty_child.h"
#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

const std::string kQueue = kPhotoQueue;
const std::string kTaken = kQueue + ".tmp";

constexpr int kPaused = 3;
constexpr int kUnknown = 4;

const Words kColourTerminal{"TERM=xterm-256color", "LC_ALL=C.UTF-8"};
const Words kPlainTerminal{"TERM=vt100", "LC_ALL=C", "NO_COLOR=1"};

constexpr char kEnter[] = "\033[?1049h\033[?25l";
constexpr char kLeave[] = "\033[?25h\033[?1049l";
constexpr char kCtrlC[] = "\x03";
constexpr char kCtrlZ[] = "\x1a";

std::string Events(int count, const std::string &path = "/volume1/photos/a") {
    std::string text;
    for (int i = 0; i < count; ++i) {
        text += R"({"data":null,"event":131072,"path":")" + path + "\"}\n";
    }
    return text;
}

void Append(const std::string &path, const std::string &text) {
    const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
    EXPECT_EQ(::write(fd, text.data(), text.size()), static_cast<ssize_t>(text.size()));
    ::close(fd);
}

std::string WithoutEscapes(const std::string &text) {
    static const std::regex kEscapes("\033\\[[?0-9;]*[A-Za-z]");
    return std::regex_replace(text, kEscapes, "");
}

std::string WithoutStamp(const std::string &line) {
    static const std::regex kStamp("^[-0-9]{10}T[:0-9]{8}[+]0000  ");
    return std::regex_replace(line, kStamp, "@ ");
}

class StatusWatchTest : public CtlTest {
  protected:
    void SetUp() override {
        CtlTest::SetUp();
        Save(kTwo);
    }

    void StartDaemonAtWork() { StartDaemon({"--queue", kQueue, "--interval", "20"}); }
};

// --- status -------------------------------------------------------------------------------------

TEST_F(StatusWatchTest, StatusShowsTheServiceAndItsFolders) {
    StartDaemon();
    PutFile(kQueue, Events(3));
    const Outcome outcome = Ctl({"status"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "");
    EXPECT_EQ(outcome.out, "Daemon:   running\n"
                           "Indexing: not paused\n"
                           "\n"
                           "PATH          STATE       TYPES           VALID  PENDING\n"
                           "/media/films  finished    document,video  yes          0\n"
                           "/photos       processing  photo           yes          3\n");
}

TEST_F(StatusWatchTest, StatusOnATerminalHasHeadings) {
    PtyChild child({FILEINDEXCTL_PATH, "status"}, kPlainTerminal, 24, 80);
    EXPECT_EQ(child.Wait(), kPaused);
    EXPECT_EQ(child.Output(), "Daemon:   stopped\r\n"
                              "Indexing: not paused\r\n"
                              "\r\n"
                              "PATH          STATE     TYPES           VALID  PENDING\r\n"
                              "/media/films  finished  document,video  yes          0\r\n"
                              "/photos       finished  photo           yes          0\r\n");
}

TEST_F(StatusWatchTest, StatusFitsATerminalAndIsWholeElsewhere) {
    const std::string path = "/photos/" + std::string(90, 'x') + "/end";
    MakeDirs("/volume1" + path);
    PutFile(kFolders, "{\"" + path + "\":{\"photo\":true}}");
    PtyChild child({FILEINDEXCTL_PATH, "status"}, kPlainTerminal, 24, 80);
    EXPECT_EQ(child.Wait(), kPaused);
    EXPECT_THAT(child.Output(), HasSubstr("\r\n/photos/xxxxxxxxxxxxxx...xxxxxxxxxxxxxxxxxx/end"
                                          "  finished  photo  yes          0\r\n"));
    PtyChild narrow({FILEINDEXCTL_PATH, "status"}, kPlainTerminal, 24, 40);
    EXPECT_EQ(narrow.Wait(), kPaused);
    EXPECT_THAT(narrow.Output(), HasSubstr("\r\n/photos/x...xxxxx/end  finished        0\r\n"));
    EXPECT_THAT(Ctl({"status"}).out,
                HasSubstr("\n" + path + "  finished  photo  yes          0\n"));
}

TEST_F(StatusWatchTest, StatusIsColouredOnATerminalThatCanShowIt) {
    PtyChild child({FILEINDEXCTL_PATH, "status"}, kColourTerminal, 24, 80);
    EXPECT_EQ(child.Wait(), kPaused);
    EXPECT_THAT(child.Output(), HasSubstr("Daemon:   \033[31mstopped\033[0m\r\n"));
}

TEST_F(StatusWatchTest, StatusOfAStoppedDaemonIsThree) {
    EXPECT_EQ(Ctl({"status"}).status, kPaused);
    StartDaemon();
    daemon_->Signal(SIGKILL); // its socket stays behind
    (void)daemon_->Wait();
    ASSERT_TRUE(Exists(kSocket));
    const Outcome outcome = Ctl({"status"});
    EXPECT_EQ(outcome.status, kPaused);
    EXPECT_THAT(outcome.out, StartsWith("Daemon:   stopped\n"));
}

TEST_F(StatusWatchTest, StatusDoesNotBotherTheDaemon) {
    StartDaemon();
    for (int i = 0; i < 3; ++i) {
        EXPECT_EQ(Ctl({"status"}).status, kDone);
    }
    EXPECT_THAT(Told(), IsEmpty()); // neither a command nor a refused one
}

TEST_F(StatusWatchTest, StatusDoesNotWaitForADaemonThatListensWithoutAnswering) {
    StartDaemon();
    daemon_->Signal(SIGSTOP);
    EXPECT_EQ(Ctl({"status"}).status, kDone);
    daemon_->Signal(SIGCONT);
}

TEST_F(StatusWatchTest, StatusOfAPauseIsThreeAndTellsItsEnd) {
    StartDaemon();
    PutFile(kQueue, Events(1));
    PutFile(kStatus, R"({"resume_time":0})");
    Outcome outcome = Ctl({"status"});
    EXPECT_EQ(outcome.status, kPaused);
    EXPECT_THAT(outcome.out, AllOf(HasSubstr("Indexing: paused until resumed\n"),
                                   HasSubstr("/photos       paused ")));

    const std::time_t end = std::time(nullptr) + 6 * 3600 + 60;
    PutFile(kStatus, R"({"resume_time":)" + std::to_string(end) + "}");
    outcome = Ctl({"status"});
    EXPECT_EQ(outcome.status, kPaused);
    char text[32] = "";
    EXPECT_GT(std::strftime(text, sizeof(text), "%a %H:%M", std::gmtime(&end)), 0U);
    EXPECT_THAT(outcome.out,
                HasSubstr("Indexing: paused until " + std::string(text) + ", 6 h left\n"));

    PutFile(kStatus, R"({"resume_time":1000000000})"); // long past
    EXPECT_EQ(Ctl({"status"}).status, kDone);
}

TEST_F(StatusWatchTest, StatusOfAPauseThatCannotBeReadIsFour) {
    StartDaemon();
    PutFile(kStatus, "{");
    const Outcome outcome = Ctl({"status"});
    EXPECT_EQ(outcome.status, kUnknown);
    EXPECT_THAT(outcome.out, HasSubstr("Indexing: unknown, the status file cannot be read\n"));
}

TEST_F(StatusWatchTest, StatusOfSettingsThatCannotBeReadIsFour) {
    PutFile(kFolders, "{");
    const Outcome outcome = Ctl({"status"});
    EXPECT_EQ(outcome.status, kUnknown);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.error, StartsWith("fileindexctl: Cannot read the settings: "));
}

TEST_F(StatusWatchTest, StatusOfPathsShowsTheFoldersAroundThem) {
    for (const char *path : {"/photos", "/photos/2016/x", "/volume1/photos", "/volume1/photos/a"}) {
        EXPECT_EQ(Ctl({"status", path}).out, "Daemon:   stopped\n"
                                             "Indexing: not paused\n"
                                             "\n"
                                             "PATH     STATE     TYPES  VALID  PENDING\n"
                                             "/photos  finished  photo  yes          0\n")
            << path;
    }
    EXPECT_THAT(Ctl({"status", "/media"}).out, HasSubstr("/media/films"));
    EXPECT_THAT(Ctl({"status", "/media", "/photos"}).out,
                AllOf(HasSubstr("/media/films"), HasSubstr("/photos")));
}

TEST_F(StatusWatchTest, StatusOfAPathThatIsNotIndexedIsFour) {
    const Outcome outcome = Ctl({"status", "/media/film"});
    EXPECT_EQ(outcome.status, kUnknown);
    EXPECT_EQ(outcome.error, "fileindexctl: Nothing is indexed at /media/film.\n");
}

TEST_F(StatusWatchTest, StatusWithoutFoldersSaysSo) {
    RemoveTree(kFolders);
    StartDaemon();
    const Outcome outcome = Ctl({"status"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "Daemon:   running\nIndexing: not paused\n");
    EXPECT_EQ(outcome.error, "fileindexctl: No folder is indexed.\n");
}

TEST_F(StatusWatchTest, StatusNotesWhatKeepsTheIndexingBack) {
    RemoveTree("/volume2/media/films");
    PutFile(kStatus, R"({"no_space":{"photos":true},"need_reindex":{"media":true}})");
    ASSERT_EQ(::mkfifo("/volume2/media/@eaDir", 0600), 0);
    EXPECT_EQ(Ctl({"status"}).out,
              "Daemon:   stopped\n"
              "Indexing: not paused\n"
              "Note:     share media needs reindexing\n"
              "Note:     share media: its queue cannot be read: Not a "
              "directory\n"
              "Note:     share photos is out of space\n"
              "\n"
              "PATH          STATE              TYPES           VALID  PENDING\n"
              "/media/films  cannot be indexed  document,video  no           ?\n"
              "/photos       out of space       photo           yes          0\n");
}

// A share that is gone is told from one without work.
TEST_F(StatusWatchTest, StatusOfAShareThatIsGoneCountsNothing) {
    PutFile(kShares, R"({"photos":"/volume1/photos"})");
    EXPECT_THAT(Ctl({"status", "/media"}).out,
                HasSubstr("/media/films  cannot be indexed  document,video  no           ?\n"));
}

TEST_F(StatusWatchTest, StatusCountsBothQueueFilesForEachFolder) {
    PutFile(kFolders, R"({"/photos":{"photo":true},"/photos/2016":{"photo":true}})");
    PutFile(kTaken, Events(2, "/volume1/photos/2016/x"));
    PutFile(kQueue, Events(3) + Events(4, "/volume1/photos/20161") + "no event\n");
    EXPECT_THAT(Ctl({"status"}).out,
                HasSubstr("/photos       processing  photo  yes          9\n"
                          "/photos/2016  processing  photo  yes          2\n"));
}

// What `list` gets from the library one folder at a time.
TEST_F(StatusWatchTest, StatusAgreesWithTheLibrary) {
    PutFile(kFolders, R"({"/photos":{"photo":true},"/photos/2016":{"photo":true},)"
                      R"("/photos/2017":{"photo":true},"/media/films":{"video":true}})");
    MakeDirs("/volume1/photos/2017");
    PutFile(kQueue,
            R"({"event":256,"path":"/volume1/photos/x","path_old":"/volume1/photos/2017/x"})"
            "\n" +
                Events(1));
    for (const char *status : {"{}", R"({"resume_time":0})", R"({"no_space":{"photos":true}})"}) {
        PutFile(kStatus, status);
        const Json::Value listed = Json(Ctl({"list", "--json"}).out);
        const Json::Value shown = Json(Ctl({"status", "--json"}).out);
        ASSERT_EQ(shown["folder"].size(), 4U);
        for (Json::ArrayIndex i = 0; i < 4; ++i) {
            Json::Value folder = shown["folder"][i];
            folder["additional"].removeMember("pending");
            EXPECT_EQ(folder, listed["folder"][i]) << status;
        }
    }
}

TEST_F(StatusWatchTest, StatusAsJsonIsOneCompactObject) {
    StartDaemon();
    PutFile(kStatus, R"({"no_space":{"photos":true}})");
    PutFile(kQueue, Events(2));
    EXPECT_EQ(Ctl({"status", "/photos", "--json"}).out,
              R"({"daemon":"running","folder":[{"additional":{"is_valid":true,"pending":2,)"
              R"("status":"err_no_space"},"audio":false,"document":false,"name":"Photos",)"
              R"("path":"/photos","photo":true,"video":false}],"paused":false,"resume_time":-1,)"
              R"("share":[{"name":"photos","need_reindex":false,"no_space":true,"pending":2}]})"
              "\n");
}

TEST_F(StatusWatchTest, StatusAsJsonHasNullForWhatCannotBeTold) {
    PutFile(kStatus, "{");
    MakeDirs(kQueue);
    const Json::Value answer = Json(Ctl({"status", "/photos", "-j"}).out);
    EXPECT_TRUE(answer["paused"].isNull());
    EXPECT_TRUE(answer["resume_time"].isNull());
    EXPECT_TRUE(answer["share"][0]["pending"].isNull());
    EXPECT_TRUE(answer["folder"][0]["additional"]["pending"].isNull());
    EXPECT_EQ(answer["daemon"], "stopped");
}

TEST_F(StatusWatchTest, StatusShowsNamesThatCannotPlayTricks) {
    const std::string name = "/photos/\xff\033[31m";
    MakeDirs("/volume1" + name);
    PutFile(kFolders, "{\"/photos/\xff\\u001b[31m\":{\"photo\":true}}");
    EXPECT_THAT(Ctl({"status"}).out, HasSubstr("\n/photos/\\xff\\x1b[31m  finished"));
    EXPECT_EQ(Json(Ctl({"status", "--json"}).out)["folder"][0]["path"], name);
}

TEST_F(StatusWatchTest, StatusAndWatchMakeNothingInTheShares) {
    EXPECT_EQ(Ctl({"status"}).status, kPaused);
    EXPECT_EQ(Ctl({"watch", "--count", "1"}).status, kDone);
    EXPECT_THAT(NamesIn("/volume1/photos"), ElementsAre("2016"));
    EXPECT_THAT(NamesIn("/volume2/media"), ElementsAre("films"));
}

// --- mistakes in the call -----------------------------------------------------------------------

TEST_F(StatusWatchTest, MistakesAreNamed) {
    const std::pair<Words, const char *> rows[] = {
        {{"status", "photos"}, "'photos' does not begin with /"},
        {{"status", "--nonsense"}, "--nonsense"},
        {{"status", "--json=long"}, "--json"},
        {{"watch", "photos"}, "'photos' does not begin with /"},
        {{"watch", "--count", "0"}, "--count"},
        {{"watch", "--count", "-1"}, "--count"},
        {{"watch", "--count", "many"}, "--count"},
        {{"watch", "--interval", "0"}, "--interval takes from 0.1 to 3600"},
        {{"watch", "--interval", "nan"}, "--interval takes from 0.1 to 3600"},
        {{"watch", "--interval", "soon"}, "--interval"},
    };
    for (const auto &[arguments, message] : rows) {
        const Outcome outcome = Ctl(arguments);
        EXPECT_EQ(outcome.status, kUsage) << message;
        EXPECT_EQ(outcome.out, "") << message;
        EXPECT_THAT(outcome.error,
                    AllOf(StartsWith("fileindexctl: "), HasSubstr(message), HasSubstr("--help")));
    }
}

// --- watch, not on a terminal -------------------------------------------------------------------

class WatchedLines {
  public:
    explicit WatchedLines(Words arguments) {
        RemoveTree(kOut);
        arguments.insert(arguments.begin(), {FILEINDEXCTL_PATH, "watch", "--interval", "0.1"});
        child = std::make_unique<Child>(arguments, kOut, "/tmp/watch.err");
    }

    static Words Lines() {
        Words lines;
        for (const std::string &line : LinesOf(ReadIfThere(kOut).value_or(""))) {
            lines.push_back(WithoutStamp(line));
        }
        return lines;
    }

    static bool HasLine(const std::string &line) {
        const Words lines = Lines();
        return std::find(lines.begin(), lines.end(), line) != lines.end();
    }

    std::unique_ptr<Child> child;

  private:
    static constexpr char kOut[] = "/tmp/watch.out";
};

TEST_F(StatusWatchTest, WatchEndsAfterSoManyLooks) {
    PutFile(kQueue, Events(3));
    const Outcome outcome = Ctl({"watch", "--count", "3", "--interval", "0.1"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "");
    Words lines;
    for (const std::string &line : LinesOf(outcome.out)) {
        lines.push_back(WithoutStamp(line));
    }
    EXPECT_THAT(lines, ElementsAre("@ daemon  stopped", "@ indexing  not paused",
                                   "@ share media  0 pending, finished",
                                   "@ share photos  3 pending, 0 %, daemon stopped"));
}

TEST_F(StatusWatchTest, WatchOffATerminalWritesALineForEachChange) {
    StartDaemon();
    const WatchedLines watched({});
    ASSERT_TRUE(Eventually([] { return WatchedLines::Lines().size() == 4; }));
    PutFile(kQueue, Events(4));
    ASSERT_TRUE(Eventually([] { return WatchedLines::HasLine("@ share photos  4 pending, 0 %"); }));
    ASSERT_EQ(::rename(kQueue.c_str(), kTaken.c_str()), 0);
    Append(kQueue, Events(1));
    ASSERT_TRUE(Eventually([] { return WatchedLines::HasLine("@ share photos  5 pending, 0 %"); }));
    RemoveTree(kTaken);
    ASSERT_TRUE(
        Eventually([] { return WatchedLines::HasLine("@ share photos  1 pending, 80 %"); }));
    RemoveTree(kQueue);
    ASSERT_TRUE(Eventually([] {
        return WatchedLines::Lines().back() == "@ share photos  0 pending, finished" &&
               WatchedLines::Lines().size() > 4;
    }));
    watched.child->Signal(SIGTERM);
    EXPECT_EQ(watched.child->Wait(), kDone);
    EXPECT_THAT(ReadText("/tmp/watch.out"), Not(HasSubstr("\033")));
}

TEST_F(StatusWatchTest, WatchFollowsTheDaemonAtWork) {
    PutFile(kQueue, Events(1000));
    const WatchedLines watched({});
    ASSERT_TRUE(Eventually(
        [] { return WatchedLines::HasLine("@ share photos  1000 pending, 0 %, daemon stopped"); }));
    StartDaemonAtWork();
    ASSERT_TRUE(
        Eventually([] { return WatchedLines::HasLine("@ share photos  0 pending, finished"); }));
    EXPECT_TRUE(Eventually([] { return WatchedLines::HasLine("@ daemon  running"); }));
    Append(kQueue, Events(10));
    EXPECT_TRUE(Eventually([] { return LinesOf(ReadText(kPeerOut)).size() == 1010; }));
    watched.child->Signal(SIGINT);
    EXPECT_EQ(watched.child->Wait(), kDone);
    EXPECT_THAT(ReadText(kPeerOut), Not(HasSubstr("refused")));
}

TEST_F(StatusWatchTest, WatchNoticesChangedSettings) {
    const WatchedLines watched({});
    ASSERT_TRUE(Eventually([] { return WatchedLines::Lines().size() == 4; }));
    PutFile(kStatus, R"({"resume_time":0})");
    EXPECT_TRUE(
        Eventually([] { return WatchedLines::HasLine("@ indexing  paused until resumed"); }));
    MakeDirs("/volume1/new");
    PutFile(kShares,
            R"({"photos":"/volume1/photos","media":"/volume2/media","new":"/volume1/new"})");
    PutFile(kFolders, R"({"/new":{"photo":true}})");
    EXPECT_TRUE(
        Eventually([] { return WatchedLines::HasLine("@ share new  0 pending, finished"); }));
    RemoveTree("/volume1/new");
}

TEST_F(StatusWatchTest, WatchAsJsonIsOneObjectALine) {
    StartDaemon();
    PutFile(kQueue, Events(2));
    const Outcome outcome =
        Ctl({"watch", "/photos", "--json=pretty", "--count", "2", "--interval", "0.1"});
    EXPECT_EQ(outcome.status, kDone);
    const Words lines = LinesOf(outcome.out);
    ASSERT_THAT(lines, SizeIs(2));
    for (const std::string &line : lines) {
        Json::Value object = Json(line);
        EXPECT_NEAR(static_cast<double>(object["time"].asInt64()),
                    static_cast<double>(std::time(nullptr)), 60);
        object.removeMember("time");
        EXPECT_EQ(object,
                  Json(R"({"daemon":"running","folder":[{"additional":{"is_valid":true,)"
                       R"("pending":2,"status":"processing"},"audio":false,"document":false,)"
                       R"("name":"Photos","path":"/photos","photo":true,"video":false}],)"
                       R"("paused":false,"resume_time":-1,"share":[{"done":0.0,"name":"photos",)"
                       R"("need_reindex":false,"no_space":false,"pending":2,)"
                       R"("seconds_left":null}]})"));
    }
}

TEST_F(StatusWatchTest, WatchOfAPathThatIsNotIndexedFindsNothing) {
    const Outcome outcome = Ctl({"watch", "/media/film"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Nothing is indexed at /media/film.\n");
}

TEST_F(StatusWatchTest, WatchOfSettingsThatCannotBeReadFails) {
    PutFile(kFolders, "[]");
    const Outcome outcome = Ctl({"watch"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot read the settings"));
}

TEST_F(StatusWatchTest, WatchFailsWhereNothingCanBeWritten) {
    Child child({FILEINDEXCTL_PATH, "watch"}, "/dev/full", "/tmp/watch.err");
    EXPECT_EQ(child.Wait(), kFailed);
}

// --- watch, on a terminal -----------------------------------------------------------------------

// The last picture but one, which has been drawn whole.
Words Picture(PtyChild &child) {
    const std::string &output = child.Output();
    const std::size_t end = output.rfind("\033[H");
    if (end == std::string::npos || end == 0) {
        return {};
    }
    const std::size_t start = output.rfind("\033[H", end - 1);
    if (start == std::string::npos) {
        return {};
    }
    Words lines = LinesOf(WithoutEscapes(output.substr(start, end - start)));
    for (std::string &line : lines) {
        line.erase(std::remove(line.begin(), line.end(), '\r'), line.end());
    }
    return lines;
}

bool Shows(PtyChild &child, const std::string &text) {
    const Words lines = Picture(child);
    return std::any_of(lines.begin(), lines.end(), [&](const std::string &line) {
        return line.find(text) != std::string::npos;
    });
}

std::unique_ptr<PtyChild> WatchOnTerminal(const Words &settings = kPlainTerminal,
                                          unsigned short rows = 24, unsigned short columns = 80,
                                          const Words &arguments = {"--interval", "0.1"}) {
    Words command{FILEINDEXCTL_PATH, "watch"};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return std::make_unique<PtyChild>(command, settings, rows, columns);
}

TEST_F(StatusWatchTest, WatchDrawsInPlace) {
    StartDaemon();
    PutFile(kQueue, Events(3));
    const auto child = WatchOnTerminal();
    ASSERT_TRUE(Eventually([&] { return Shows(*child, "Press q or Ctrl-C to end."); }));
    EXPECT_THAT(Picture(*child),
                ElementsAre("Daemon:   running", "Indexing: not paused", "",
                            "SHARE   PENDING  PROGRESS",
                            "media         0                                        finished",
                            "photos        3  [----------------------------]   0 %", "",
                            "PATH          STATE       TYPES           VALID  PENDING",
                            "/media/films  finished    document,video  yes          0",
                            "/photos       processing  photo           yes          3", "",
                            "Press q or Ctrl-C to end."));
    EXPECT_THAT(child->Output(), StartsWith(kEnter));
}

TEST_F(StatusWatchTest, WatchMovesTheBarAsEventsAreConsumed) {
    StartDaemon();
    PutFile(kTaken, Events(30));
    PutFile(kQueue, Events(10));
    const auto child = WatchOnTerminal();
    ASSERT_TRUE(Eventually([&] { return Shows(*child, "40  [----"); }));
    RemoveTree(kTaken);
    EXPECT_TRUE(Eventually(
        [&] { return Shows(*child, "photos       10  [#####################-------]  75 %"); }));
    RemoveTree(kQueue);
    EXPECT_TRUE(Eventually([&] { return Shows(*child, "photos        0  "); }));
}

TEST_F(StatusWatchTest, WatchFollowsTheDaemonOnATerminal) {
    PutFile(kQueue, Events(500));
    const auto child = WatchOnTerminal();
    ASSERT_TRUE(Eventually([&] { return Shows(*child, "daemon stopped"); }));
    StartDaemonAtWork();
    EXPECT_TRUE(Eventually([&] {
        return Shows(*child, "Daemon:   running") && Shows(*child, "/photos       finished");
    }));
    child->Type(kCtrlC);
    EXPECT_EQ(child->Wait(), kDone);
    EXPECT_THAT(ReadText(kPeerOut), Not(HasSubstr("refused")));
}

TEST_F(StatusWatchTest, WatchEstimatesTheEnd) {
    StartDaemon();
    const auto child = WatchOnTerminal();
    PutFile(kQueue, Events(100));
    ASSERT_TRUE(Eventually([&] { return Shows(*child, "100  ["); }));
    const auto start = std::time(nullptr);
    // Ever shorter, and never empty: what replaces it is written elsewhere.
    int left = 100;
    EXPECT_TRUE(Eventually([&] {
        left = std::max(left - 1, 1);
        PutFile("/volume1/queue", Events(left));
        std::filesystem::rename("/volume1/queue", kQueue);
        return Shows(*child, " s left");
    }));
    EXPECT_GE(std::time(nullptr) - start, 2);
}

void ExpectTerminalIsBack(PtyChild &child, const termios &before) {
    const std::string &output = child.Output();
    const std::size_t leave = output.rfind(kLeave);
    ASSERT_NE(leave, std::string::npos);
    EXPECT_EQ(output.find("\033", leave + sizeof(kLeave) - 1), std::string::npos);
    // The last picture stands below what was there before, whole.
    EXPECT_THAT(output.substr(leave), AllOf(HasSubstr("Daemon:   stopped\r\n"),
                                            HasSubstr("/photos "), Not(HasSubstr("Ctrl-C"))));
    EXPECT_EQ(output.substr(output.size() - 2), "\r\n");
    EXPECT_EQ(child.Settings().c_lflag, before.c_lflag);
}

TEST_F(StatusWatchTest, WatchGivesTheTerminalBackHoweverItIsEnded) {
    const std::pair<const char *, int> rows[] = {
        {kCtrlC, 0}, {"q", 0}, {"", SIGTERM}, {"", SIGINT}, {"", SIGHUP}};
    for (const auto &[keys, signal] : rows) {
        const auto child = WatchOnTerminal();
        const termios before = child->Settings();
        ASSERT_TRUE(Eventually([&] { return Shows(*child, "Ctrl-C"); }));
        EXPECT_EQ(child->Settings().c_lflag & ECHO, 0U);
        if (signal == 0) {
            child->Type(keys);
        } else {
            child->Signal(signal);
        }
        EXPECT_EQ(child->Wait(), kDone) << keys << signal;
        ExpectTerminalIsBack(*child, before);
    }
}

TEST_F(StatusWatchTest, WatchGivesTheTerminalBackAtTheEndOfItsCount) {
    const auto child =
        WatchOnTerminal(kPlainTerminal, 24, 80, {"--count", "2", "--interval", "0.1"});
    const termios before = child->Settings();
    EXPECT_EQ(child->Wait(), kDone);
    ExpectTerminalIsBack(*child, before);
}

TEST_F(StatusWatchTest, WatchGivesTheTerminalBackWhileItIsSuspended) {
    const auto child = WatchOnTerminal();
    ASSERT_TRUE(Eventually([&] { return Shows(*child, "Ctrl-C"); }));
    child->Type(kCtrlZ);
    ASSERT_TRUE(Eventually([&] { return child->HasStopped(); }));
    const std::string output = child->Output();
    EXPECT_EQ(output.substr(output.size() - sizeof(kLeave) + 1), kLeave);
    EXPECT_NE(child->Settings().c_lflag & ECHO, 0U);
    child->Signal(SIGCONT);
    EXPECT_TRUE(Eventually([&] {
        return child->Output().find(kEnter, output.size()) != std::string::npos &&
               Shows(*child, "Ctrl-C");
    }));
    child->Type("q");
    EXPECT_EQ(child->Wait(), kDone);
}

// What a shell with jobs and its `watch` have written, from `position` on.
bool Says(PtyChild &shell, const std::string &text, std::size_t position = 0) {
    return Eventually([&] { return shell.Output().find(text, position) != std::string::npos; });
}

TEST_F(StatusWatchTest, WatchDrawsNothingInTheBackground) {
    PtyChild shell({"/bin/sh", "-i"}, kPlainTerminal, 24, 80);
    shell.Type(FILEINDEXCTL_PATH " watch --count 5 --interval 0.1 & wait; echo en''ded\n");
    ASSERT_TRUE(Says(shell, "ended\r\n"));
    EXPECT_THAT(shell.Output(),
                AllOf(Not(HasSubstr(kEnter)), Not(HasSubstr(kLeave)), Not(HasSubstr("Daemon:"))));
}

TEST_F(StatusWatchTest, WatchLeavesTheScreenForTheBackgroundAndTakesItAgainInTheForeground) {
    // A shell that sends a job no signal when it brings it to the foreground while it runs.
    PtyChild shell({"/bin/bash", "--norc", "--noediting", "-i"}, kPlainTerminal, 24, 80);
    shell.Type(FILEINDEXCTL_PATH " watch --interval 3600 & sleep 0.5; fg\n");
    ASSERT_TRUE(Says(shell, "Ctrl-C to end.")); // without waiting for the next look
    shell.Type(kCtrlZ);
    ASSERT_TRUE(Says(shell, "Stopped"));
    const std::size_t stopped = shell.Output().size();
    shell.Type("bg; sleep 2; echo wo''ken\n");
    ASSERT_TRUE(Says(shell, "woken\r\n", stopped));
    EXPECT_EQ(shell.Output().find(kEnter, stopped), std::string::npos);
    EXPECT_EQ(shell.Output().find("Daemon:", stopped), std::string::npos);
    shell.Type("fg\n");
    ASSERT_TRUE(Says(shell, "Ctrl-C to end.", stopped));
    shell.Type("q");
    EXPECT_TRUE(Says(shell, kLeave, shell.Output().rfind(kEnter)));
}

// At once: the next look would be an hour later.
TEST_F(StatusWatchTest, WatchFollowsTheSizeOfTheTerminal) {
    PutFile(kQueue, Events(3));
    const auto child = WatchOnTerminal(kPlainTerminal, 24, 80, {"--interval", "3600"});
    const auto hasDrawn = [&](int pictures) {
        return Eventually([&] {
            std::size_t start = 0;
            int count = 0;
            while ((start = child->Output().find("\033[H", start)) != std::string::npos) {
                ++start;
                ++count;
            }
            return count == pictures;
        });
    };
    ASSERT_TRUE(hasDrawn(1));
    child->Resize(12, 40);
    ASSERT_TRUE(hasDrawn(2));
    child->Resize(24, 80);
    ASSERT_TRUE(hasDrawn(3));
    const Words lines = Picture(*child); // the second one
    EXPECT_TRUE(Shows(*child, "PATH"));
    EXPECT_FALSE(Shows(*child, "VALID"));
    EXPECT_LE(lines.size(), 12U);
    for (const std::string &line : lines) {
        EXPECT_LE(line.size(), 40U) << line;
    }
}

TEST_F(StatusWatchTest, WatchFitsAnyTerminal) {
    PutFile(kQueue, Events(3));
    for (const auto &[rows, columns] :
         {std::pair<unsigned short, unsigned short>{1, 1}, {2, 10}, {3, 200}, {50, 5}}) {
        const auto child = WatchOnTerminal(kPlainTerminal, rows, columns);
        ASSERT_TRUE(Eventually([&] { return child->Output().size() > 40; }));
        child->Type("q");
        EXPECT_EQ(child->Wait(), kDone);
        const std::string drawn = child->Output().substr(0, child->Output().find(kLeave));
        std::size_t start = drawn.find("\033[H");
        for (; start != std::string::npos; start = drawn.find("\033[H", start + 1)) {
            const std::string picture =
                WithoutEscapes(drawn.substr(start, drawn.find("\033[H", start + 1) - start));
            EXPECT_LE(std::count(picture.begin(), picture.end(), '\n'), rows);
            for (std::string line : LinesOf(picture)) {
                line.erase(std::remove(line.begin(), line.end(), '\r'), line.end());
                EXPECT_LE(line.size(), columns) << line;
            }
        }
    }
}

TEST_F(StatusWatchTest, WatchUsesBlocksAndColoursWhereTheyCanBeShown) {
    StartDaemon();
    PutFile(kQueue, Events(3));
    const auto child = WatchOnTerminal(kColourTerminal);
    ASSERT_TRUE(Eventually([&] { return Shows(*child, "░░░░"); }));
    EXPECT_THAT(child->Output(), HasSubstr("\033[32mrunning\033[0m"));

    const auto plain = WatchOnTerminal({"TERM=xterm-256color", "LC_ALL=C", "NO_COLOR=1"});
    ASSERT_TRUE(Eventually([&] { return Shows(*plain, "[-----"); }));
    EXPECT_THAT(plain->Output(), Not(HasSubstr("\033[3")));
    for (const char byte : plain->Output()) {
        ASSERT_LT(static_cast<unsigned char>(byte), 0x80);
    }
}

TEST_F(StatusWatchTest, WatchOnADumbTerminalWritesPlainLines) {
    PtyChild child({FILEINDEXCTL_PATH, "watch", "--count", "1"}, {"TERM=dumb"}, 24, 80);
    EXPECT_EQ(child.Wait(), kDone);
    EXPECT_THAT(child.Output(),
                AllOf(HasSubstr("share photos  0 pending, finished\r\n"), Not(HasSubstr("\033"))));
}

TEST_F(StatusWatchTest, WatchGoesOnWithoutAKeyboard) {
    PtyChild child({"/bin/sh", "-c",
                    "exec " FILEINDEXCTL_PATH " watch --count 3 --interval 0.1 "
                    "</dev/null"},
                   kPlainTerminal, 24, 80);
    const termios before = child.Settings();
    EXPECT_EQ(child.Wait(), kDone);
    ExpectTerminalIsBack(child, before);
}

TEST_F(StatusWatchTest, WatchShowsThatNoFolderIsIndexed) {
    RemoveTree(kFolders);
    const auto child = WatchOnTerminal();
    EXPECT_TRUE(Eventually([&] { return Shows(*child, "No folder is indexed."); }));
}

} // namespace
} // namespace VANO::TESTS
