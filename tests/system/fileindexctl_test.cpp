// The command line as an administrator meets it: what it says where, what it exits with, and what
// the library has done then.

#include <csignal>
#include <ctime>
#include <gmock/gmock.h>
#include <memory>
#include <sys/stat.h>

#include "support/files.h"
#include "system/child.h"

namespace VANO::TESTS {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

using Words = std::vector<std::string>;

constexpr char kFolders[] = "/usr/vano/etc/fileindex/folder.conf";
constexpr char kStatus[] = "/usr/vano/etc/fileindex/status.conf";
constexpr char kFolderLock[] = "/tmp/fileidx_cfg_folder.lock";
constexpr char kShares[] = "/usr/vano/etc/shares.json";
constexpr char kMonitors[] = "/usr/vano/etc/vanotifyd";
constexpr char kSocket[] = "/run/fileindexd.sock";
constexpr char kService[] = "/etc/init.d/fileindexd";
const std::string kPeerOut = "/tmp/peer.out";
const std::string kPhotoQueue = "/volume1/photos/@eaDir/VANO@file_index_queue";

constexpr int kDone = 0;
constexpr int kFailed = 1;
constexpr int kUsage = 2;
constexpr int kNotFound = 3;

Outcome Ctl(Words arguments) {
    arguments.insert(arguments.begin(), FILEINDEXCTL_PATH);
    return RunToEnd(arguments);
}

// On a terminal; `settings` are assignments of environment variables.
std::string RunOnTerminal(const std::string &settings, const std::string &arguments) {
    const Outcome outcome =
        RunToEnd({"/usr/bin/script", "--quiet", "--return", "--command",
                  "env " + settings + " " FILEINDEXCTL_PATH " " + arguments, "/dev/null"});
    EXPECT_EQ(outcome.status, kDone) << outcome.out;
    return outcome.out;
}

class FileindexctlTest : public ::testing::Test {
  protected:
    void SetUp() override {
        for (const std::string &path :
             {std::string(kFolders), std::string(kStatus), std::string(kMonitors), kPeerOut,
              std::string(kSocket), std::string("/volume1/photos"),
              std::string("/volume2/media")}) {
            RemoveTree(path);
        }
        PutFile(kShares, R"({"photos":"/volume1/photos","media":"/volume2/media"})");
        MakeDirs("/volume1/photos/2016");
        MakeDirs("/volume2/media/films");
        PutFile(kService, "#!/bin/sh\n"
                          "### BEGIN INIT INFO\n"
                          "# Provides:          fileindexd\n"
                          "# Required-Start:    $remote_fs\n"
                          "# Required-Stop:     $remote_fs\n"
                          "# Default-Start:     2 3 4 5\n"
                          "# Default-Stop:      0 1 6\n"
                          "### END INIT INFO\n");
        ASSERT_EQ(::chmod(kService, 0755), 0);
    }

    // Most commands need somebody who listens. Long pauses between looks: queues stay as they are.
    void StartDaemon() {
        daemon_ = std::make_unique<Child>(Words{PEER_PATH, "--queue", "/tmp/none"}, kPeerOut,
                                          "/tmp/peer.err");
        ASSERT_TRUE(Eventually([] { return Exists(kSocket); }));
    }

    // What the daemon was told so far.
    Words Told() {
        daemon_->Signal(SIGTERM);
        EXPECT_EQ(daemon_->Wait(), 0);
        return LinesOf(ReadText(kPeerOut));
    }

    void Save(const std::string &folders) { PutFile(kFolders, folders); }

    std::unique_ptr<Child> daemon_;
};

constexpr char kPhotos[] =
    R"({"/photos":{"path":"/photos","name":"Photos","document":false,"audio":false,"video":false,"photo":true}})";
constexpr char kTwo[] =
    R"({"/photos":{"path":"/photos","name":"Photos","document":false,"audio":false,"video":false,"photo":true},)"
    R"("/media/films":{"path":"/media/films","name":"","document":true,"audio":false,"video":true,"photo":false}})";

// --- help and mistakes --------------------------------------------------------------------------

class HelpTest : public FileindexctlTest, public ::testing::WithParamInterface<const char *> {};

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
                         ::testing::Values("", "add", "list", "show", "remove", "reindex", "pause",
                                           "resume", "query", "share", "share\nrename",
                                           "share\npause", "share\nresume"));

struct Mistake {
    const char *what;
    Words arguments;
    const char *message;

