// "fileindexctl doctor": every trouble is made on purpose, and must be found, named and come with
// something to do about it; a healthy machine has none.

#include <csignal>
#include <cstdlib>
#include <ctime>
#include <fcntl.h>
#include <filesystem>
#include <gmock/gmock.h>
#include <memory>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <thread>
#include <tuple>
#include <unistd.h>

#include "platform/fuse_server.h"
#include "support/files.h"
#include "support/mounts.h"
#include "system/child.h"
#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

using ::testing::AllOf;
using ::testing::ContainsRegex;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;
using ::testing::StartsWith;

constexpr char kSettings[] = "/usr/vano/etc/fileindex";
constexpr char kSamba[] = "/etc/samba/smb.conf";
constexpr char kTestparm[] = "/usr/bin/testparm";
const std::string kMediaQueue = "/volume2/media/@eaDir/VANO@file_index_queue";

Outcome Doctor(Words arguments = {}) {
    arguments.insert(arguments.begin(), "doctor");
    return Ctl(arguments);
}

Json::Value FindingsIn(const Outcome &outcome) {
    return Json(outcome.out)["findings"];
}

// The problems that one check finds.
std::vector<Json::Value> Problems(const std::string &check) {
    const Outcome outcome = Doctor({check, "--quiet", "--json"});
    EXPECT_EQ(outcome.error, "");
    std::vector<Json::Value> problems;
    bool isError = false;
    const Json::Value findings = FindingsIn(outcome);
    for (const Json::Value &finding : findings) {
        problems.push_back(finding);
        isError = isError || finding["severity"] == "error";
        EXPECT_EQ(finding["check"].asString(), check);
        EXPECT_THAT(finding["command"].asString(), // or it drops a volume that is not mounted
                    Not(ContainsRegex("fileindexctl (add|set|remove) ")));
    }
    EXPECT_EQ(outcome.status, isError ? kFailed : kDone);
    return problems;
}

// The only problem that the check finds; null, and a failure, when there are none or more.
Json::Value ProblemOf(const std::string &check) {
    const std::vector<Json::Value> problems = Problems(check);
    EXPECT_THAT(problems, SizeIs(1));
    return problems.size() == 1 ? problems.front() : Json::Value(Json::objectValue);
}

// The problems that one check finds on a system as no test can have it.
Json::Value OnOddSystem(const std::string &setting, const std::string &check) {
    return FindingsIn(RunToEnd({"/usr/bin/env", "LD_PRELOAD=" ODD_SYSTEM_PATH,
                                "ASAN_OPTIONS=verify_asan_link_order=0:detect_leaks=0", setting,
                                FILEINDEXCTL_PATH, "doctor", check, "--quiet", "--json"}));
}

MATCHER_P2(Is, severity, code, "") {
    return arg["severity"] == severity && arg["code"] == code;
}

// A problem that says what to do.
MATCHER_P2(IsFixable, severity, code, "") {
    return arg["severity"] == severity && arg["code"] == code && !arg["fix"].asString().empty();
}

void MakeOlder(const std::string &path, long long seconds) {
    const timespec then = {std::time(nullptr) - seconds, 0};
    const timespec times[] = {then, then};
    ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW), 0);
}

std::string EventLine(const std::string &path) {
    return R"({"data":null,"event":65536,"path":")" + path + "\"}\n";
}

class DoctorTest : public CtlTest {
  protected:
    void SetUp() override {
        for (const char *path : {kSettings, kFolderLock, kStatusLock, kShares}) {
            RemoveTree(path);
        }
        CtlTest::SetUp();
        MakeDirs(kSettings);
        ASSERT_EQ(::chmod(kSettings, 0755), 0);
        PutFile(kSamba, "[global]\nspotlight = yes\n");
    }

    // Two folders, a daemon that answers, and a monitor that watches.
    void MakeHealthy() {
        Save(kTwo);
        StartDaemon();
        for (const char *share : {"photos", "media"}) {
            ASSERT_EQ(Ctl({"share", "resume", share}).status, kDone);
        }
    }
};

// --- all is well --------------------------------------------------------------------------------

TEST_F(DoctorTest, AHealthyMachineHasNoProblem) {
    if (!Exists(kTestparm)) {
        GTEST_SKIP() << "no testparm: Spotlight cannot be asked for";
    }
    MakeHealthy();
    PutFile(kStatus, R"({"resume_time":-1})");
    PutFile(kPhotoQueue, EventLine("/volume1/photos"));
    const Outcome outcome = Doctor();
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "");
    const std::string begin = "Settings\n"
                              "  ok       folder.conf: 2 folders\n"
                              "  ok       status.conf\n"
                              "Locks\n"
                              "  ok       Nobody holds a lock\n"
                              "Shares\n"
                              "  ok       2 shares\n"
                              "Folders\n"
                              "  ok       2 folders may be indexed\n"
                              "Daemon\n"
                              "  ok       fileindexd listens and answers: indexing_peer (PID ";
    EXPECT_THAT(outcome.out, StartsWith(begin));
    EXPECT_EQ(outcome.out.substr(outcome.out.find(")\nQueues\n")),
              ")\nQueues\n"
              "  ok       /volume1/photos/@eaDir/VANO@file_index_queue: 1 event, 53 bytes\n"
              "Change monitor\n"
              "  ok       The monitor watches 2 shares\n"
              "Spotlight\n"
              "  ok       Spotlight is on\n"
              "Room\n"
              "  ok       There is room in 2 shares\n"
              "\n"
              "Nothing is wrong.\n");
    const Outcome quiet = Doctor({"--quiet"});
    EXPECT_EQ(quiet.status, kDone);
    EXPECT_EQ(quiet.out, "");
}

TEST_F(DoctorTest, AFreshInstallationHasNoError) {
    RemoveTree(kShares);
    const Outcome outcome = Doctor();
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.out, AllOf(HasSubstr("No folder.conf yet: no folder is set"),
                                   HasSubstr("  warning  /usr/vano/etc/shares.json does not exist"),
                                   HasSubstr("does not run, which is right: no folder is set"),
                                   HasSubstr("\n1 warning.\n")));
}

