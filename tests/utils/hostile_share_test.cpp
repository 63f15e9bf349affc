// Shares whose users mean harm: what they put in place of the index data, and when they swap it.

#include <fileindex/event_queue.h>
#include <fileindex/fileindex.h>
#include <fileindex/index_mgr.h>
#include <fileindex/status_mgr.h>

#include "support/fixture.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sys/stat.h>
#include <unistd.h>

namespace VANO::TESTS {

namespace {

namespace fs = std::filesystem;

constexpr char kMetadataDir[] = "/volume1/photos/@eaDir";

// What lies outside the share, laid out as a share so that every link finds what it looks for:
//
//     /volume2/outside/@eaDir/VANO@file_index_queue    "precious\n"
//     /volume2/outside/@eaDir/VANO@.fileindexdb/       (made by some tests)
constexpr char kOutsideDir[] = "/volume2/outside/@eaDir";
constexpr char kOutsideQueue[] = "/volume2/outside/@eaDir/VANO@file_index_queue";

std::string TextOf(const fs::path &file) {
    std::ifstream stream(file);
    return {std::istreambuf_iterator<char>(stream), {}};
}

// Every name below the directory with its kind and its text.
std::vector<std::string> Snapshot(const std::string &directory) {
    std::vector<std::string> entries;
    for (const fs::directory_entry &entry : fs::recursive_directory_iterator(directory)) {
        const std::string text = entry.is_regular_file() ? TextOf(entry.path()) : "-";
        entries.push_back(entry.path().string() + "|" +
                          std::to_string(static_cast<int>(entry.symlink_status().type())) + "|" +
                          text);
    }
    std::sort(entries.begin(), entries.end());
    return entries;
}

// One level at which a user may put a link that leads out of the share.
struct Level {
    const char *what;
    const char *path;
    const char *target;
};

constexpr std::array kLevels = {Level{"Queue", kPhotoQueue, kOutsideQueue},
                                Level{"MetadataDir", kMetadataDir, kOutsideDir}};

void SwapForLink(const Level &level) {
    std::error_code ignored;
    fs::rename(level.path, std::string(level.path) + ".away", ignored);
    if (::symlink(level.target, level.path) != 0) {
        ADD_FAILURE() << "symlink " << level.path;
    }
}

bool AddEvent() {
    return AddCustomEvent(131072, "/volume1/photos/trip", Json::Value(Json::objectValue));
}

bool MakeDatabase() {
    std::array<char, PATH_MAX> path{};
    return FILEIDXDBPathGet("photos", path.data(), static_cast<int>(path.size())) > 0;
}

bool MakeCutDatabase() {
    std::array<char, sizeof("/volume1/photos/@eaDir/VANO")> path{};
    return FILEIDXDBPathGet("photos", path.data(), static_cast<int>(path.size())) > 0;
}

bool AskStatus() {
    return StatusMgr::GetFolderStatus("/photos/trip") != "processing";
}

class HostileShareTest : public LibraryTest {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        PrepareShare();
        MakeDirs(kOutsideDir);
        PutFile(kOutsideQueue, "precious\n");
        outside_ = Snapshot("/volume2");
    }

    void PrepareShare() {
        platform.AddShare("photos", kPhotos);
        MakeDirs("/volume1/photos/trip");
        MakeDirs(kMetadataDir);
    }

    void ExpectOutsideUntouched() { EXPECT_EQ(Snapshot("/volume2"), outside_); }

    static bool IsMarked() { return StatusMgr::ShareIsNeedReindex("photos"); }

    // Takes the lines that a test does not look at one by one.
    static std::vector<std::string> TakeLog() {
        std::vector<std::string> texts;
        for (const LogLine &line : SystemLog::Get().Lines()) {
            texts.push_back(line.text);
        }
        return texts;
    }