    friend void PrintTo(const Mistake &mistake, std::ostream *out) { *out << mistake.what; }
};

class MistakeTest : public FileindexctlTest, public ::testing::WithParamInterface<Mistake> {};

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
        Mistake{"UnknownCommand", {"frobnicate"}, "frobnicate"},
        Mistake{"AbbreviatedCommand", {"rem", "/photos"}, "rem"},
        Mistake{"UnknownOption", {"list", "--nonsense"}, "--nonsense"},
        Mistake{"AddNothing", {"add", "--all"}, "PATH is required"},
        Mistake{"AddNoTypes", {"add", "/photos"}, "Say what to index"},
        Mistake{"AddRelativePath", {"add", "photos", "--all"}, "'photos' is no share path"},
        Mistake{"AddEmptyPath", {"add", "", "--all"}, "'' is no share path"},
        Mistake{"AddRoot", {"add", "/", "--all"}, "'/' is no share path"},
        Mistake{"AddFinalSlash", {"add", "/photos/", "--all"}, "final slashes"},
        Mistake{"AddDots", {"add", "/photos/../x", "--all"}, "is not plain"},
        Mistake{"AddOneNameForTwo", {"add", "/a", "/b", "--all", "--name", "N"}, "single folder"},
        Mistake{"ShowNothing", {"show"}, "PATH is required"},
        Mistake{"ShowTwo", {"show", "/a", "/b"}, "/b"},
        Mistake{"RemoveNothing", {"remove"}, "PATH is required"},
        Mistake{"RemoveRelativePath", {"remove", "photos"}, "no share path"},
        Mistake{"ReindexNothing", {"reindex"}, "PATH is required"},
        Mistake{"PauseNegative", {"pause", "--hours", "-1"}, "--hours"},
        Mistake{"PauseWord", {"pause", "--hours", "long"}, "--hours"},
        Mistake{"PauseBeyond2038", {"pause", "--hours", "9999999"}, "--hours"},
        Mistake{"PauseSurplus", {"pause", "8"}, "8"},
        Mistake{"ResumeSurplus", {"resume", "now"}, "now"},
        Mistake{"QueryNothing", {"query"}, "PATH is required"},
        Mistake{"QueryTwoKinds", {"query", "--share", "--full-path", "/a"}, "excludes"},
        Mistake{"QueryRelativePath", {"query", "a"}, "no share path"},
        Mistake{"QueryRelativeFullPath", {"query", "--full-path", "a"}, "does not begin with /"},
        Mistake{"ShareNoCommand", {"share"}, "subcommand is required"},
        Mistake{"ShareRenameOneName", {"share", "rename", "photos"}, "NEW is required"},
        Mistake{"SharePath", {"share", "pause", "/photos"}, "no name of a share"}),
    [](const auto &row) { return row.param.what; });

TEST_F(FileindexctlTest, AFullDeviceIsAFailure) {
    Save(kPhotos);
    Child child({FILEINDEXCTL_PATH, "list"}, "/dev/full", "/tmp/run.err");
    EXPECT_EQ(child.Wait(), kFailed);
}

// --- add ----------------------------------------------------------------------------------------

TEST_F(FileindexctlTest, AddSavesAndTellsEverybody) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/photos", "--photo", "--video", "--name", "Our photos"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Added /photos.\n");
    EXPECT_EQ(ReadJson(kFolders),
              Json(R"({"/photos":{"path":"/photos","name":"Our photos",)"
                   R"("document":false,"audio":false,"video":true,"photo":true}})"));
    EXPECT_THAT(NamesIn(kMonitors), ElementsAre(HasSubstr("fileindex")));
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr(R"("event":131072,"path":"/volume1/photos")"));
    EXPECT_THAT(Told(), ElementsAre(R"(command upsert_folder_setting {"folder_path":"/photos"})"));
}

TEST_F(FileindexctlTest, AddKeepsTheNameAndTheOtherTypes) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(Ctl({"add", "/photos", "--document"}).status, kDone);
    EXPECT_EQ(ReadJson(kFolders),
              Json(R"({"/photos":{"path":"/photos","name":"Photos",)"
                   R"("document":true,"audio":false,"video":false,"photo":true}})"));
}

TEST_F(FileindexctlTest, AddTakesSeveralFoldersOfAllTypes) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/photos/2016", "/media/films", "--all"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Added /photos/2016, /media/films.\n");
    const Json::Value folders = ReadJson(kFolders);
    for (const char *path : {"/photos/2016", "/media/films"}) {
        for (const char *type : {"document", "audio", "video", "photo"}) {
            EXPECT_TRUE(folders[path][type].asBool()) << path << ' ' << type;
        }
    }
}