// What lies where doctor looks, with everything that a change would change.
std::string StateOfTheMachine() {
    std::string state;
    for (const char *top : {kSettings, kMonitors, "/tmp", "/volume1", "/volume2", "/run"}) {
        if (!Exists(top)) {
            continue;
        }
        for (const auto &entry : std::filesystem::recursive_directory_iterator(top)) {
            struct stat info {};
            EXPECT_EQ(::lstat(entry.path().c_str(), &info), 0);
            if (entry.path().string().rfind("/tmp/run.", 0) != 0) {
                state += entry.path().string() + " " + std::to_string(info.st_ino) + " " +
                         std::to_string(info.st_size) + " " + std::to_string(info.st_ctim.tv_sec) +
                         "." + std::to_string(info.st_ctim.tv_nsec) + "\n";
            }
        }
    }
    return state;
}

TEST_F(DoctorTest, NothingIsChangedAndNoFileIsMade) {
    Save(kTwo);
    PutFile(kStatus, "{");
    (void)Doctor(); // whatever other programs make when they are asked for the first time
    const std::string before = StateOfTheMachine();
    EXPECT_EQ(Doctor().status, kFailed);
    EXPECT_EQ(StateOfTheMachine(), before);
    EXPECT_FALSE(Exists(kFolderLock));
    EXPECT_FALSE(Exists("/volume1/photos/@eaDir"));
}

// --- the call -----------------------------------------------------------------------------------

TEST_F(DoctorTest, HelpNamesTheChecksAndFitsTheScreen) {
    const Outcome outcome = Doctor({"--help"});
    EXPECT_EQ(outcome.status, kDone);
    for (const char *check : {"settings", "locks", "shares", "folders", "daemon", "queues",
                              "monitor", "spotlight", "room", "Exit status", "Examples"}) {
        EXPECT_THAT(outcome.out, HasSubstr(check));
    }
    for (const std::string &line : LinesOf(outcome.out)) {
        EXPECT_LE(line.size(), 80U) << line;
    }
}

TEST_F(DoctorTest, OnlyTheNamedChecksAreMade) {
    const Outcome outcome = Doctor({"locks", "queues"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "Locks\n"
                           "  ok       Nobody holds a lock\n"
                           "Queues\n"
                           "  ok       No event waits\n"
                           "\n"
                           "Nothing is wrong.\n");
}

TEST_F(DoctorTest, AnUnknownCheckIsAMistake) {
    const Outcome outcome = Doctor({"weather"});
    EXPECT_EQ(outcome.status, kUsage);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.error, HasSubstr("weather"));
}