  private:
    std::vector<std::string> outside_;
};

// --- links ----------------------------------------------------------------------------------

class LinkedShareTest : public HostileShareTest, public ::testing::WithParamInterface<Level> {};

INSTANTIATE_TEST_SUITE_P(At, LinkedShareTest, ::testing::ValuesIn(kLevels), RowName());

TEST_P(LinkedShareTest, NoEventIsAppendedThroughALink) {
    SwapForLink(GetParam());
    EXPECT_FALSE(AddEvent());
    ExpectOutsideUntouched();
    EXPECT_TRUE(IsMarked()) << "the event must not be lost silently";
    (void)TakeLog();
}

TEST_P(LinkedShareTest, NoQueueIsMadeThroughADanglingLink) {
    const Level dangling = {GetParam().what, GetParam().path, "/volume2/outside/none"};
    SwapForLink(dangling);
    EXPECT_FALSE(AddEvent());
    ExpectOutsideUntouched();
    EXPECT_TRUE(IsMarked());
    (void)TakeLog();
}

TEST_P(LinkedShareTest, NothingOutsideIsReadIntoTheLog) {
    SwapForLink(GetParam());
    EXPECT_TRUE(AskStatus());
    EXPECT_THAT(TakeLog(), Each(Not(HasSubstr("precious"))));
}

TEST_P(LinkedShareTest, NoDatabaseIsMadeThroughALink) {
    SwapForLink(GetParam());
    EXPECT_TRUE(MakeDatabase()); // the location itself is known all the same
    EXPECT_TRUE(MakeCutDatabase());
    ExpectOutsideUntouched();
    (void)TakeLog();
}

// Both questions about progress: what is behind a link does not exist for either.
TEST_P(LinkedShareTest, NoEventWaitsBehindALink) {
    PutFile(kOutsideQueue, R"({"event":1,"path":"/volume1/photos/trip"})"
                           "\n");
    PutFile(kFolderFile, R"({"/photos/trip":{"photo":true}})");
    SwapForLink(GetParam());
    std::string status;
    EXPECT_TRUE(StatusMgr::GetStatus(status));
    EXPECT_EQ(status, "finished");
    EXPECT_EQ(StatusMgr::GetFolderStatus("/photos/trip"), "finished");
    (void)TakeLog();
}

TEST_F(HostileShareTest, ADatabaseBehindALinkIsAFailureThatIsLogged) {
    SwapForLink(kLevels[1]);
    platform.AnswerAlways("VANOEAMKDir", 0);
    EXPECT_TRUE(MakeDatabase());
    ExpectLog({"utils:750 mkdir failed, path=" + std::string(kPhotoDatabase) +
               ", reason=Not a directory"});
    ExpectOutsideUntouched();
}

// Each removal is a program of its own that would follow the link.
TEST_F(HostileShareTest, NothingIsRemovedThroughALink) {
    SwapForLink(kLevels[1]);
    platform.AnswerAlways("VANOEAMKDir", 0);
    EventTrace::Get().Clear();
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
    EXPECT_THAT(Effects(), Each(Not(HasSubstr("/bin/rm"))));
    EXPECT_THAT(TakeLog(),
                Contains(HasSubstr("Refused to remove, path=" + std::string(kPhotoQueue) +
                                   ", reason=Not a directory")));
    ExpectOutsideUntouched();
}

TEST_F(HostileShareTest, NothingIsRemovedUnseen) {
    for (const int error : {EMFILE, ENFILE, ENOMEM, EACCES, EIO}) {
        EventTrace::Get().Clear();
        Fault::FailAlways(Call::OpenPath, error);
        EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
        EXPECT_THAT(Effects(), Each(Not(HasSubstr("/bin/rm")))) << error;
        Fault::Reset();
        const std::string reason = std::string(", reason=") + std::strerror(error);
        EXPECT_THAT(
            TakeLog(),
            Contains(AllOf(HasSubstr("Refused to remove, path="), HasSubstr(reason))).Times(3));
    }
}

TEST_F(HostileShareTest, ALinkInPlaceOfTheQueueIsItselfRemoved) {
    SwapForLink(kLevels[0]);
    EventTrace::Get().Clear();
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
    EXPECT_THAT(Effects(), Contains(HasSubstr(kPhotoQueue))); // rm removes links, not targets
    ExpectOutsideUntouched();
}

// --- what is no harm ------------------------------------------------------------------------

// The way to the share is the administrator's: a directory that moved to another volume may have
// left a link behind.
TEST_F(HostileShareTest, TheSharesDirectoryMayBeALink) {
    fs::rename(kPhotos, "/volume1/moved");
    ASSERT_EQ(::symlink("/volume1/moved", kPhotos), 0);
    EXPECT_TRUE(AddEvent());
    EXPECT_THAT(ReadText("/volume1/moved/@eaDir/VANO@file_index_queue"),
                HasSubstr("/volume1/photos/trip"));
    EXPECT_TRUE(MakeDatabase());
    EXPECT_TRUE(fs::is_directory("/volume1/moved/@eaDir/VANO@.fileindexdb"));
    EXPECT_FALSE(IsMarked());
    PutFile(kFolderFile, R"({"/photos/trip":{"photo":true}})");
    platform.AnswerAlways("VLIBCExec", 0);
    EventTrace::Get().Clear();
    EXPECT_TRUE(IndexMgr::CleanShareIndexData("photos"));
    EXPECT_THAT(Effects(), Contains(HasSubstr("/bin/rm")).Times(3));
    EXPECT_THAT(TakeLog(), IsEmpty());
}

// A backup may hold the queue's second name.
TEST_F(HostileShareTest, AQueueWithASecondNameIsAppendedTo) {
    PutFile(kPhotoQueue, "before\n");
    ASSERT_EQ(::link(kPhotoQueue, "/volume1/backup"), 0);
    EXPECT_TRUE(AddEvent());
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr("/volume1/photos/trip"));
    EXPECT_FALSE(IsMarked());
}

