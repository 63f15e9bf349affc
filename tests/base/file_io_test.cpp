#include "base/file_io.h"

#include <atomic>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <thread>
#include <unistd.h>

#include "support/fixture.h"
#include "support/mounts.h"

namespace VANO::TESTS {

namespace {

using ::testing::MatchesRegex;

constexpr char kDirectory[] = "/volume1/d";
constexpr char kFile[] = "/volume1/d/file";
constexpr std::size_t kNoLimit = std::size_t{1} << 30;
constexpr uid_t kOtherUser = 1234;

class FileIoTest : public LibraryTest {
  protected:
    // One byte a time, and a signal before the second one.
    static void InterruptAndShorten(Call call) {
        Fault::On(call, [calls = 0](CallInfo &info) mutable -> std::optional<long> {
            if (++calls == 2) {
                errno = EINTR;
                return -1;
            }
            info.size = 1;
            return std::nullopt;
        });
    }

    void SetUp() override {
        LibraryTest::SetUp();
        MakeDirs(kDirectory);
    }
};

// --- reading ---

TEST_F(FileIoTest, ReadsEveryByteOfAFile) {
    const std::string text("a\0b\nc\xff", 6);
    PutFile(kFile, text);
    std::string read = "rest of before";
    EXPECT_TRUE(ReadFile(read, kFile, kNoLimit));
    EXPECT_EQ(read, text);
}

TEST_F(FileIoTest, ReadsAnEmptyFileAsEmptyText) {
    PutFile(kFile, "");
    std::string read = "rest of before";
    EXPECT_TRUE(ReadFile(read, kFile, kNoLimit));
    EXPECT_EQ(read, "");
}

TEST_F(FileIoTest, ReadsBeyondItsOwnBuffer) {
    std::string text(200 * 1024 + 7, 'x');
    text.back() = 'y';
    PutFile(kFile, text);
    std::string read;
    EXPECT_TRUE(ReadFile(read, kFile, kNoLimit));
    EXPECT_EQ(read, text);
}

TEST_F(FileIoTest, AFileOfExactlyTheLimitIsReadAndALargerOneIsNot) {
    PutFile(kFile, std::string(100000, 'x'));
    std::string read;
    EXPECT_TRUE(ReadFile(read, kFile, 100000));
    EXPECT_EQ(read.size(), 100000U);
    EXPECT_FALSE(ReadFile(read, kFile, 99999));
    EXPECT_EQ(errno, EFBIG);
}

TEST_F(FileIoTest, ReadingFollowsALink) {
    PutFile(kFile, "text");
    ASSERT_EQ(::symlink(kFile, "/volume1/link"), 0);
    std::string read;
    EXPECT_TRUE(ReadFile(read, "/volume1/link", kNoLimit));
    EXPECT_EQ(read, "text");
}

TEST_F(FileIoTest, AMissingFileIsNotRead) {
    std::string read;
    EXPECT_FALSE(ReadFile(read, kFile, kNoLimit));
    EXPECT_EQ(errno, ENOENT);
}

TEST_F(FileIoTest, OnlyRegularFilesAreRead) {
    std::string read;
    EXPECT_FALSE(ReadFile(read, kDirectory, kNoLimit));
    EXPECT_EQ(errno, EINVAL);
    ASSERT_EQ(::mkfifo(kFile, 0600), 0);
    EXPECT_FALSE(ReadFile(read, kFile, kNoLimit)); // and does not wait for a writer
    EXPECT_EQ(errno, EINVAL);
    EXPECT_FALSE(ReadFile(read, "/dev/zero", kNoLimit));
    EXPECT_EQ(errno, EINVAL);
}

TEST_F(FileIoTest, ASocketIsNotRead) {
    const int fd = ListenAt(kFile);
    std::string read;
    EXPECT_FALSE(ReadFile(read, kFile, kNoLimit));
    ::close(fd);
}

TEST_F(FileIoTest, AnInterruptedOrShortReadGoesOn) {
    PutFile(kFile, "text");
    InterruptAndShorten(Call::Read);
    std::string read;
    EXPECT_TRUE(ReadFile(read, kFile, kNoLimit));
    EXPECT_EQ(read, "text");
}

// Another program rewrites it in place, and it becomes longer than it was when it was opened.
TEST_F(FileIoTest, AFileThatGrowsIsReadToItsEnd) {
    for (const std::size_t limit : {std::size_t{20010}, std::size_t{20009}}) {
        PutFile(kFile, std::string(10, 'a'));
        bool hasGrown = false;
        Fault::Before(Call::Read, [&](CallInfo &) {
            if (!hasGrown) {
                hasGrown = true;
                const KitScope kit;
                PutFile(kFile, std::string(20010, 'b'));
            }
        });
        std::string read;
        EXPECT_EQ(ReadFile(read, kFile, limit), limit == 20010U);
        EXPECT_TRUE(limit != 20010U || read == std::string(20010, 'b')) << read.size();
    }
}

TEST_F(FileIoTest, AFailingReadOrFstatIsAFailure) {
    PutFile(kFile, "text");
    for (const Call call : {Call::Read, Call::Fstat}) {
        Fault::Fail(call, EIO);
        std::string read;
        EXPECT_FALSE(ReadFile(read, kFile, kNoLimit));
        EXPECT_EQ(errno, EIO);
        Fault::Reset();
    }
}

// --- replacing ---

TEST_F(FileIoTest, CreatesAMissingFileReadableForAllWhateverTheUmask) {
    const mode_t umaskBefore = ::umask(077);
    EXPECT_TRUE(WriteFile(kFile, "text"));
    ::umask(umaskBefore);
    EXPECT_EQ(ReadText(kFile), "text");
    EXPECT_EQ(ModeOf(kFile), 0644U);
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(FileIoTest, WritesEveryByte) {
    const std::string text = std::string("a\0b\n\xff", 5) + std::string(300000, 'x');
    EXPECT_TRUE(WriteFile(kFile, text));
    EXPECT_EQ(ReadText(kFile), text);
    EXPECT_TRUE(WriteFile(kFile, ""));
    EXPECT_EQ(ReadText(kFile), "");
}

TEST_F(FileIoTest, FindsTheDirectoryOfEveryFormOfPath) {
    EXPECT_TRUE(WriteFile("/file-at-root", "root"));
    EXPECT_EQ(ReadText("/file-at-root"), "root");
    RemoveTree("/file-at-root");
    char *before = ::getcwd(nullptr, 0);
    ASSERT_EQ(::chdir(kDirectory), 0);
    EXPECT_TRUE(WriteFile("file", "relative"));
    ASSERT_EQ(::chdir(before), 0);
    std::free(before);
    EXPECT_EQ(ReadText(kFile), "relative");
}

TEST_F(FileIoTest, AReaderThatHasTheFileOpenKeepsTheOldText) {
    PutFile(kFile, "old text");
    const int fd = ::open(kFile, O_RDONLY);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    char buffer[16] = "";
    EXPECT_EQ(::read(fd, buffer, sizeof(buffer)), 8);
    EXPECT_STREQ(buffer, "old text");
    ::close(fd);
    EXPECT_EQ(ReadText(kFile), "new");
}

TEST_F(FileIoTest, ConcurrentReadersMeetWholeTextsOnly) {
    const std::string one(150000, '1');
    const std::string two(90000, '2');
    PutFile(kFile, one);
    std::atomic<bool> stop{false};
    std::atomic<int> torn{0};
    std::atomic<int> reads{0};
    std::thread reader([&] {
        while (!stop || reads == 0) {
            std::string text;
            torn += ReadFile(text, kFile, kNoLimit) && (text == one || text == two) ? 0 : 1;
            ++reads;
        }
    });
    for (int i = 0; i < 50; ++i) {
        EXPECT_TRUE(WriteFile(kFile, i % 2 == 0 ? two : one));
    }
    stop = true;
    reader.join();
    EXPECT_EQ(torn, 0);
}

TEST_F(FileIoTest, KeepsTheModeOfTheOldFile) {
    for (const mode_t mode : {0600U, 0666U, 0444U, 0755U}) {
        PutFile(kFile, "old");
        ASSERT_EQ(::chmod(kFile, mode), 0);
        EXPECT_TRUE(WriteFile(kFile, "new"));
        EXPECT_EQ(ModeOf(kFile), mode);
    }
}

TEST_F(FileIoTest, KeepsOwnerAndGroupOfTheOldFile) {
    const std::pair<uid_t, gid_t> owners[] = {
        {kOtherUser, kOtherUser + 1}, {kOtherUser, ::getegid()}, {::geteuid(), kOtherUser}};
    for (const auto &[owner, group] : owners) {
        RemoveTree(kFile);
        PutFile(kFile, "old");
        if (::chown(kFile, owner, group) != 0) {
            GTEST_SKIP() << "this user may not give files away";
        }
        EXPECT_TRUE(WriteFile(kFile, "new"));
        struct stat info {};
        ASSERT_EQ(::stat(kFile, &info), 0);
        EXPECT_EQ(info.st_uid, owner);
        EXPECT_EQ(info.st_gid, group);
        EXPECT_EQ(ReadText(kFile), "new");
    }
}

TEST_F(FileIoTest, AnOwnFileNeedsNoChangeOfOwner) {
    PutFile(kFile, "old");
    Fault::Count(Call::Fchown);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    EXPECT_EQ(Fault::Calls(Call::Fchown), 0U);
}

TEST_F(FileIoTest, AnOwnerThatCannotBeKeptIsKeptByWritingInPlace) {
    PutFile(kFile, "old and longer");
    if (::chown(kFile, kOtherUser, kOtherUser) != 0) {
        GTEST_SKIP() << "this user may not give files away";
    }
    Fault::FailAlways(Call::Fchown, EPERM);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    struct stat info {};
    ASSERT_EQ(::stat(kFile, &info), 0);
    EXPECT_EQ(info.st_uid, kOtherUser);
    EXPECT_EQ(ReadText(kFile), "new");
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(FileIoTest, AModeThatCannotBeSetDoesNotKeepTheTextFromBeingSaved) {
    PutFile(kFile, "old");
    Fault::FailAlways(Call::Fchmod, EPERM);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    EXPECT_EQ(ReadText(kFile), "new");
}

TEST_F(FileIoTest, FlushesTheTextBeforeTheRenameAndTheDirectoryAfterIt) {
    PutFile(kFile, "old");
    for (const Call call : {Call::Write, Call::Fsync, Call::Rename}) {
        Fault::Record(call);
    }
    EXPECT_TRUE(WriteFile(kFile, "new"));
    const char temporary[] = "/volume1/d/file\\.[A-Za-z0-9]+";
    const std::vector<std::string> effects = Effects();
    Fault::Reset();
    EXPECT_THAT(effects, ElementsAre(MatchesRegex(std::string("write\\(") + temporary + ", 3\\)"),
                                     MatchesRegex(std::string("fsync\\(") + temporary + "\\)"),
                                     MatchesRegex(std::string("rename\\(") + temporary + ", " +
                                                  kFile + "\\)"),
                                     "fsync(/volume1/d)"));
}

TEST_F(FileIoTest, AnInterruptedOrShortWriteGoesOn) {
    InterruptAndShorten(Call::Write);
    EXPECT_TRUE(WriteFile(kFile, "text"));
    EXPECT_EQ(ReadText(kFile), "text");
}

struct FailingStep {
    const char *what;
    Call call;
    int error;
    int nth;
};

class FileIoFailureTest : public FileIoTest, public ::testing::WithParamInterface<FailingStep> {};

TEST_P(FileIoFailureTest, AFailureUpToTheRenameLeavesTheOldFileAndNoOther) {
    PutFile(kFile, "old");
    const auto [what, call, error, nth] = GetParam();
    Fault::Fail(call, error, nth);
    EXPECT_FALSE(WriteFile(kFile, "new"));
    EXPECT_EQ(errno, error);
    EXPECT_GE(Fault::Calls(call), static_cast<std::size_t>(nth));
    Fault::Reset();
    EXPECT_EQ(ReadText(kFile), "old");
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_P(FileIoFailureTest, AFailureUpToTheRenameMakesNoNewFile) {
    const auto [what, call, error, nth] = GetParam();
    Fault::Fail(call, error, nth);
    EXPECT_FALSE(WriteFile(kFile, "new"));
    EXPECT_EQ(errno, error);
    Fault::Reset();
    EXPECT_THAT(NamesIn(kDirectory), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(
    Steps, FileIoFailureTest,
    ::testing::Values(FailingStep{"OpenDirectory", Call::Open, EMFILE, 1},
                      FailingStep{"NoRoomForATemporaryFile", Call::Mkostemp, ENOSPC, 1},
                      FailingStep{"NoQuotaForATemporaryFile", Call::Mkostemp, EDQUOT, 1},
                      FailingStep{"NoDescriptor", Call::Mkostemp, EMFILE, 1},
                      FailingStep{"FullDisk", Call::Write, ENOSPC, 1},
                      FailingStep{"Quota", Call::Write, EDQUOT, 1},
                      FailingStep{"BrokenDisk", Call::Write, EIO, 1},
                      FailingStep{"Flush", Call::Fsync, EIO, 1},
                      FailingStep{"FlushFullDisk", Call::Fsync, ENOSPC, 1},
                      FailingStep{"Rename", Call::Rename, EIO, 1},
                      FailingStep{"RenameFullDisk", Call::Rename, ENOSPC, 1}),
    RowName());

TEST_F(FileIoTest, OnceRenamedTheNewTextStandsWhetherTheDirectoryCanBeFlushedOrNot) {
    for (const int error : {EIO, EINVAL}) {
        PutFile(kFile, "old");
        Fault::Fail(Call::Fsync, error, 2);
        EXPECT_TRUE(WriteFile(kFile, "new"));
        EXPECT_EQ(Fault::Calls(Call::Fsync), 2U);
        Fault::Reset();
        EXPECT_EQ(ReadText(kFile), "new");
        EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
    }
}

TEST_F(FileIoTest, AFullDiskLeavesTheOldFile) {
    const Mount volume = TinyVolume("/volume2/tiny", 64 * 1024);
    ASSERT_TRUE(volume);
    const std::string path = "/volume2/tiny/file";
    PutFile(path, "old");
    EXPECT_FALSE(WriteFile(path, std::string(100 * 1024, 'x')));
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_EQ(ReadText(path), "old");
    EXPECT_THAT(NamesIn("/volume2/tiny"), ElementsAre("file"));
}

TEST_F(FileIoTest, AMissingDirectoryIsAFailure) {
    EXPECT_FALSE(WriteFile("/volume1/none/file", "text"));
    EXPECT_EQ(errno, ENOENT);
    EXPECT_FALSE(Exists("/volume1/none"));
}

// --- rewriting in place ---

struct Refusal {
    const char *what;
    Call call;
    int error;
};

class FileIoRefusalTest : public FileIoTest, public ::testing::WithParamInterface<Refusal> {};

TEST_P(FileIoRefusalTest, WhereAFileCannotBeReplacedItIsRewritten) {
    PutFile(kFile, "old and longer");
    const ino_t before = [] {
        struct stat info {};
        return ::stat(kFile, &info) == 0 ? info.st_ino : 0;
    }();
    Fault::FailAlways(GetParam().call, GetParam().error);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    Fault::Reset();
    struct stat info {};
    ASSERT_EQ(::stat(kFile, &info), 0);
    EXPECT_EQ(info.st_ino, before);
    EXPECT_EQ(ReadText(kFile), "new");
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

INSTANTIATE_TEST_SUITE_P(Answers, FileIoRefusalTest,
                         ::testing::Values(Refusal{"NoNewFiles", Call::Mkostemp, EACCES},
                                           Refusal{"NotPermitted", Call::Mkostemp, EPERM},
                                           Refusal{"ReadOnlyDirectory", Call::Mkostemp, EROFS},
                                           Refusal{"RenameDenied", Call::Rename, EACCES},
                                           Refusal{"RenameNotPermitted", Call::Rename, EPERM},
                                           Refusal{"MountPoint", Call::Rename, EBUSY}),
                         RowName());

TEST_F(FileIoTest, AMountedFileIsRewritten) {
    PutFile("/volume2/source", "old and longer");
    PutFile(kFile, "hidden");
    {
        const Mount mount = Cover(kFile, "/volume2/source");
        ASSERT_TRUE(mount);
        EXPECT_TRUE(WriteFile(kFile, "new"));
        EXPECT_EQ(ReadText(kFile), "new");
    }
    EXPECT_EQ(ReadText("/volume2/source"), "new");
    EXPECT_EQ(ReadText(kFile), "hidden");
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(FileIoTest, AFullDiskLeavesAMountedFileToo) {
    const Mount volume = TinyVolume("/volume2/tiny", 64 * 1024);
    ASSERT_TRUE(volume);
    PutFile("/volume2/tiny/source", "old");
    PutFile(kFile, "hidden");
    const Mount mount = Cover(kFile, "/volume2/tiny/source");
    ASSERT_TRUE(mount);
    EXPECT_FALSE(WriteFile(kFile, std::string(100 * 1024, 'x')));
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_EQ(ReadText(kFile), "old");
}

TEST_F(FileIoTest, RoomForARewriteIsTakenBeforeTheOldTextIsTouched) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    PutFile("/volume1/target", "old");
    Fault::FailAlways(Call::Fallocate, EDQUOT);
    for (const char *text : {"new text", "n"}) {
        EXPECT_FALSE(WriteFile(kFile, text));
        EXPECT_EQ(errno, EDQUOT);
        EXPECT_EQ(ReadText("/volume1/target"), "old");
    }
}

TEST_F(FileIoTest, AnEmptyTextIsWrittenInPlaceToo) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    PutFile("/volume1/target", "old");
    EXPECT_TRUE(WriteFile(kFile, ""));
    EXPECT_EQ(ReadText("/volume1/target"), "");
}

TEST_F(FileIoTest, NothingIsRemovedAfterASuccess) {
    PutFile(kFile, "old");
    Fault::Count(Call::Unlink);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    EXPECT_EQ(Fault::Calls(Call::Unlink), 0U);
}

TEST_F(FileIoTest, AFailureIsToldWhateverRemovingTheTemporaryFileSays) {
    Fault::Fail(Call::Fsync, ENOSPC);
    Fault::Before(Call::Unlink, [](CallInfo &) { errno = EIO; });
    EXPECT_FALSE(WriteFile(kFile, "new"));
    EXPECT_EQ(errno, ENOSPC);
}

TEST_F(FileIoTest, TheFirstDescriptorIsClosedLikeAnyOther) {
    PutFile(kFile, "text");
    const int input = ::dup(STDIN_FILENO);
    ASSERT_GE(input, 0);
    ASSERT_EQ(::close(STDIN_FILENO), 0);
    std::string text;
    EXPECT_TRUE(ReadFile(text, kFile, 100));
    EXPECT_EQ(::fcntl(STDIN_FILENO, F_GETFD), -1) << "what a program without input opens first";
    EXPECT_EQ(::dup2(input, STDIN_FILENO), STDIN_FILENO);
    EXPECT_EQ(::close(input), 0);
}

TEST_F(FileIoTest, AFailureIsToldWhateverClosingSays) {
    Fault::Fail(Call::Fsync, ENOSPC);
    Fault::Before(Call::Close, [](CallInfo &) { errno = EIO; });
    errno = 0;
    EXPECT_FALSE(WriteFile(kFile, "new"));
    EXPECT_EQ(errno, ENOSPC);
}

// A device in a settings file's place must neither block the caller nor become its terminal.
TEST_F(FileIoTest, OpensWithoutBlockingAndWithoutTakingATerminal) {
    PutFile("/volume1/target", "old");
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    std::string text;
    Fault::Count(Call::Open);
    EXPECT_TRUE(ReadFile(text, kFile, 100));
    EXPECT_TRUE(WriteFile(kFile, "new"));
    std::size_t opened = 0;
    for (const CallInfo &info : Fault::Log(Call::Open)) {
        if (info.path == kFile) {
            ++opened;
            for (const int flag : {O_NONBLOCK, O_NOCTTY, O_CLOEXEC}) {
                EXPECT_EQ(info.number & flag, flag);
            }
        }
    }
    EXPECT_GE(opened, 2U);
}

TEST_F(FileIoTest, AnInterruptedReservationIsTriedAgain) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    PutFile("/volume1/target", "old");
    Fault::Fail(Call::Fallocate, EINTR);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    EXPECT_EQ(ReadText("/volume1/target"), "new");
}

TEST_F(FileIoTest, AWriteOfNothingIsAFailureAndNotTriedAgain) {
    PutFile(kFile, "old");
    int writes = 0;
    Fault::On(Call::Write, [&](CallInfo &) -> std::optional<long> {
        errno = EINTR; // as an earlier call may have left it
        return ++writes == 1 ? std::optional<long>(0) : std::nullopt;
    });
    EXPECT_FALSE(WriteFile(kFile, "new"));
    Fault::Reset();
    EXPECT_EQ(ReadText(kFile), "old");
}

TEST_F(FileIoTest, AFileSystemThatCannotReserveRoomIsWrittenToAllTheSame) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    PutFile("/volume1/target", "old and longer");
    Fault::FailAlways(Call::Fallocate, EOPNOTSUPP);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    EXPECT_EQ(ReadText("/volume1/target"), "new");
}

struct RewriteStep {
    const char *what;
    Call call;
};

class FileIoRewriteFailureTest : public FileIoTest,
                                 public ::testing::WithParamInterface<RewriteStep> {};

TEST_P(FileIoRewriteFailureTest, PutsTheOldTextBack) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    PutFile("/volume1/target", "old and longer");
    Fault::Fail(GetParam().call, EIO);
    EXPECT_FALSE(WriteFile(kFile, "new"));
    EXPECT_EQ(errno, EIO);
    Fault::Reset();
    EXPECT_EQ(ReadText("/volume1/target"), "old and longer");
}

INSTANTIATE_TEST_SUITE_P(Steps, FileIoRewriteFailureTest,
                         ::testing::Values(RewriteStep{"Open", Call::Open},
                                           RewriteStep{"Fstat", Call::Fstat},
                                           RewriteStep{"Write", Call::Write},
                                           RewriteStep{"Ftruncate", Call::Ftruncate},
                                           RewriteStep{"Fsync", Call::Fsync}),
                         RowName());

TEST_F(FileIoTest, ARewriteThatStopsHalfwayPutsTheOldTextBack) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    PutFile("/volume1/target", "old");
    Fault::On(Call::Write, [calls = 0](CallInfo &info) mutable -> std::optional<long> {
        if (++calls == 2) {
            errno = EIO;
            return -1;
        }
        info.size = calls == 1 ? 2 : info.size;
        return std::nullopt;
    });
    EXPECT_FALSE(WriteFile(kFile, "new and longer"));
    EXPECT_EQ(errno, EIO);
    EXPECT_EQ(ReadText("/volume1/target"), "old");
}

TEST_F(FileIoTest, AFileThatWasMadeForNothingGoesAgain) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    Fault::Fail(Call::Write, EIO);
    EXPECT_FALSE(WriteFile(kFile, "new"));
    EXPECT_EQ(errno, EIO);
    EXPECT_FALSE(Exists("/volume1/target"));
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(FileIoTest, APathThatCannotBeLookedAtIsNotWritten) {
    PutFile(kFile, "old");
    Fault::FailAlways(Call::Lstat, EACCES);
    EXPECT_FALSE(WriteFile(kFile, "new"));
    EXPECT_EQ(errno, EACCES);
    EXPECT_EQ(ReadText(kFile), "old");
}

TEST_F(FileIoTest, ALinkIsWrittenThroughAndStays) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    PutFile("/volume1/target", "old and longer");
    EXPECT_TRUE(WriteFile(kFile, "new"));
    EXPECT_EQ(ReadText("/volume1/target"), "new");
    struct stat info {};
    ASSERT_EQ(::lstat(kFile, &info), 0);
    EXPECT_TRUE(S_ISLNK(info.st_mode));
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(FileIoTest, ADanglingLinkGetsItsTarget) {
    ASSERT_EQ(::symlink("/volume1/target", kFile), 0);
    EXPECT_TRUE(WriteFile(kFile, "new"));
    EXPECT_EQ(ReadText("/volume1/target"), "new");
}

TEST_F(FileIoTest, ADirectoryIsNotWritten) {
    MakeDirs(kFile);
    EXPECT_FALSE(WriteFile(kFile, "text"));
    EXPECT_EQ(errno, EISDIR);
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(FileIoTest, AFifoWithoutAReaderIsAFailureAndNoWait) {
    ASSERT_EQ(::mkfifo(kFile, 0600), 0);
    EXPECT_FALSE(WriteFile(kFile, "text"));
    EXPECT_EQ(errno, ENXIO);
}

TEST_F(FileIoTest, AFifoWithAReaderGetsTheText) {
    ASSERT_EQ(::mkfifo(kFile, 0600), 0);
    const int fd = ::open(kFile, O_RDONLY | O_NONBLOCK);
    EXPECT_TRUE(WriteFile(kFile, "text"));
    char buffer[16] = "";
    EXPECT_EQ(::read(fd, buffer, sizeof(buffer)), 4);
    EXPECT_STREQ(buffer, "text");
    ::close(fd);
}

TEST_F(FileIoTest, ADeviceIsWrittenTo) {
    ASSERT_EQ(::symlink("/dev/null", kFile), 0);
    EXPECT_TRUE(WriteFile(kFile, "text"));
}

} // namespace

} // namespace VANO::TESTS
