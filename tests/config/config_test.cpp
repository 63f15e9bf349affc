#include <fileindex/config.h>

#include <cerrno>
#include <fcntl.h>
#include <stdexcept>
#include <sys/file.h>
#include <sys/stat.h>
#include <type_traits>
#include <unistd.h>

#include "support/fixture.h"
#include "support/mounts.h"

namespace VANO::TESTS {

namespace {

const int g_logLevelAtStart = LOG_LEVEL;

constexpr char kFile[] = "/volume1/settings.conf";
constexpr char kLock[] = "/volume1/settings.lock";
constexpr char kLoadFailed[] = "config:22 Failed to load json from /volume1/settings.conf";
constexpr char kSaveFailed[] = "config:38 Failed to save json to /volume1/settings.conf";
constexpr char kChmodFailed[] = "config:43 chmod failed, path=/volume1/settings.conf";
constexpr char kLockFailed[] = "config:74 Failed to lock folder";

static_assert(std::is_abstract_v<Config> && std::has_virtual_destructor_v<Config>);

// The least that a settings file is.
class Settings : public Config {
  public:
    explicit Settings(std::string path = kFile, std::string lockPath = kLock)
        : path_(std::move(path)), lockPath_(std::move(lockPath)) {}
    bool Load() override { return LoadJson(); }
    bool Save() override { return SaveJson(); }
    std::string GetLockPath() const override { return lockPath_; }
    std::string GetPath() const override { return path_; }