TEST_F(HostileShareTest, AQueueOfAnotherOwnerIsAppendedToAndKeepsItsOwner) {
    PutFile(kPhotoQueue, "");
    if (::chown(kPhotoQueue, 65534, 65534) != 0) {
        GTEST_SKIP() << "files cannot be given away here";
    }
    EXPECT_TRUE(AddEvent());
    struct stat info {};
    ASSERT_EQ(::stat(kPhotoQueue, &info), 0);
    EXPECT_EQ(info.st_uid, 65534U);
    EXPECT_GT(info.st_size, 0);
}

// --- swapped between two calls ---------------------------------------------------------------

struct Operation {
    const char *what;
    bool (*run)();
};

struct Swap {
    Operation operation;
    Level level;
    std::string what;
};

std::vector<Swap> Swaps() {
    constexpr std::array kOperations = {Operation{"Append", AddEvent},
                                        Operation{"MakeDatabase", MakeDatabase},
                                        Operation{"Status", AskStatus}};
    std::vector<Swap> swaps;
    for (const Operation &operation : kOperations) {
        for (const Level &level : kLevels) {
            swaps.push_back({operation, level, std::string(operation.what) + level.what});
        }
    }
    return swaps;
}

class SwappedShareTest : public HostileShareTest, public ::testing::WithParamInterface<Swap> {
  protected:
    static constexpr std::array kCalls = {Call::Open,  Call::OpenPath, Call::Lstat, Call::Stat,
                                          Call::Fstat, Call::Flock,    Call::Mkdir, Call::Write,
                                          Call::Read,  Call::Close};

    // Swaps just before the operation's call of that number. False when it made fewer calls.
    static bool SwapBefore(int number, const Swap &swap) {
        int calls = 0;
        bool swapped = false;
        for (const Call call : kCalls) {
            Fault::Before(call, [&](CallInfo &) {
                if (++calls == number) {
                    SwapForLink(swap.level);
                    swapped = true;
                }
            });
        }
        (void)swap.operation.run();
        Fault::Reset();
        return swapped;
    }
};

INSTANTIATE_TEST_SUITE_P(At, SwappedShareTest, ::testing::ValuesIn(Swaps()), RowName());

TEST_P(SwappedShareTest, NothingOutsideIsTouchedWheneverTheSwapComes) {
    int number = 1;
    for (bool swapped = true; swapped; ++number) {
        SCOPED_TRACE("before call " + std::to_string(number));
        RemoveTree("/volume1/photos");
        RemoveTree("/volume1/photos.away");
        PrepareShare();
        PutFile(kPhotoQueue, R"({"event":256,"path":"/volume1/photos/other"})"
                             "\n");
        swapped = SwapBefore(number, GetParam());
        ExpectOutsideUntouched();
        EXPECT_THAT(TakeLog(), Each(Not(HasSubstr("precious"))));
    }
    EXPECT_GT(number, 4) << "hardly a call was seen";
    RemoveTree("/volume1/photos.away");
}

} // namespace

} // namespace VANO::TESTS