TEST_F(DoctorTest, TheJsonFormIsStable) {
    PutFile(kStatus, "{\"resume_time\": nil}");
    const Outcome outcome = Doctor({"settings", "--json=short"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_EQ(
        outcome.out,
        R"({"errors":1,"findings":[{"check":"settings","code":"settings-none","command":"",)"
        R"("fix":"","severity":"ok","subject":"/usr/vano/etc/fileindex/folder.conf",)"
        R"("what":"No folder.conf yet: no folder is set","why":""},)"
        R"({"check":"settings","code":"settings-malformed","column":17,)"
        R"("command":"editor /usr/vano/etc/fileindex/status.conf",)"
        R"("fix":"Fix it by hand, or restore it from a backup. Moved away, it counts as empty.",)"
        R"("line":1,"severity":"error","subject":"/usr/vano/etc/fileindex/status.conf",)"
        R"("what":"/usr/vano/etc/fileindex/status.conf is not JSON: line 1, column 17",)"
        R"("why":"Syntax error: value, object or array expected."}],)"
        R"("result":"error","unknown":0,"warnings":0})"
        "\n");
}

// --- settings -----------------------------------------------------------------------------------

struct Malformed {
    const char *what;
    std::string text;
    int line; // 0 when no place can be told
    int column;
    const char *why;

    friend void PrintTo(const Malformed &row, std::ostream *out) { *out << row.what; }
};

class MalformedTest : public DoctorTest, public ::testing::WithParamInterface<Malformed> {};

TEST_P(MalformedTest, IsFoundAtItsLineAndColumn) {
    for (const char *path : {kFolders, kStatus}) {
        PutFile(path, GetParam().text);
        const Json::Value problem = ProblemOf("settings");
        EXPECT_THAT(problem, IsFixable("error", "settings-malformed"));
        EXPECT_EQ(problem["subject"].asString(), path);
        EXPECT_EQ(problem["line"].asInt(), GetParam().line);
        EXPECT_EQ(problem["column"].asInt(), GetParam().column);
        EXPECT_THAT(problem["why"].asString(), HasSubstr(GetParam().why));
        RemoveTree(path);
    }
}

INSTANTIATE_TEST_SUITE_P(
    Texts, MalformedTest,
    ::testing::Values(Malformed{"Empty", "", 1, 1, "expected"},
                      Malformed{"CutOff", "{\n  \"/photos\": {\n", 3, 1, "Missing '}'"},
                      Malformed{"BadWord", "{\n  \"a\": true,\n  \"b\": ture\n}", 3, 8, "value"},
                      Malformed{"MissingComma", "{\"a\": 1\n \"b\": 2}", 2, 2, "Missing ','"},
                      Malformed{"Extra", "{} x", 1, 4, "Extra"},
                      Malformed{"Comment", "{\n// hands off\n\"a\":1}", 2, 1, "comment"},
                      Malformed{"TrailingComma", "{\n \"a\": 1,\n}", 3, 1, "nothing after it"},
                      Malformed{"ZeroByte", std::string("{}\n \0", 5), 2, 2, ""},
                      Malformed{"TooDeep", std::string(100000, '['), 0, 0, "nested too deep"}),
    [](const auto &row) { return row.param.what; });

TEST_F(DoctorTest, WhatIsNoFileIsUnreadableAndHoldsNobodyUp) {
    ASSERT_EQ(::mkfifo(kFolders, 0644), 0);
    MakeDirs(kStatus);
    const std::vector<Json::Value> problems = Problems("settings");
    EXPECT_THAT(problems, ElementsAre(IsFixable("error", "settings-unreadable"),
                                      IsFixable("error", "settings-unreadable")));
    EXPECT_EQ(problems[0]["what"].asString(),
              "/usr/vano/etc/fileindex/folder.conf is not a regular file");
}

TEST_F(DoctorTest, AHugeFileIsUnreadable) {
    PutFile(kStatus, "{}");
    ASSERT_EQ(::truncate(kStatus, 1LL << 36), 0);
    const Json::Value problem = ProblemOf("settings");
    EXPECT_THAT(problem, IsFixable("error", "settings-unreadable"));
    EXPECT_THAT(problem["what"].asString(), HasSubstr("File too large"));
}

TEST_F(DoctorTest, ADirectoryThatIsMissingKeepsSettingsFromBeingSaved) {
    RemoveTree(kSettings);
    EXPECT_THAT(ProblemOf("settings"), IsFixable("error", "settings-directory-missing"));
    PutFile(kSettings, "");
    EXPECT_THAT(ProblemOf("settings"), IsFixable("error", "settings-directory-missing"));
}

TEST_F(DoctorTest, JsonOfAnotherShapeIsAnError) {
    Save("[]");
    EXPECT_THAT(ProblemOf("settings"), IsFixable("error", "settings-shape"));
}

TEST_F(DoctorTest, MembersThatCannotBeReadAreNamed) {
    Save(R"({"/a":{"name":1},"/b":{"photo":"yes"},"/c":null,"/d":{"photo":true}})");
    PutFile(kStatus, R"({"resume_time":"soon","no_space":true,"need_reindex":{}})");
    std::vector<std::string> subjects;
    for (const Json::Value &problem : Problems("settings")) {
        EXPECT_EQ(problem["code"].asString(), "settings-member");
        EXPECT_NE(problem["fix"].asString(), "");
        subjects.push_back(problem["subject"].asString());
    }
    EXPECT_THAT(subjects, ElementsAre("/a", "/b", "/c", "resume_time", "no_space"));
}

TEST_F(DoctorTest, MoreThanTheMostFoldersAreTooMany) {
    std::string text = "{";
    for (int i = 0; i <= 1000; ++i) {
        text += (i == 0 ? "\"/photos/" : ",\"/photos/") + std::to_string(i) + "\":{}";
    }
    Save(text + "}");
    EXPECT_THAT(ProblemOf("settings"), IsFixable("warning", "settings-limit"));
}

TEST_F(DoctorTest, OddOwnersModesAndLinksAreFound) {
    Save("{}");
    ASSERT_EQ(::chmod(kFolders, 0666), 0);
    EXPECT_THAT(ProblemOf("settings"), IsFixable("warning", "odd-mode"));
    ASSERT_EQ(::chmod(kFolders, 0600), 0);
    const Json::Value hidden = ProblemOf("settings");
    EXPECT_THAT(hidden, IsFixable("warning", "odd-mode"));
    EXPECT_THAT(hidden["what"].asString(), HasSubstr("cannot be read by others: mode 0600"));
    ASSERT_EQ(::chmod(kFolders, 0644), 0);
    EXPECT_THAT(Problems("settings"), IsEmpty());
    ASSERT_EQ(::chmod(kSettings, 0777), 0);
    EXPECT_EQ(ProblemOf("settings")["command"].asString(), "chmod 755 /usr/vano/etc/fileindex");
    ASSERT_EQ(::chmod(kSettings, 0755), 0);
    if (::lchown(kFolders, 1000, 0) == 0) {
        EXPECT_THAT(ProblemOf("settings"), IsFixable("warning", "odd-owner"));
    }
    RemoveTree(kFolders);
    PutFile("/volume1/photos/folder.conf", "{}");
    ASSERT_EQ(::symlink("/volume1/photos/folder.conf", kFolders), 0);
    EXPECT_THAT(ProblemOf("settings"), IsFixable("warning", "settings-link"));
}

TEST_F(DoctorTest, TemporaryFilesThatStayedBehindAreFoundAndThoseOfAWriterLeftAlone) {
    const std::string stray = std::string(kStatus) + ".a1B2c3";
    PutFile(stray, "{");
    PutFile(std::string(kStatus) + ".old", "{");
    MakeOlder(std::string(kStatus) + ".old", 3600);
    EXPECT_THAT(Problems("settings"), IsEmpty());
    MakeOlder(stray, 3 * 3600);
    const Json::Value problem = ProblemOf("settings");
    EXPECT_THAT(problem, IsFixable("warning", "stray-file"));
    EXPECT_EQ(problem["command"].asString(), "rm " + stray);
    EXPECT_THAT(problem["what"].asString(), HasSubstr("3 h ago"));
}

// --- locks --------------------------------------------------------------------------------------

TEST_F(DoctorTest, ALockThatIsHeldIsFoundAndLeftToItsHolder) {
    PutFile(kPhotoQueue, "");
    for (const std::string &path :
         {std::string(kFolderLock), std::string(kStatusLock), std::string(kPhotoQueue)}) {
        const HoldLock lock(path);
        const Json::Value problem = ProblemOf("locks");
        EXPECT_THAT(problem, IsFixable("warning", "lock-held"));
        EXPECT_EQ(problem["subject"].asString(), path);
        EXPECT_TRUE(IsLocked(path)); // still by its holder
    }
}

// It is only asked for: whoever reads a file under a shared lock holds nobody up.
TEST_F(DoctorTest, ASharedLockIsNoProblem) {
    ASSERT_EQ(
        std::system("exec 9>/tmp/fileidx_cfg_status.lock; flock --shared 9; " FILEINDEXCTL_PATH
                    " doctor locks >/tmp/locks"),
        0);
    EXPECT_THAT(ReadText("/tmp/locks"), HasSubstr("Nobody holds a lock"));
    EXPECT_FALSE(IsLocked(kStatusLock));
}

TEST_F(DoctorTest, ALockThatIsSoonFreeIsNoProblem) {
    auto lock = std::make_unique<HoldLock>(kFolderLock);
    std::thread writer([&lock] {
        std::this_thread::sleep_for(std::chrono::milliseconds(300));
        lock.reset();
    });
    EXPECT_THAT(Problems("locks"), IsEmpty());
    writer.join();
}

TEST_F(DoctorTest, WhatIsNoLockFileIsAnError) {
    MakeDirs(kFolderLock);
    EXPECT_EQ(ProblemOf("locks")["command"].asString(), "rmdir /tmp/fileidx_cfg_folder.lock");
    RemoveTree(kFolderLock);
    ASSERT_EQ(::mkfifo(kFolderLock, 0644), 0);
    EXPECT_THAT(ProblemOf("locks"), IsFixable("error", "lock-kind"));
    RemoveTree(kFolderLock);
    ASSERT_EQ(::symlink("/nowhere", kFolderLock), 0);
    EXPECT_THAT(ProblemOf("locks")["what"].asString(), HasSubstr("is a symbolic link"));
}

TEST_F(DoctorTest, ALockFileOfSomebodyElseIsFound) {
    PutFile(kStatusLock, "");
    if (::chown(kStatusLock, 1000, 0) != 0) {
        GTEST_SKIP() << "no other user here";
    }
    const Json::Value problem = ProblemOf("locks");
    EXPECT_EQ(problem["code"].asString(), "lock-owner");
    EXPECT_EQ(problem["command"].asString(), "rm /tmp/fileidx_cfg_status.lock");
}

// --- shares -------------------------------------------------------------------------------------

TEST_F(DoctorTest, AShareTableThatIsNoJsonIsFoundAtItsPlace) {
    PutFile(kShares, "{\n  \"photos\": /volume1/photos\n}");
    const Json::Value problem = ProblemOf("shares");
    EXPECT_THAT(problem, IsFixable("error", "share-table-malformed"));
    EXPECT_EQ(problem["line"].asInt(), 2);
    EXPECT_EQ(problem["column"].asInt(), 13);
    PutFile(kShares, "[]");
    EXPECT_THAT(ProblemOf("shares"), IsFixable("error", "share-table-shape"));
}

TEST_F(DoctorTest, AMissingShareTableIsAnErrorOnceFoldersAreSet) {
    RemoveTree(kShares);
    EXPECT_THAT(ProblemOf("shares"), IsFixable("warning", "share-table-missing"));
    Save(kTwo);
    EXPECT_THAT(ProblemOf("shares"), IsFixable("error", "share-table-missing"));
}

TEST_F(DoctorTest, EntriesThatThePlatformLeavesOutAreExplained) {
    const std::pair<const char *, const char *> rows[] = {
        {R"({"a":1})", "names no directory"},
        {R"({"a":{"read_only":true}})", "names no directory"},
        {R"({"a":"volume1/a"})", "absolute path"},
        {R"({"a":{"path":"/volume1/a","read_only":"no"}})", "\"read_only\" is neither"},
        {R"({"a":"/volume1/b"})", "does not end in the share's name"},
        {R"({"a":"/volume1/../a"})", "no plain absolute path"},
    };
    for (const auto &[table, why] : rows) {
        PutFile(kShares, table);
        const Json::Value problem = ProblemOf("shares");
        EXPECT_THAT(problem, IsFixable("error", "share-left-out")) << table;
        EXPECT_THAT(problem["why"].asString(), HasSubstr(why)) << table;
    }
}

TEST_F(DoctorTest, AShareWhoseDirectoryIsGoneIsWorseWithFolders) {
    RemoveTree("/volume2/media");
    EXPECT_THAT(ProblemOf("shares"), IsFixable("warning", "share-gone"));
    Save(kTwo);
    const Json::Value problem = ProblemOf("shares");
    EXPECT_THAT(problem, IsFixable("error", "share-gone"));
    EXPECT_EQ(problem["directory"].asString(), "/volume2/media");
}

TEST_F(DoctorTest, FoldersOfAShareThatIsUnknownAreFound) {
    Save(R"({"/gone/x":{"photo":true},"/gone/y":{"photo":true}})");
    const Json::Value problem = ProblemOf("shares");
    EXPECT_THAT(problem, IsFixable("error", "share-unknown"));
    EXPECT_EQ(problem["command"].asString(), "fileindexctl share remove gone");
    EXPECT_EQ(Ctl({"share", "remove", "gone"}).status, kDone);
    EXPECT_THAT(Problems("shares"), IsEmpty());
}

// --- folders ------------------------------------------------------------------------------------

std::string RuleFor(const std::string &folder) {
    PutFile(kFolders, "{\"" + folder + "\":{\"photo\":true}}");
    const Json::Value problem = ProblemOf("folders");
    EXPECT_THAT(problem, IsFixable("error", "folder-refused"));
    EXPECT_THAT(problem["why"].asString(), StartsWith("Rule " + problem["rule"].asString() + ": "));
    return problem["rule"].asString();
}

TEST_F(DoctorTest, EachRuleOfPlaceIsNamed) {
    for (const char *directory : {"#recycle/old", "#snapshot/monday", "real"}) {
        MakeDirs(std::string("/volume1/photos/") + directory);
    }
    ASSERT_EQ(::symlink("real", "/volume1/photos/link"), 0);
    EXPECT_EQ(RuleFor("/photos/#recycle/old"), "recycle-bin");
    EXPECT_EQ(RuleFor("/photos/#snapshot/monday"), "snapshot");
    EXPECT_EQ(RuleFor("/photos/lost"), "missing");
    EXPECT_EQ(RuleFor("/photos/link"), "not-canonical");
    EXPECT_EQ(RuleFor("/photos/2016/"), "not-canonical");
    EXPECT_EQ(RuleFor("/nowhere/x"), "no-share");
}

TEST_F(DoctorTest, EachRuleOfTheShareIsNamed) {
    PutFile(kShares, R"({"surveillance":"/volume1/surveillance",)"
                     R"("secret":{"path":"/volume1/secret","encrypted":true},)"
                     R"("old":{"path":"/volume1/old","read_only":true}})");
    for (const char *share : {"surveillance", "secret", "old"}) {
        MakeDirs(std::string("/volume1/") + share);
    }
    EXPECT_EQ(RuleFor("/surveillance"), "share-excluded");
    EXPECT_EQ(RuleFor("/secret"), "share-encrypted");
    EXPECT_EQ(RuleFor("/old"), "share-read-only");
}

TEST_F(DoctorTest, AMountPointIsNamed) {
    MakeDirs("/volume1/photos/disk");
    const Mount mount("disk", "/volume1/photos/disk", "tmpfs");
    ASSERT_TRUE(mount);
    EXPECT_EQ(RuleFor("/photos/disk"), "mount-point");
}

TEST_F(DoctorTest, AUserSpaceFileSystemIsNamed) {
    MakeDirs("/volume1/photos/fuse");
    const FuseServer server("/volume1/photos/fuse");
    if (!server.IsMounted()) {
        GTEST_SKIP() << "FUSE cannot be mounted here";
    }
    EXPECT_EQ(RuleFor("/photos/fuse"), "file-system-user-space");
}

std::string RuleWith(const std::string &setting) {
    PutFile(kFolders, R"({"/photos":{"photo":true}})");
    return OnOddSystem(setting, "folders")[0]["rule"].asString();
}

TEST_F(DoctorTest, EachRuleOfTheFileSystemIsNamed) {
    EXPECT_EQ(RuleWith("ODD_FS_TYPE=-1"), "file-system-unknown");
    EXPECT_EQ(RuleWith("ODD_FS_TYPE=32"), "file-system-remote");
    EXPECT_EQ(RuleWith("ODD_FS_TYPE=64"), "file-system-image");
    EXPECT_EQ(RuleWith("ODD_FS_TYPE=12"), "file-system-user-space");
    EXPECT_EQ(RuleWith("ODD_SHARE=1"), "share-unreadable");
}

TEST_F(DoctorTest, FoldersThatIndexNothingAreFound) {
    PutFile("/volume1/photos/a.jpg", "");
    Save(R"({"/photos":{},"/photos/a.jpg":{"photo":true}})");
    EXPECT_THAT(Problems("folders"), ElementsAre(IsFixable("warning", "folder-typeless"),
                                                 IsFixable("warning", "folder-file")));
}

TEST_F(DoctorTest, ANameCannotPlayTricksOnTheTerminalNorOnTheShell) {
    Save("{\"/a\\u001b[31m'\xff\":{\"photo\":true}}");
    const Json::Value problem = ProblemOf("folders");
    EXPECT_EQ(problem["subject"].asString(), "/a\x1b[31m'\xff"); // byte for byte
    EXPECT_THAT(problem["what"].asString(), StartsWith("/a\\x1b[31m'\\xff cannot"));
    EXPECT_EQ(problem["command"].asString(), "fileindexctl show $'/a\\x1b[31m\\'\\xff'");
    const std::string command = problem["command"].asString();
    PutFile("/tmp/say", "printf %s " + command.substr(command.find('$')));
    EXPECT_EQ(RunToEnd({"/bin/bash", "/tmp/say"}).out, "/a\x1b[31m'\xff");
    EXPECT_THAT(Doctor().out, Not(HasSubstr("\x1b")));
}

// --- daemon -------------------------------------------------------------------------------------

// A socket that is listened on, and nothing else.
class Listener {
  public:
    explicit Listener(int backlog) : fd_(::socket(AF_UNIX, SOCK_STREAM, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        std::string(kSocket).copy(address.sun_path, sizeof(address.sun_path) - 1);
        EXPECT_EQ(::bind(fd_, reinterpret_cast<sockaddr *>(&address), sizeof(address)), 0);
        EXPECT_EQ(::listen(fd_, backlog), 0);
    }
    Listener(const Listener &) = delete;
    Listener &operator=(const Listener &) = delete;
    ~Listener() { ::close(fd_); }

  private:
    int fd_;
};

TEST_F(DoctorTest, ADaemonThatDoesNotRunIsAnErrorOnceFoldersAreSet) {
    EXPECT_THAT(Problems("daemon"), IsEmpty());
    Save(kTwo);
    const Json::Value problem = ProblemOf("daemon");
    EXPECT_THAT(problem, IsFixable("error", "daemon-stopped"));
    EXPECT_THAT(problem["command"].asString(), HasSubstr("fileindexd"));
    Save("{");
    EXPECT_THAT(ProblemOf("daemon"), IsFixable("warning", "daemon-stopped"));
}

TEST_F(DoctorTest, ASocketThatWasLeftBehindIsNoDaemon) {
    Save(kTwo);
    { const Listener gone(1); }
    EXPECT_THAT(ProblemOf("daemon")["what"].asString(), HasSubstr("left behind"));
    RemoveTree(kSocket);
    PutFile(kSocket, "");
    EXPECT_THAT(ProblemOf("daemon"), IsFixable("error", "daemon-socket"));
}

TEST_F(DoctorTest, ADaemonThatTakesNoConnectionIsSilent) {
    Save(kTwo);
    const Listener deaf(1);
    const Json::Value problem = ProblemOf("daemon");
    EXPECT_THAT(problem, IsFixable("error", "daemon-silent"));
    EXPECT_EQ(problem["pid"].asInt(), ::getpid());
    EXPECT_THAT(problem["why"].asString(), StartsWith("doctor_test (PID "));
    // Connections that nobody took wait on; there is no room for more.
    (void)Doctor({"daemon"});
    (void)Doctor({"daemon"});
    EXPECT_THAT(ProblemOf("daemon")["why"].asString(), HasSubstr("Too many connections"));
}

TEST_F(DoctorTest, ADaemonThatASignalStoppedIsSilent) {
    MakeHealthy();
    daemon_->Signal(SIGSTOP);
    EXPECT_TRUE(Eventually([] { return Doctor({"daemon"}).status == kFailed; }));
    EXPECT_THAT(ProblemOf("daemon")["why"].asString(), HasSubstr("kill -CONT"));
    daemon_->Signal(SIGCONT);
    EXPECT_TRUE(Eventually([] { return Doctor({"daemon"}).status == kDone; }));
}

TEST_F(DoctorTest, TheDaemonIsToldNothing) {
    StartDaemon();
    EXPECT_THAT(Problems("daemon"), IsEmpty());
    EXPECT_THAT(Told(), ElementsAre("refused command: ends after 0 bytes"));
}

// --- queues -------------------------------------------------------------------------------------

TEST_F(DoctorTest, LinesThatAreNoEventsAreCounted) {
    PutFile(kPhotoQueue, EventLine("/volume1/photos") +
                             "{\n[]\n{\"event\":1}\n{\"path\":\"/x\"}\n" +
                             EventLine("/volume1/photos/a") + "half a li");
    const Json::Value problem = ProblemOf("queues");
    EXPECT_THAT(problem, IsFixable("warning", "queue-malformed"));
    EXPECT_EQ(problem["malformed"].asInt(), 5);
    EXPECT_EQ(problem["events"].asInt(), 2);
    EXPECT_EQ(problem["whole"].asBool(), true);
}

TEST_F(DoctorTest, AQueueThatGrewIsFoundByItsBytesAndByItsEvents) {
    const std::string small = R"({"event":2,"path":"/"})"
                              "\n";
    std::string many;
    for (int i = 0; i <= 100000; ++i) {
        many += small;
    }
    PutFile(kPhotoQueue, many);
    const Json::Value byEvents = ProblemOf("queues");
    EXPECT_THAT(byEvents, IsFixable("warning", "queue-long"));
    EXPECT_EQ(byEvents["events"].asInt(), 100001);
    PutFile(kPhotoQueue, EventLine("/volume1/photos/" + std::string(1 << 19, 'x')));
    EXPECT_THAT(Problems("queues"), IsEmpty());
    std::string large;
    for (int i = 0; i < 40; ++i) {
        large += EventLine("/volume1/photos/" + std::string(1 << 19, 'x'));
    }
    PutFile(kPhotoQueue, large);
    const Json::Value byBytes = ProblemOf("queues");
    EXPECT_THAT(byBytes, IsFixable("warning", "queue-long"));
    EXPECT_EQ(byBytes["bytes"].asUInt64(), large.size());
    EXPECT_EQ(byBytes["whole"].asBool(), false);
    EXPECT_THAT(byBytes["what"].asString(), HasSubstr("more than"));
}

TEST_F(DoctorTest, AQueueThatNobodyTakesOverIsOld) {
    PutFile(kPhotoQueue, EventLine("/volume1/photos"));
    MakeOlder(kPhotoQueue, 3500);
    EXPECT_THAT(Problems("queues"), IsEmpty());
    MakeOlder(kPhotoQueue, 3 * 3600);
    const Json::Value problem = ProblemOf("queues");
    EXPECT_THAT(problem, IsFixable("warning", "queue-old"));
    EXPECT_THAT(problem["what"].asString(), HasSubstr("has waited for 3 h"));
}

TEST_F(DoctorTest, AQueueThatGrowsAllTheTimeIsAsOldAsItsFile) {
    PutFile(kPhotoQueue, EventLine("/volume1/photos"));
    struct statx times {};
    ASSERT_EQ(::statx(AT_FDCWD, kPhotoQueue, 0, STATX_BTIME, &times), 0);
    if ((times.stx_mask & STATX_BTIME) == 0) {
        GTEST_SKIP() << "the file system does not tell when a file was made";
    }
    MakeOlder(kPhotoQueue, -3 * 3600); // the last event came just now, by the clock below
    const Json::Value problems = OnOddSystem("ODD_SECONDS=10800", "queues");
    ASSERT_EQ(problems.size(), 1U);
    EXPECT_THAT(problems[0], IsFixable("warning", "queue-old"));
}

TEST_F(DoctorTest, TheQueueThatTheDaemonTookOverMayTakeADay) {
    const std::string taken = std::string(kPhotoQueue) + ".tmp";
    PutFile(taken, EventLine("/volume1/photos"));
    MakeOlder(taken, 20 * 3600);
    EXPECT_THAT(Problems("queues"), IsEmpty());
    MakeOlder(taken, 49 * 3600);
    EXPECT_THAT(ProblemOf("queues")["what"].asString(), HasSubstr("has waited for 2 days"));
}

TEST_F(DoctorTest, WhileIndexingIsPausedAnOldQueueIsNoProblem) {
    PutFile(kPhotoQueue, EventLine("/volume1/photos"));
    MakeOlder(kPhotoQueue, 3 * 3600);
    PutFile(kStatus, R"({"resume_time":0})");
    EXPECT_THAT(Problems("queues"), IsEmpty());
    PutFile(kStatus, R"({"resume_time":)" + std::to_string(std::time(nullptr) + 60) + "}");
    EXPECT_THAT(Problems("queues"), IsEmpty());
    PutFile(kStatus, R"({"resume_time":1})"); // over
    EXPECT_THAT(Problems("queues"), SizeIs(1));
}

TEST_F(DoctorTest, WhatIsNoQueueIsNamed) {
    MakeDirs("/volume1/photos/@eaDir");
    ASSERT_EQ(::mkfifo(kPhotoQueue, 0644), 0);
    EXPECT_THAT(ProblemOf("queues"), IsFixable("error", "queue-kind"));
    RemoveTree(kPhotoQueue);
    ASSERT_EQ(::symlink("/etc/passwd", kPhotoQueue), 0);
    EXPECT_THAT(ProblemOf("queues")["what"].asString(), HasSubstr("is a symbolic link"));
}

// Users can put a link there; where it leads is nobody's business.
TEST_F(DoctorTest, ALinkInThePlaceOfTheQueuesDirectoryIsNotFollowed) {
    const std::string secret = "/tmp/secret/VANO@file_index_queue";
    PutFile(secret, "no event\n");
    ASSERT_EQ(::symlink("/tmp/secret", "/volume1/photos/@eaDir"), 0);
    const Json::Value problem = ProblemOf("queues");
    EXPECT_THAT(problem, IsFixable("error", "queue-kind"));
    EXPECT_EQ(problem["what"].asString(), "/volume1/photos/@eaDir is a symbolic link");
    const HoldLock lock(secret);
    EXPECT_THAT(Problems("locks"), IsEmpty());
}

// --- monitor ------------------------------------------------------------------------------------

std::string MonitorFileOf(const std::string &share) {
    for (const std::string &name : NamesIn(kMonitors)) {
        const std::string file = std::string(kMonitors) + "/" + name;
        if (ReadText(file).find("/" + share + "/@eaDir/") != std::string::npos) {
            return file;
        }
    }
    ADD_FAILURE() << "no configuration of " << share;
    return {};
}

TEST_F(DoctorTest, AShareThatIsNotWatchedIsFound) {
    MakeHealthy();
    RemoveTree(MonitorFileOf("media"));
    const Json::Value problem = ProblemOf("monitor");
    EXPECT_THAT(problem, IsFixable("error", "monitor-missing"));
    EXPECT_EQ(problem["subject"].asString(), "media");
    EXPECT_EQ(problem["command"].asString(), "fileindexctl share resume media");
    RemoveTree(kMonitors);
    EXPECT_THAT(Problems("monitor"), SizeIs(2));
}

TEST_F(DoctorTest, AMonitorThatWatchesOtherFoldersIsFound) {
    MakeHealthy();
    Save(R"({"/photos/2016":{"photo":true},"/media/films":{"video":true}})");
    const Json::Value problem = ProblemOf("monitor");
    EXPECT_THAT(problem, IsFixable("error", "monitor-differs"));
    EXPECT_EQ(problem["why"].asString(),
              "Not watched: /volume1/photos/2016. Watched needlessly: /volume1/photos.");
}

TEST_F(DoctorTest, AMonitorThatWatchesForNobodyIsFound) {
    MakeHealthy();
    Save(R"({"/photos":{"photo":true}})");
    const std::string file = MonitorFileOf("media");
    const Json::Value problem = ProblemOf("monitor");
    EXPECT_THAT(problem, IsFixable("warning", "monitor-surplus"));
    EXPECT_EQ(problem["command"].asString(), "rm " + file);
    EXPECT_EQ(problem["queue"].asString(), kMediaQueue);
}

TEST_F(DoctorTest, AMonitorConfigurationThatIsBrokenIsFoundAtItsPlace) {
    MakeHealthy();
    const std::string file = MonitorFileOf("media");
    PutFile(file, "{\"config\":[}");
    const std::vector<Json::Value> problems = Problems("monitor");
    ASSERT_THAT(problems, ElementsAre(IsFixable("error", "monitor-malformed"),
                                      IsFixable("error", "monitor-missing")));
    EXPECT_EQ(problems[0]["column"].asInt(), 12);
    PutFile(file, "[]");
    EXPECT_THAT(Problems("monitor"), ElementsAre(IsFixable("error", "monitor-shape"),
                                                 IsFixable("error", "monitor-missing")));
}

TEST_F(DoctorTest, ConfigurationsOfOtherConsumersAreTheirOwn) {
    MakeHealthy();
    PutFile(std::string(kMonitors) + "/backup-x.json", "{");
    EXPECT_THAT(Problems("monitor"), IsEmpty());
}

// --- Spotlight ----------------------------------------------------------------------------------

TEST_F(DoctorTest, SpotlightThatIsOffIsFoundOnceFoldersAreSet) {
    if (!Exists(kTestparm)) {
        GTEST_SKIP() << "no testparm: Spotlight cannot be asked for";
    }
    PutFile(kSamba, "[global]\nspotlight = no\n");
    EXPECT_THAT(Problems("spotlight"), IsEmpty());
    Save(kTwo);
    EXPECT_THAT(ProblemOf("spotlight"), IsFixable("warning", "spotlight-off"));
    PutFile(kSamba, "[global]\nspotlight = yes\n");
    EXPECT_THAT(Problems("spotlight"), IsEmpty());
    RemoveTree(kSamba);
    EXPECT_THAT(ProblemOf("spotlight"), IsFixable("warning", "spotlight-unknown"));
}

// --- room ---------------------------------------------------------------------------------------

TEST_F(DoctorTest, FullAndNearlyFullSharesAreFound) {
    Save(kTwo);
    {
        const Mount full("tiny", "/volume1/photos", "tmpfs", 0, "size=5m");
        ASSERT_TRUE(full);
        const Json::Value problem = ProblemOf("room");
        EXPECT_THAT(problem, IsFixable("error", "share-full"));
        EXPECT_EQ(problem["size"].asInt(), 5 << 20);
    }
    const Mount small("tiny", "/volume1/photos", "tmpfs", 0, "size=50m");
    ASSERT_TRUE(small);
    const Json::Value problem = ProblemOf("room");
    EXPECT_THAT(problem, IsFixable("warning", "share-nearly-full"));
    EXPECT_THAT(problem["what"].asString(), HasSubstr("50 MiB of 50 MiB left"));
}

TEST_F(DoctorTest, SharesThatAreMarkedAreFoundWithTheWayOn) {
    Save(kTwo);
    PutFile(kStatus, R"({"no_space":{"photos":true},"need_reindex":{"media":true}})");
    const std::vector<Json::Value> problems = Problems("room");
    ASSERT_THAT(problems,
                ElementsAre(Is("warning", "mark-need-reindex"), Is("error", "mark-no-space")));
    EXPECT_EQ(problems[0]["command"].asString(), "fileindexctl reindex /media/films");
    EXPECT_EQ(problems[1]["command"].asString(), "fileindexctl reindex /photos");
    EXPECT_THAT(problems[1]["why"].asString(), HasSubstr("There is room again"));
}

// --- users and screens --------------------------------------------------------------------------

TEST_F(DoctorTest, WhatOnlyRootCanSeeIsUnknownAndNoError) {
    if (CtlAsNobody({"--help"}).status != kDone) {
        GTEST_SKIP() << "no other user can run the program here";
    }
    MakeHealthy();
    PutFile(kStatus, "{}");
    PutFile(kPhotoQueue, EventLine("/volume1/photos"));
    MakeDirs("/volume2/media/films");
    ASSERT_EQ(::chmod(kStatus, 0600), 0);
    ASSERT_EQ(::chmod(kSocket, 0600), 0);
    ASSERT_EQ(::chmod("/volume1/photos", 0700), 0);
    ASSERT_EQ(::chmod("/volume2/media", 0700), 0);
    const Outcome settings = CtlAsNobody({"doctor", "settings"});
    EXPECT_EQ(settings.status, kDone);
    EXPECT_THAT(settings.out,
                AllOf(HasSubstr("  unknown  /usr/vano/etc/fileindex/status.conf can be checked "
                                "by root only\n"),
                      HasSubstr("sudo fileindexctl doctor\n")));
    const Outcome all = CtlAsNobody({"doctor", "--quiet", "--json"});
    EXPECT_EQ(all.status, kDone) << all.out;
    std::vector<std::string> unknown;
    const Json::Value findings = FindingsIn(all);
    for (const Json::Value &finding : findings) {
        if (finding["severity"] == "unknown") {
            EXPECT_EQ(finding["code"].asString(), "needs-root");
            unknown.push_back(finding["subject"].asString());
        }
    }
    EXPECT_THAT(unknown, ElementsAre(kStatus, "/volume2/media/films", "/var/run/fileindexd.sock",
                                     kMediaQueue, kMediaQueue + ".tmp", kPhotoQueue,
                                     std::string(kPhotoQueue) + ".tmp"));
}

TEST_F(DoctorTest, WhatCannotBeReachedIsNamed) {
    Save(kPhotos);
    const std::tuple<const char *, const char *, const char *> rows[] = {
        {"ODD_UNREACHABLE=/usr/vano/etc/fileindex", "settings", "settings-directory-unreadable"},
        {"ODD_UNREACHABLE=/volume1/photos", "shares", "share-unreachable"},
        {"ODD_READ_ERROR=5", "queues", "queue-unreadable"},
    };
    PutFile(kPhotoQueue, EventLine("/volume1/photos"));
    for (const auto &[setting, check, code] : rows) {
        const Json::Value problems = OnOddSystem(setting, check);
        ASSERT_EQ(problems.size(), 1U) << code;
        EXPECT_THAT(problems[0], IsFixable("error", code));
        EXPECT_THAT(problems[0]["what"].asString(), HasSubstr(" cannot be read: ")) << code;
    }
}

TEST_F(DoctorTest, WhatCannotBeReadIsNamed) {
    RemoveTree(kShares);
    MakeDirs(kShares);
    EXPECT_THAT(ProblemOf("shares"), IsFixable("error", "share-table-unreadable"));
    PutFile(kMonitors, "");
    EXPECT_THAT(ProblemOf("monitor"), IsFixable("error", "monitor-unreadable"));
    ASSERT_EQ(::symlink("fileindexd.sock", kSocket), 0); // leads to itself
    EXPECT_THAT(ProblemOf("daemon"), IsFixable("error", "daemon-unreachable"));
}

// The answers that a provider need not give are taken out of this one, by other names.
TEST_F(DoctorTest, OfAProviderThatTellsNothingOfItselfNothingIsWrong) {
    MakeHealthy();
    std::string provider = ReadText(PROVIDER_PATH);
    for (const char *name : {"ListShares", "ListMonitorWatches", "ServiceCommand"}) {
        for (std::size_t at = 0; (at = provider.find(name, at)) != std::string::npos; ++at) {
            provider[at] = 'X';
        }
    }
    PutFile("/tmp/bare/libvanoplatform.so.1", provider);
    const auto doctor = [] {
        return RunToEnd({"/usr/bin/env", "LD_LIBRARY_PATH=/tmp/bare", FILEINDEXCTL_PATH, "doctor",
                         "shares", "monitor", "daemon", "--quiet", "--json"});
    };
    const Json::Value healthy = Json(doctor().out);
    EXPECT_EQ(healthy["errors"].asInt() + healthy["warnings"].asInt(), 0);
    EXPECT_EQ(healthy["findings"][0]["code"], "shares-unlisted");
    EXPECT_EQ(healthy["findings"][1]["code"], "monitor-unknown");
    daemon_.reset();
    EXPECT_EQ(FindingsIn(doctor())[2]["command"], ""); // nobody knows how to start it
}

TEST_F(DoctorTest, WhatDependsOnBrokenSettingsIsUnknown) {
    Save("{");
    EXPECT_THAT(ProblemOf("folders"), Is("unknown", "folders-unknown"));
    EXPECT_THAT(ProblemOf("monitor"), Is("unknown", "folders-unknown"));
}

std::string OnTerminal(const std::string &settings) {
    return RunToEnd({"/usr/bin/script", "--quiet", "--return", "--command",
                     "stty columns 60; env " + settings + " " FILEINDEXCTL_PATH " doctor settings",
                     "/dev/null"})
        .out;
}

TEST_F(DoctorTest, OnATerminalLinesFitAndMarksAreColoured) {
    PutFile(kStatus, "{");
    EXPECT_EQ(OnTerminal("TERM=xterm NO_COLOR=1"),
              "Settings\r\n"
              "  ok       No folder.conf yet: no folder is set\r\n"
              "  error    /usr/vano/etc/fileindex/status.conf is not JSON:\r\n"
              "           line 1, column 2\r\n"
              "           Missing '}' or object member name\r\n"
              "           Fix it by hand, or restore it from a backup.\r\n"
              "           Moved away, it counts as empty.\r\n"
              "             editor /usr/vano/etc/fileindex/status.conf\r\n"
              "\r\n"
              "1 error.\r\n");
    ASSERT_EQ(::chmod(kStatus, 0666), 0); // a warning
    EXPECT_THAT(OnTerminal("TERM=xterm"),
                AllOf(Not(HasSubstr("\033[33m")), HasSubstr("\033[1mwarning\033[0m"),
                      HasSubstr("\033[1mSettings\033[0m"), HasSubstr("\033[32mok     \033[0m"),
                      HasSubstr("\033[31merror  \033[0m")));
}

} // namespace
} // namespace VANO::TESTS