TEST_F(FileindexctlTest, AddOfAnUnknownShareSaysSoAndSavesNothing) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/nowhere", "--all"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.error, AllOf(StartsWith("fileindexctl: Cannot add /nowhere: no share has "
                                                "that name (platform error 0x1400, "),
                                     HasSubstr("\n  Paths begin with /SHARE")));
    EXPECT_FALSE(Exists(kFolders));
}

TEST_F(FileindexctlTest, AddOfAMissingFolderWarns) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/photos/nowhere", "--all"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.error, HasSubstr("/photos/nowhere cannot be indexed as it is"));
}

TEST_F(FileindexctlTest, AddWithoutADaemonSaysThatOnlyTheSettingsFollowed) {
    const Outcome outcome = Ctl({"add", "/photos", "--photo"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("/photos is saved, but not every part"));
    EXPECT_TRUE(ReadJson(kFolders)["/photos"]["photo"].asBool());
}

TEST_F(FileindexctlTest, AddSaysThatTheSettingsAreLocked) {
    const HoldLock other(kFolderLock);
    const Outcome outcome = Ctl({"add", "/photos", "--photo"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, AllOf(HasSubstr("Cannot add /photos: the settings are locked"),
                                     HasSubstr("try again")));
    EXPECT_FALSE(Exists(kFolders));
}

// --- list ---------------------------------------------------------------------------------------

TEST_F(FileindexctlTest, ListOfNothingIsDone) {
    const Outcome outcome = Ctl({"list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: No folder is indexed.\n");
}

TEST_F(FileindexctlTest, ListAlignsItsLines) {
    Save(kTwo);
    const Outcome outcome = Ctl({"list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "/media/films  -       document,video  finished\n"
                           "/photos       Photos  photo           finished\n");
    EXPECT_EQ(outcome.error, "");
}

TEST_F(FileindexctlTest, ListOfAShareShowsNoOther) {
    Save(kTwo);
    EXPECT_EQ(Ctl({"list", "--share", "photos"}).out, "/photos  Photos  photo  finished\n");
    const Outcome none = Ctl({"list", "--share", "photo"});
    EXPECT_EQ(none.status, kNotFound);
    EXPECT_EQ(none.out, "");
    EXPECT_EQ(none.error, "fileindexctl: No folder of share photo is indexed.\n");
}

TEST_F(FileindexctlTest, ListAsJsonIsOneCompactObject) {
    Save(kPhotos);
    EXPECT_EQ(Ctl({"list", "--json"}).out,
              R"({"folder":[{"additional":{"is_valid":true,"status":"finished"},"audio":false,)"
              R"("document":false,"name":"Photos","path":"/photos","photo":true,"video":false}],)"
              R"("total":1})"
              "\n");
}

TEST_F(FileindexctlTest, ListTellsWhatKeepsAFolderFromBeingIndexed) {
    Save(kTwo);
    RemoveTree("/volume2/media/films");
    PutFile(kStatus, R"({"no_space":{"photos":true}})");
    EXPECT_EQ(Ctl({"list"}).out, "/media/films  -       document,video  cannot be indexed\n"
                                 "/photos       Photos  photo           out of space\n");
}

TEST_F(FileindexctlTest, ListShowsWhatWaits) {
    Save(kPhotos);
    PutFile(kPhotoQueue, R"({"data":null,"event":65536,"path":"/volume1/photos"})"
                         "\n");
    EXPECT_THAT(Ctl({"list"}).out, HasSubstr("processing"));
    PutFile(kStatus, R"({"resume_time":0})");
    EXPECT_THAT(Ctl({"list"}).out, HasSubstr("paused"));
}

TEST_F(FileindexctlTest, NamesCannotPlayTricksOnTheTerminal) {
    Save("{\"/photos\":{\"name\":\"a\\n\\u001b[31m\\u202e\\\\\xff\",\"photo\":true}}");
    EXPECT_EQ(Ctl({"list"}).out, "/photos  a\\n\\x1b[31m\\u202e\\\\\\xff  photo  finished\n");
    EXPECT_THAT(Ctl({"show", "/photos"}).out, HasSubstr("a\\n\\x1b[31m\\u202e\\\\\\xff\n"));
    EXPECT_THAT(Ctl({"list", "--json"}).out, HasSubstr("\xff")); // byte for byte
    EXPECT_THAT(Ctl({"show", "/a\x1b[31m"}).error, HasSubstr("/a\\x1b[31m is not set"));
}

TEST_F(FileindexctlTest, WideAndCombiningCharactersStayAligned) {
    MakeDirs("/volume1/photos/e");
    Save(R"({"/photos":{"name":"日本","photo":true},"/photos/2016":{"name":"abcd","photo":true},)"
         "\"/photos/e\":{\"name\":\"e\xCC\x81t\xC3\xA9s\",\"photo\":true}}");
    EXPECT_EQ(Ctl({"list"}).out, "/photos       日本  photo  finished\n"
                                 "/photos/2016  abcd  photo  finished\n"
                                 "/photos/e     e\xCC\x81t\xC3\xA9s  photo  finished\n");
}

TEST_F(FileindexctlTest, ListOnATerminalHasHeadings) {
    Save(kPhotos);
    const std::string rows = "/photos  Photos  photo  finished\r\n";
    EXPECT_EQ(RunOnTerminal("TERM=xterm", "list"),
              "\033[1mPATH     NAME    TYPES  STATUS\033[0m\r\n" + rows);
    EXPECT_EQ(RunOnTerminal("TERM=dumb", "list"), "PATH     NAME    TYPES  STATUS\r\n" + rows);
    EXPECT_EQ(RunOnTerminal("TERM=xterm NO_COLOR=1", "list"),
              "PATH     NAME    TYPES  STATUS\r\n" + rows);
}

TEST_F(FileindexctlTest, ListOfBrokenSettingsFails) {
    for (const char *broken : {"{", "[]", ""}) {
        Save(broken);
        const Outcome outcome = Ctl({"list"});
        EXPECT_EQ(outcome.status, kFailed) << broken;
        EXPECT_EQ(outcome.out, "") << broken;
        EXPECT_THAT(outcome.error, AllOf(StartsWith("fileindexctl: Cannot list the folders: a "
                                                    "settings file "),
                                         HasSubstr("/usr/vano/etc/fileindex")))
            << broken;
    }
}

// --- show ---------------------------------------------------------------------------------------

TEST_F(FileindexctlTest, ShowShowsOneFolder) {
    Save(kTwo);
    const Outcome outcome = Ctl({"show", "/media/films"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "path       /media/films\n"
                           "full path  /volume2/media/films\n"
                           "name       -\n"
                           "types      document,video\n"
                           "status     finished\n");
    EXPECT_EQ(outcome.error, "");
}

TEST_F(FileindexctlTest, ShowAsJsonIsOneCompactObject) {
    Save(kTwo);
    EXPECT_EQ(Ctl({"show", "/photos", "--json"}).out,
              R"({"additional":{"is_valid":true,"status":"finished"},"audio":false,)"
              R"("document":false,"name":"Photos","path":"/photos","photo":true,"video":false})"
              "\n");
}

TEST_F(FileindexctlTest, ShowOfWhatIsNotSetFindsNothing) {
    Save(kPhotos);
    for (const char *path : {"/photo", "/Photos", "/photos/2016"}) {
        const Outcome outcome = Ctl({"show", path});
        EXPECT_EQ(outcome.status, kNotFound);
        EXPECT_EQ(outcome.out, "");
        EXPECT_THAT(outcome.error, HasSubstr(std::string(path) + " is not set."));
    }
}

TEST_F(FileindexctlTest, ShowOfAFolderWhoseShareIsGoneStillShowsIt) {
    Save(R"({"/gone":{"name":"G","photo":true}})");
    const Outcome outcome = Ctl({"show", "/gone"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.out, AllOf(HasSubstr("full path  -\n"), HasSubstr("cannot be indexed")));
}

// --- remove -------------------------------------------------------------------------------------

TEST_F(FileindexctlTest, RemoveDropsTheSettingAndTellsTheDaemon) {
    StartDaemon();
    Save(kTwo);
    const Outcome outcome = Ctl({"remove", "/photos"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Removed /photos.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media/films"));
    EXPECT_THAT(Told(), ElementsAre(R"(command delete_folder_setting {"folder_path":"/photos"})"));
}

TEST_F(FileindexctlTest, RemoveOfSomethingThatIsNotSetRemovesNothing) {
    StartDaemon();
    Save(kPhotos);
    const Outcome outcome = Ctl({"remove", "/photos", "/photo"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("Nothing is removed: /photo is not set."));
    EXPECT_EQ(ReadText(kFolders), kPhotos);
    EXPECT_THAT(Told(), IsEmpty());
}

TEST_F(FileindexctlTest, RemoveWithoutADaemonSaysThatOnlyTheSettingsFollowed) {
    Save(kTwo);
    const Outcome outcome = Ctl({"remove", "/photos"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("The setting is removed, but not every part"));
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media/films"));
}

TEST_F(FileindexctlTest, RemoveOfTheLastFolderNeedsNoDaemon) {
    Save(kPhotos);
    EXPECT_EQ(Ctl({"remove", "/photos"}).status, kDone);
    EXPECT_EQ(ReadText(kFolders), "{}");
}

// --- reindex ------------------------------------------------------------------------------------

TEST_F(FileindexctlTest, ReindexQueuesAnEventForEachFolder) {
    Save(kTwo);
    const Outcome outcome = Ctl({"reindex", "/photos", "/media/films"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Queued /photos, /media/films for a new index.\n");
    EXPECT_EQ(ReadText(kPhotoQueue), R"({"data":null,"event":65536,"path":"/volume1/photos"})"
                                     "\n");
    EXPECT_EQ(ReadText("/volume2/media/@eaDir/VANO@file_index_queue"),
              R"({"data":null,"event":65536,"path":"/volume2/media/films"})"
              "\n");
}

TEST_F(FileindexctlTest, ReindexOfWhatIsNotIndexedDoesNothing) {
    Save(kPhotos);
    const Outcome outcome = Ctl({"reindex", "/photos", "/media/films"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("Nothing is done: /media/films is not indexed."));
    EXPECT_FALSE(Exists(kPhotoQueue));
}

// --- pause and resume ---------------------------------------------------------------------------

TEST_F(FileindexctlTest, PauseWithoutHoursHasNoEnd) {
    StartDaemon();
    for (const Words &arguments : {Words{"pause"}, Words{"pause", "--hours", "0"}}) {
        RemoveTree(kStatus);
        const Outcome outcome = Ctl(arguments);
        EXPECT_EQ(outcome.status, kDone);
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(outcome.error, "fileindexctl: Indexing is paused, until fileindexctl resume.\n");
        EXPECT_EQ(ReadText(kStatus), R"({"resume_time":0})");
    }
    EXPECT_THAT(Told(), ElementsAre(R"(command pause {"resume_time":0})",
                                    R"(command pause {"resume_time":0})"));
}

TEST_F(FileindexctlTest, PauseForHoursSaysUntilWhen) {
    StartDaemon();
    const std::time_t before = std::time(nullptr);
    const Outcome outcome = Ctl({"pause", "--hours", "8"});
    EXPECT_EQ(outcome.status, kDone);
    const std::time_t until = ReadJson(kStatus)["resume_time"].asInt64();
    EXPECT_GE(until, before + 8 * 3600);
    EXPECT_LE(until, std::time(nullptr) + 8 * 3600);
    std::tm local{};
    char text[64];
    std::strftime(text, sizeof(text), "%Y-%m-%d %H:%M", ::localtime_r(&until, &local));
    EXPECT_EQ(outcome.error, std::string("fileindexctl: Indexing is paused until ") + text + ".\n");
}

TEST_F(FileindexctlTest, ResumeEndsThePause) {
    StartDaemon();
    PutFile(kStatus, R"({"resume_time":0})");
    const Outcome outcome = Ctl({"resume"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Indexing goes on.\n");
    EXPECT_EQ(ReadText(kStatus), R"({"resume_time":-1})");
    EXPECT_THAT(Told(), ElementsAre("command resume {}"));
}

TEST_F(FileindexctlTest, WithoutADaemonThePauseIsSavedOnly) {
    for (const char *command : {"pause", "resume"}) {
        const Outcome outcome = Ctl({command});
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_THAT(outcome.error, AllOf(HasSubstr("pause is saved, but not every part"),
                                         HasSubstr("is fileindexd running?")));
        EXPECT_EQ(ReadJson(kStatus)["resume_time"].asInt(),
                  std::string(command) == "pause" ? 0 : -1);
    }
}

TEST_F(FileindexctlTest, PauseOfABrokenStatusFileFails) {
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

// --- query --------------------------------------------------------------------------------------

struct Question {
    const char *what;
    Words arguments;
    int status;
    const char *answer;

    friend void PrintTo(const Question &question, std::ostream *out) { *out << question.what; }
};

class QueryTest : public FileindexctlTest, public ::testing::WithParamInterface<Question> {};

TEST_P(QueryTest, IsAnswered) {
    Save(kTwo);
    const Outcome outcome = Ctl(GetParam().arguments);
    EXPECT_EQ(outcome.status, GetParam().status);
    EXPECT_EQ(outcome.out, GetParam().answer);
    EXPECT_EQ(outcome.error, "");
}

INSTANTIATE_TEST_SUITE_P(
    Questions, QueryTest,
    ::testing::Values(
        Question{"Folder", {"query", "/photos"}, kDone, "indexed  /photos\n"},
        Question{"Below", {"query", "/photos/2016/a.jpg"}, kDone, "indexed  /photos/2016/a.jpg\n"},
        Question{"Above", {"query", "/media"}, kNotFound, "not indexed  /media\n"},
        Question{"Sibling", {"query", "/photos2"}, kNotFound, "not indexed  /photos2\n"},
        Question{"FinalSlash", {"query", "/photos/"}, kNotFound, "not indexed  /photos/\n"},
        Question{"Several",
                 {"query", "/photos", "/x"},
                 kNotFound,
                 "indexed      /photos\nnot indexed  /x\n"},
        Question{"FullPath",
                 {"query", "--full-path", "/volume2/media/films/a"},
                 kDone,
                 "indexed  /volume2/media/films/a\n"},
        Question{"OtherFullPath",
                 {"query", "--full-path", "/photos"},
                 kNotFound,
                 "not indexed  /photos\n"},
        Question{"Shares",
                 {"query", "--share", "photos", "media"},
                 kDone,
                 "indexed  photos\nindexed  media\n"},
        Question{"OtherShare", {"query", "--share", "music"}, kNotFound, "not indexed  music\n"},
        Question{"Json",
                 {"query", "--json", "/photos", "/x"},
                 kNotFound,
                 "{\"/photos\":true,\"/x\":false}\n"}),
    [](const auto &row) { return row.param.what; });

TEST_F(FileindexctlTest, QueryOfBrokenSettingsIsNoAnswer) {
    Save("{");
    for (const Words &arguments :
         {Words{"query", "/photos"}, Words{"query", "--share", "photos"}}) {
        const Outcome outcome = Ctl(arguments);
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_EQ(outcome.out, "");
        EXPECT_THAT(outcome.error, HasSubstr("Cannot tell what is indexed"));
    }
}

// --- share --------------------------------------------------------------------------------------

TEST_F(FileindexctlTest, ShareRenameMovesTheFolders) {
    Save(kTwo);
    PutFile(kShares, R"({"pictures":"/volume1/pictures","media":"/volume2/media"})");
    const Outcome outcome = Ctl({"share", "rename", "photos", "pictures"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Moved the folders of photos to pictures.\n");
    const Json::Value folders = ReadJson(kFolders);
    EXPECT_THAT(folders.getMemberNames(), ElementsAre("/media/films", "/pictures"));
    EXPECT_EQ(folders["/pictures"]["name"].asString(), "Photos");
}

TEST_F(FileindexctlTest, ShareRenameToAnUnknownShareChangesNothing) {
    Save(kTwo);
    const Outcome outcome = Ctl({"share", "rename", "photos", "pictures"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot move the folders of photos to pictures"));
    EXPECT_EQ(ReadText(kFolders), kTwo);
}

TEST_F(FileindexctlTest, ShareRenameOfAShareWithoutFoldersFindsNothing) {
    Save(kPhotos);
    const Outcome outcome = Ctl({"share", "rename", "media", "films"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("no folder of share media is indexed"));
    EXPECT_EQ(ReadText(kFolders), kPhotos);
}

TEST_F(FileindexctlTest, SharePauseAndResumeTellTheDaemonAndTheMonitor) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(Ctl({"share", "resume", "photos"}).status, kDone);
    EXPECT_THAT(NamesIn(kMonitors), Not(IsEmpty()));
    EXPECT_EQ(Ctl({"share", "pause", "photos"}).status, kDone);
    EXPECT_THAT(NamesIn(kMonitors), IsEmpty());
    EXPECT_THAT(Told(), ElementsAre(R"(command revive_share_worker {"share_name":"photos"})",
                                    R"(command delete_share_worker {"share_name":"photos"})"));
}

TEST_F(FileindexctlTest, SharePauseWithoutADaemonFails) {
    Save(kPhotos);
    const Outcome outcome = Ctl({"share", "pause", "photos"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot pause share photos"));
}

} // namespace
} // namespace VANO::TESTS