  private:
    std::string path_;
    std::string lockPath_;
};

class ConfigTest : public LibraryTest {};

TEST_F(ConfigTest, TheLogLevelIsThreeAtLoadTimeAndOneVariableUnderBothNames) {
    EXPECT_EQ(g_logLevelAtStart, 3);
    EXPECT_EQ(&::LOG_LEVEL, &VANO::FILEINDEX::LOG_LEVEL);
}

TEST_F(ConfigTest, ANewObjectIsAnUnlockedEmptyObject) {
    const Settings settings;
    EXPECT_EQ(settings.root, Json::Value(Json::objectValue));
    EXPECT_EQ(settings.lock_fd, -1);
}

// --- loading ---

TEST_F(ConfigTest, AMissingFileLoadsAndLeavesTheDocumentAsItIs) {
    Settings settings;
    EXPECT_TRUE(settings.LoadJson());
    EXPECT_EQ(settings.root, Json("{}"));
    settings.root = Json(R"({"kept":1})");
    EXPECT_TRUE(settings.LoadJson());
    EXPECT_EQ(settings.root, Json(R"({"kept":1})"));
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_FALSE(Exists(kFile));
}

TEST_F(ConfigTest, AFileInAMissingDirectoryIsAMissingFile) {
    PutFile("/volume1/file", "");
    for (const char *path : {"/volume1/none/settings.conf", "/volume1/file/settings.conf"}) {
        Settings settings(path);
        EXPECT_TRUE(settings.LoadJson()) << path;
        ExpectError(FILEINDEX_ERR_NONE);
    }
}

TEST_F(ConfigTest, AFileThatCannotBeLookedAtIsNoMissingFile) {
    PutFile(kFile, "{}");
    Fault::FailAlways(Call::Lstat, EACCES);
    Fault::FailPath(Call::Open, kFile, EACCES);
    Settings settings;
    EXPECT_FALSE(settings.LoadJson());
    ExpectError(FILEINDEX_ERR_LOAD);
    ExpectLog({kLoadFailed});
}

TEST_F(ConfigTest, AnyJsonValueLoadsAndReplacesTheDocument) {
    for (const char *text : {R"({"a":{"b":[1]}})", "[]", "12", "null", R"("text")", " {} \n"}) {
        PutFile(kFile, text);
        Settings settings;
        settings.root = Json(R"({"before":1})");
        EXPECT_TRUE(settings.LoadJson()) << text;
        EXPECT_EQ(settings.root, Json(text));
    }
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ConfigTest, LoadingTakesNoLockAndNeedsNone) {
    PutFile(kFile, R"({"a":1})");
    const HoldLock lock(kLock);
    Settings settings;
    Fault::Count(Call::Flock);
    EXPECT_TRUE(settings.LoadJson());
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
}

struct TextRow {
    const char *what;
    std::string text;
};

void PrintTo(const TextRow &row, std::ostream *out) {
    *out << row.what;
}

class ConfigBadTextTest : public ConfigTest, public ::testing::WithParamInterface<TextRow> {};

TEST_P(ConfigBadTextTest, FailsToLoadAndTheDocumentStays) {
    PutFile(kFile, GetParam().text);
    Settings settings;
    settings.root = Json(R"({"kept":1})");
    EXPECT_FALSE(settings.LoadJson());
    EXPECT_EQ(settings.root, Json(R"({"kept":1})"));
    ExpectError(FILEINDEX_ERR_LOAD);
    ExpectLog({kLoadFailed});
}

INSTANTIATE_TEST_SUITE_P(
    Texts, ConfigBadTextTest,
    ::testing::Values(TextRow{"Empty", ""}, TextRow{"Blank", "\n"}, TextRow{"NoJson", "hello"},
                      TextRow{"Truncated", R"({"a":{"b")"}, TextRow{"TextAfter", "{} x"},
                      TextRow{"SecondValue", "{}\n{}"},
                      TextRow{"ZeroBytesAfter", std::string("{}\0\0\0\0", 6)},
                      TextRow{"Comment", "{ /* c */ }"}, TextRow{"LineComment", "// c\n{}"},
                      TextRow{"TrailingComma", R"({"a":1,})"},
                      TextRow{"TooDeep", std::string(100000, '[') + std::string(100000, ']')}),
    RowName());

TEST_F(ConfigTest, WhatIsNoRegularFileFailsToLoad) {
    const auto expectFailure = [&](const char *what) {
        Settings settings;
        EXPECT_FALSE(settings.LoadJson()) << what;
        ExpectError(FILEINDEX_ERR_LOAD);
        ExpectLog({kLoadFailed});
        RemoveTree(kFile);
    };
    MakeDirs(kFile);
    expectFailure("directory");
    ASSERT_EQ(::mkfifo(kFile, 0600), 0);
    expectFailure("FIFO");
    ASSERT_EQ(::symlink("/volume1/none", kFile), 0);
    expectFailure("dangling link");
    ASSERT_EQ(::symlink(kFile, kFile), 0);
    expectFailure("link to itself");
}

TEST_F(ConfigTest, AFileThatCannotBeReadFailsToLoad) {
    PutFile(kFile, "{}");
    for (const auto &[call, error] : {std::pair(Call::Open, EACCES), std::pair(Call::Read, EIO)}) {
        Fault::FailPath(call, kFile, error);
        Settings settings;
        EXPECT_FALSE(settings.LoadJson());
        Fault::Reset();
        ExpectError(FILEINDEX_ERR_LOAD);
        ExpectLog({kLoadFailed});
    }
}

TEST_F(ConfigTest, TheMessageHoldsThePathByteForByte) {
    for (const std::string &path :
         {std::string("/volume1/caf\xe9%s%n\xff"), std::string("/volume1/a\nb"),
          "/volume1/" + std::string(200, 'd')}) {
        PutFile(path, "");
        Settings settings(path);
        EXPECT_FALSE(settings.LoadJson());
        ExpectLog({"config:22 Failed to load json from " + path});
    }
}

TEST_F(ConfigTest, APathBeyondTheSystemsLimitIsAnAnswerAndNoCrash) {
    const std::string path = "/volume1/" + std::string(5000, 'a');
    Settings settings(path);
    EXPECT_FALSE(settings.SaveJson());
    ExpectError(FILEINDEX_ERR_SAVE);
    ExpectLog({"config:38 Failed to save json to " + path});
}

TEST_F(ConfigTest, TheLogLevelChangesNoMessage) {
    PutFile(kFile, "");
    for (const int level : {0, 3, 6, 7, 8, -1}) {
        LOG_LEVEL = level;
        Settings settings(kFile, "/volume1/none/lock");
        EXPECT_FALSE(settings.LoadJson());
        EXPECT_FALSE(settings.Lock(true));
        Fault::FailAlways(Call::Chmod, EPERM);
        EXPECT_TRUE(settings.SaveJson());
        Fault::FailAlways(Call::Open, EMFILE);
        EXPECT_FALSE(settings.SaveJson());
        Fault::Reset();
        PutFile(kFile, "");
        ExpectLog({kLoadFailed, kLockFailed, kChmodFailed, kSaveFailed});
    }
}

TEST_F(ConfigTest, ASuccessKeepsTheLastError) {
    ErrorHandler::SetError(FILEINDEX_ERR_FOLDER_LIMIT);
    Settings settings;
    EXPECT_TRUE(settings.Lock(true));
    EXPECT_TRUE(settings.LoadJson()); // no file yet
    EXPECT_TRUE(settings.SaveJson());
    EXPECT_TRUE(settings.LoadJson());
    settings.Unlock();
    ExpectError(FILEINDEX_ERR_FOLDER_LIMIT);
}

TEST_F(ConfigTest, AnExceptionPassesThrough) {
    class Nameless : public Settings {
      public:
        std::string GetLockPath() const override { throw std::runtime_error("no lock"); }
        std::string GetPath() const override { throw std::runtime_error("no path"); }
    };
    Nameless settings;
    EXPECT_THROW(settings.LoadJson(), std::runtime_error);
    EXPECT_THROW(settings.SaveJson(), std::runtime_error);
    EXPECT_THROW(settings.Lock(true), std::runtime_error);
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({});
}

// --- saving ---

TEST_F(ConfigTest, TheDocumentIsSavedWithMode0644) {
    const mode_t umaskBefore = ::umask(077);
    Settings settings;
    settings.root = Json(R"({"a":[1,"x\ny"]})");
    EXPECT_TRUE(settings.SaveJson());
    ::umask(umaskBefore);
    EXPECT_EQ(ReadJson(kFile), settings.root);
    EXPECT_EQ(ModeOf(kFile), 0644U);
}

TEST_F(ConfigTest, AnExistingFileGetsMode0644) {
    for (const mode_t mode : {0600U, 0666U, 0400U}) {
        PutFile(kFile, "{}");
        ASSERT_EQ(::chmod(kFile, mode), 0);
        Settings settings;
        EXPECT_TRUE(settings.SaveJson());
        EXPECT_EQ(ModeOf(kFile), 0644U);
    }
}

TEST_F(ConfigTest, WhatWasSavedLoads) {
    Settings saved;
    saved.root = Json(R"({"/caf":{"name":"\u00e9","n":12345678901}})");
    saved.root["/\xff\xfe"] = "bytes";
    EXPECT_TRUE(saved.SaveJson());
    Settings loaded;
    EXPECT_TRUE(loaded.LoadJson());
    EXPECT_EQ(loaded.root, saved.root);
}

TEST_F(ConfigTest, AModeThatCannotBeSetIsLoggedAndTheFileCountsAsSaved) {
    Settings settings;
    settings.root = Json(R"({"a":1})");
    Fault::FailAlways(Call::Chmod, EPERM);
    EXPECT_TRUE(settings.SaveJson());
    ASSERT_EQ(Fault::Calls(Call::Chmod), 1U);
    EXPECT_EQ(Fault::Log(Call::Chmod)[0].path, kFile);
    EXPECT_EQ(Fault::Log(Call::Chmod)[0].number, 0644);
    EXPECT_EQ(ReadJson(kFile), settings.root);
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({kChmodFailed});
}

TEST_F(ConfigTest, AFailedSaveKeepsTheDocumentAndTheOldFile) {
    const Mount volume = TinyVolume("/volume2/tiny", 32 * 1024);
    ASSERT_TRUE(volume);
    const std::string path = "/volume2/tiny/settings.conf";
    PutFile(path, R"({"old":1})");
    Settings settings(path);
    settings.root["new"] = std::string(64 * 1024, 'x');
    const Json::Value before = settings.root;
    Fault::Count(Call::Chmod);
    EXPECT_FALSE(settings.SaveJson());
    EXPECT_EQ(Fault::Calls(Call::Chmod), 0U);
    EXPECT_EQ(settings.root, before);
    EXPECT_EQ(ReadText(path), R"({"old":1})");
    EXPECT_THAT(NamesIn("/volume2/tiny"), ElementsAre("settings.conf"));
    ExpectError(FILEINDEX_ERR_SAVE);
    ExpectLog({"config:38 Failed to save json to " + path});
}

TEST_F(ConfigTest, AFileThatCannotBeCreatedFailsToSave) {
    for (const std::string &path : {std::string("/volume1/none/settings.conf"),
                                    std::string("/volume1"), std::string("/dev/full")}) {
        Settings settings(path);
        EXPECT_FALSE(settings.SaveJson()) << path;
        ExpectError(FILEINDEX_ERR_SAVE);
        ExpectLog({"config:38 Failed to save json to " + path});
    }
    EXPECT_FALSE(Exists("/volume1/none"));
}

TEST_F(ConfigTest, AnUnlockedReaderNeverMeetsHalfAText) {
    PutFile(kFile, R"({"a":1})");
    const int fd = ::open(kFile, O_RDONLY);
    Settings settings;
    settings.root = Json(R"({"b":2})");
    EXPECT_TRUE(settings.SaveJson());
    char buffer[64] = "";
    EXPECT_EQ(::read(fd, buffer, sizeof(buffer)), 7);
    EXPECT_STREQ(buffer, R"({"a":1})");
    ::close(fd);
}

// --- locking ---

TEST_F(ConfigTest, TheLockFileIsCreatedWithMode0644AndStays) {
    const mode_t umaskBefore = ::umask(0);
    Settings settings;
    EXPECT_TRUE(settings.Lock(true));
    ::umask(umaskBefore);
    EXPECT_GE(settings.lock_fd, 0);
    EXPECT_TRUE(IsLocked(kLock));
    EXPECT_EQ(ModeOf(kLock), 0644U);
    settings.Unlock();
    EXPECT_FALSE(IsLocked(kLock));
    EXPECT_TRUE(Exists(kLock));
}

TEST_F(ConfigTest, AFreeLockIsTakenAtTheFirstAttempt) {
    for (const bool exclusive : {true, false}) {
        Fault::Reset();
        for (const Call call : {Call::Open, Call::Flock, Call::Usleep}) {
            Fault::Count(call);
        }
        Settings settings;
        EXPECT_TRUE(settings.Lock(exclusive));
        ASSERT_EQ(Fault::Calls(Call::Open), 1U);
        EXPECT_EQ(Fault::Log(Call::Open)[0].path, kLock);
        EXPECT_EQ(Fault::Log(Call::Open)[0].number & (O_ACCMODE | O_CREAT | O_TRUNC | O_EXCL),
                  O_RDWR | O_CREAT);
        ASSERT_EQ(Fault::Calls(Call::Flock), 1U);
        EXPECT_EQ(Fault::Log(Call::Flock)[0].number, (exclusive ? LOCK_EX : LOCK_SH) | LOCK_NB);
        EXPECT_EQ(Fault::Calls(Call::Usleep), 0U);
        EXPECT_EQ(::fcntl(settings.lock_fd, F_GETFD), FD_CLOEXEC)
            << "a program that the caller starts would keep the lock";
        settings.Unlock();
    }
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(ConfigTest, TheLocksContentIsLeftAlone) {
    PutFile(kLock, "content");
    Settings settings;
    EXPECT_TRUE(settings.Lock(true));
    settings.Unlock();
    EXPECT_EQ(ReadText(kLock), "content");
}

class ConfigContentionTest : public ConfigTest, public ::testing::WithParamInterface<bool> {};

TEST_P(ConfigContentionTest, ALockedFileIsTriedThreeTimesWithASleepAfterEach) {
    const HoldLock lock(kLock);
    Fault::Return(Call::Rand, {17, 9, 20});
    Fault::Quiet(Call::Usleep);
    for (const Call call : {Call::Open, Call::Flock, Call::Rand, Call::Usleep}) {
        Fault::Record(call);
    }
    Settings settings;
    EXPECT_FALSE(settings.Lock(GetParam()));
    const std::string open = "open(" + std::string(kLock) + ", " +
                             std::to_string(Fault::Log(Call::Open)[0].number) + ")";
    const std::string flock = "flock(" + std::string(kLock) + ", " +
                              std::to_string((GetParam() ? LOCK_EX : LOCK_SH) | LOCK_NB) + ")";
    EXPECT_THAT(Effects(), ElementsAre(open, flock, "rand()", "usleep(7000)", open, flock, "rand()",
                                       "usleep(9000)", open, flock, "rand()", "usleep(0)",
                                       std::string("log: ") + kLockFailed));
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({kLockFailed});
    ExpectLeakedDescriptors(3);
}

TEST_P(ConfigContentionTest, AnInterruptedAttemptIsRepeated) {
    Fault::FailWhen(Call::Flock, EINTR,
                    [calls = 0](const CallInfo &) mutable { return ++calls < 3; });
    Fault::Quiet(Call::Usleep);
    Settings settings;
    EXPECT_TRUE(settings.Lock(GetParam()));
    EXPECT_EQ(Fault::Calls(Call::Flock), 3U);
    EXPECT_EQ(Fault::Calls(Call::Usleep), 2U);
    EXPECT_TRUE(IsLocked(kLock));
    Fault::Reset();
    settings.Unlock();
    EXPECT_FALSE(IsLocked(kLock));
    ExpectLeakedDescriptors(2);
}

TEST_P(ConfigContentionTest, AnotherLockErrorEndsItAtOnce) {
    Fault::FailAlways(Call::Flock, ENOLCK);
    Fault::Count(Call::Usleep);
    Settings settings;
    EXPECT_FALSE(settings.Lock(GetParam()));
    EXPECT_EQ(Fault::Calls(Call::Flock), 1U);
    EXPECT_EQ(Fault::Calls(Call::Usleep), 0U);
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({kLockFailed});
    ExpectLeakedDescriptors(1);
}

TEST_P(ConfigContentionTest, ALockFileThatCannotBeOpenedEndsItAtOnce) {
    for (const char *path : {"/volume1/none/lock", "/volume1"}) {
        Fault::Reset();
        for (const Call call : {Call::Open, Call::Flock, Call::Usleep}) {
            Fault::Count(call);
        }
        Settings settings(kFile, path);
        EXPECT_FALSE(settings.Lock(GetParam())) << path;
        EXPECT_LT(settings.lock_fd, 0);
        EXPECT_EQ(Fault::Calls(Call::Open), 1U);
        EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
        EXPECT_EQ(Fault::Calls(Call::Usleep), 0U);
        settings.Unlock();
        ExpectError(FILEINDEX_ERR_LOCK);
        ExpectLog({kLockFailed});
    }
}

TEST_P(ConfigContentionTest, AnInterruptedOpenIsNotRepeated) {
    for (const int error : {EINTR, EAGAIN}) {
        Fault::Reset();
        Fault::FailPath(Call::Open, kLock, error);
        Fault::Count(Call::Usleep);
        Settings settings;
        EXPECT_FALSE(settings.Lock(GetParam())) << error;
        EXPECT_EQ(Fault::Calls(Call::Open), 1U);
        EXPECT_EQ(Fault::Calls(Call::Usleep), 0U);
        ExpectError(FILEINDEX_ERR_LOCK);
        ExpectLog({kLockFailed});
    }
}

TEST_P(ConfigContentionTest, AFailedLockKeepsTheDocument) {
    const HoldLock lock(kLock);
    Fault::Quiet(Call::Usleep);
    Settings settings;
    settings.root = Json(R"({"kept":1})");
    EXPECT_FALSE(settings.Lock(GetParam()));
    EXPECT_EQ(settings.root, Json(R"({"kept":1})"));
    EXPECT_GE(settings.lock_fd, 0); // of the last attempt
    ExpectLog({kLockFailed});
    settings.Unlock();
    EXPECT_TRUE(IsLocked(kLock)); // the other's
    ExpectLeakedDescriptors(2);
}

TEST_P(ConfigContentionTest, AnOpenThatFailsAtALaterAttemptEndsItThere) {
    const HoldLock lock(kLock);
    Fault::Fail(Call::Open, EMFILE, 2);
    Fault::Quiet(Call::Usleep);
    Settings settings;
    EXPECT_FALSE(settings.Lock(GetParam()));
    EXPECT_EQ(settings.lock_fd, -1);
    EXPECT_EQ(Fault::Calls(Call::Open), 2U);
    EXPECT_EQ(Fault::Calls(Call::Usleep), 1U);
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({kLockFailed});
    ExpectLeakedDescriptors(1);
}

INSTANTIATE_TEST_SUITE_P(Both, ConfigContentionTest, ::testing::Bool(), [](const auto &row) {
    return std::string(row.param ? "Exclusive" : "Shared");
});

TEST_F(ConfigTest, ALockThatBecomesFreeIsTakenAtTheNextAttempt) {
    auto lock = std::make_unique<HoldLock>(kLock);
    Fault::On(Call::Usleep, [&](CallInfo &) {
        lock.reset();
        return 0;
    });
    Settings settings;
    EXPECT_TRUE(settings.Lock(true));
    EXPECT_EQ(Fault::Calls(Call::Usleep), 1U);
    Fault::Reset();
    settings.Unlock();
    EXPECT_FALSE(IsLocked(kLock));
    ExpectLeakedDescriptors(1);
}

TEST_F(ConfigTest, SharedLocksCoexistAndKeepAnExclusiveOneOut) {
    Fault::Quiet(Call::Usleep);
    Settings one;
    Settings two;
    Settings three;
    EXPECT_TRUE(one.Lock(false));
    EXPECT_TRUE(two.Lock(false));
    EXPECT_FALSE(three.Lock(true));
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({kLockFailed});
    one.Unlock();
    two.Unlock();
    three.Unlock();
    ExpectLeakedDescriptors(2); // of the failed attempts but the last
}

TEST_F(ConfigTest, TwoObjectsOfOneProcessExcludeEachOther) {
    Fault::Quiet(Call::Usleep);
    Settings one;
    Settings two;
    EXPECT_TRUE(one.Lock(true));
    EXPECT_FALSE(two.Lock(false));
    ExpectLog({kLockFailed});
    one.Unlock();
    Settings three;
    EXPECT_TRUE(three.Lock(true));
    three.Unlock();
    ExpectLeakedDescriptors(3);
}

TEST_F(ConfigTest, UnlockingReleasesThenClosesAndKeepsTheNumber) {
    Settings settings;
    EXPECT_TRUE(settings.Lock(true));
    const int fd = settings.lock_fd;
    Fault::Record(Call::Flock);
    Fault::Record(Call::Close);
    settings.Unlock();
    const std::vector<std::string> effects = Effects();
    Fault::Reset();
    EXPECT_THAT(effects,
                ElementsAre("flock(/volume1/settings.lock, 8)", "close(/volume1/settings.lock)"));
    EXPECT_EQ(settings.lock_fd, fd);
}

TEST_F(ConfigTest, UnlockingAgainRepeatsBothCallsOnTheOldNumber) {
    Settings settings;
    EXPECT_TRUE(settings.Lock(true));
    const int fd = settings.lock_fd;
    settings.Unlock();
    Fault::Count(Call::Flock);
    Fault::Count(Call::Close);
    settings.Unlock();
    ASSERT_EQ(Fault::Calls(Call::Flock), 1U);
    EXPECT_EQ(Fault::Log(Call::Flock)[0].fd, fd);
    EXPECT_EQ(Fault::Log(Call::Flock)[0].number, LOCK_UN);
    ASSERT_EQ(Fault::Calls(Call::Close), 1U);
    EXPECT_EQ(Fault::Log(Call::Close)[0].fd, fd);
}

TEST_F(ConfigTest, UnlockingWhatWasNeverLockedDoesNothing) {
    Settings settings;
    Fault::Count(Call::Flock);
    Fault::Count(Call::Close);
    settings.Unlock();
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
    EXPECT_EQ(Fault::Calls(Call::Close), 0U);
    EXPECT_EQ(settings.lock_fd, -1);
}

TEST_F(ConfigTest, DestructionDoesNotUnlock) {
    {
        Settings settings;
        EXPECT_TRUE(settings.Lock(true));
    }
    EXPECT_TRUE(IsLocked(kLock));
    ExpectLeakedDescriptors(1);
}

TEST_F(ConfigTest, AWaitForALockStaysWithinThirtyMilliseconds) {
    const HoldLock lock(kLock);
    Fault::Count(Call::Usleep);
    Settings settings;
    EXPECT_FALSE(settings.Lock(true));
    ASSERT_EQ(Fault::Calls(Call::Usleep), 3U);
    for (const CallInfo &sleep : Fault::Log(Call::Usleep)) {
        EXPECT_GE(sleep.number, 0);
        EXPECT_LE(sleep.number, 9000);
        EXPECT_EQ(sleep.number % 1000, 0);
    }
    ExpectLog({kLockFailed});
    ExpectLeakedDescriptors(3);
}

} // namespace

} // namespace VANO::TESTS
