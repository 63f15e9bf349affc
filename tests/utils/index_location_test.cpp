// Where a share's index database and event queue lie, through the unmangled entry points.

#include <fileindex/fileindex.h>

#include "support/fixture.h"
#include "support/memory_fault.h"

#include <climits>
#include <cstring>
#include <dlfcn.h>
#include <sys/stat.h>

namespace VANO::TESTS {

namespace {

struct Entry {
    const char *name; // of the function
    int (*get)(const char *, char *, int);
    const char *outName;
    const char *location; // below the share
    int argumentLine;
    int shareLine;
    int metadataDirLine;
};

void PrintTo(const Entry &entry, std::ostream *out) {
    *out << entry.name;
}

constexpr Entry kDatabase = {"FILEIDXDBPathGet",
                             FILEIDXDBPathGet,
                             "szOutDBPath",
                             "/@eaDir/VANO@.fileindexdb",
                             733,
                             736,
                             743};
constexpr Entry kQueue = {"FILEIDXQueuePathGet",
                          FILEIDXQueuePathGet,
                          "szOutQueuePath",
                          "/@eaDir/VANO@file_index_queue",
                          769,
                          772,
                          779};

class UmaskScope {
  public:
    explicit UmaskScope(mode_t mask) : old_(::umask(mask)) {}
    UmaskScope(const UmaskScope &) = delete;
    UmaskScope &operator=(const UmaskScope &) = delete;
    ~UmaskScope() { ::umask(old_); }

  private:
    mode_t old_;
};

class IndexLocationTest : public LibraryTest, public ::testing::WithParamInterface<Entry> {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        platform.AddShare("photos", "/volume1/photos");
        EventTrace::Get().Clear();
        std::memset(buffer, 'x', sizeof(buffer));
    }

    static int Get(const char *share, char *out, int size) {
        return GetParam().get(share, out, size);
    }

    static std::string Expected() { return std::string("/volume1/photos") + GetParam().location; }

    static std::string Message(int line, const std::string &text) {
        return "utils:" + std::to_string(line) + " " + text;
    }

    char buffer[4096];
};

TEST_P(IndexLocationTest, GivesThePathAndItsLength) {
    const int length = Get("photos", buffer, sizeof(buffer));
    EXPECT_EQ(std::string(buffer), Expected());
    EXPECT_EQ(length, static_cast<int>(Expected().size()));
    EXPECT_TRUE(Exists("/volume1/photos/@eaDir"));
    ExpectLog({});
    ExpectError(FILEINDEX_ERR_NONE);
    // And again, now that everything is there.
    EXPECT_EQ(Get("photos", buffer, sizeof(buffer)), static_cast<int>(Expected().size()));
}

TEST_P(IndexLocationTest, HasAnUnmangledName) {
    EXPECT_EQ(::dlsym(RTLD_DEFAULT, GetParam().name), reinterpret_cast<void *>(GetParam().get));
}

TEST_P(IndexLocationTest, CutsThePathToTheBuffer) {
    const std::string expected = Expected();
    MakeDirs("/volume1/photos/@eaDir");
    for (const std::size_t size : {expected.size() + 2, expected.size() + 1, expected.size(),
                                   expected.size() - 1, std::size_t{20}, std::size_t{2}}) {
        std::memset(buffer, 'x', sizeof(buffer));
        const std::string cut = expected.substr(0, size - 1);
        EXPECT_EQ(Get("photos", buffer, static_cast<int>(size)), static_cast<int>(cut.size()));
        EXPECT_EQ(std::string(buffer, cut.size() + 1), cut + '\0') << size;
        EXPECT_EQ(buffer[size], 'x') << "wrote behind the buffer of " << size;
    }
    ExpectLog({});
}

TEST_P(IndexLocationTest, ABufferOfOneByteIsTheEmptyPath) {
    EXPECT_EQ(Get("photos", buffer, 1), 0);
    EXPECT_EQ(std::string(buffer, 2), std::string("\0x", 2));
    if (GetParam().get == FILEIDXDBPathGet) {
        ExpectLog({"utils:750 mkdir failed, path=, reason=No such file or directory"});
    }
}

TEST_P(IndexLocationTest, BadArgumentsAreNamedInOrder) {
    const std::string noOut = std::string("__null != ") + GetParam().outName;
    char out[2] = "x";
    const struct {
        const char *share;
        char *out;
        int size;
        std::string condition;
    } kRows[] = {
        {nullptr, out, 10, "__null != szName"},   {nullptr, nullptr, 0, "__null != szName"},
        {"photos", nullptr, 10, noOut},           {"photos", nullptr, 0, noOut},
        {"photos", out, 0, "cbOutLen > 0"},       {"photos", out, -1, "cbOutLen > 0"},
        {"photos", out, INT_MIN, "cbOutLen > 0"}, {"unknown", out, 0, "cbOutLen > 0"},
    };
    for (const auto &row : kRows) {
        EventTrace::Get().Clear();
        platform.lastError = 0;
        const std::string message =
            Message(GetParam().argumentLine, "Invaild Argument (" + row.condition + ")=[0]\n");
        EXPECT_EQ(Get(row.share, row.out, row.size), -1) << row.condition;
        EXPECT_THAT(platform.Trace(), ElementsAre("log: " + message, "VLIBCErrSetEx(0x0D00)"));
        EXPECT_EQ(platform.lastError, 0x0D00);
        EXPECT_EQ(platform.lastErrorFile, "utils.cpp");
        EXPECT_EQ(platform.lastErrorLine, GetParam().argumentLine);
        EXPECT_STREQ(out, "x");
        ExpectLog({message});
        ExpectError(FILEINDEX_ERR_NONE);
    }
}

TEST_P(IndexLocationTest, AnUnknownShareIsRefused) {
    platform.lastError = 0x1400;
    for (const std::string share : {"unknown", "", "Photos", "photos/"}) {
        EXPECT_EQ(Get(share.c_str(), buffer, sizeof(buffer)), -1);
        ExpectLog(
            {Message(GetParam().shareLine, "VANOShareGet failed, name=" + share + ", code=5120")});
    }
    EXPECT_THAT(NamesIn("/volume1/photos"), IsEmpty());
    EXPECT_EQ(platform.Calls("VANOEAMKDir"), 0U);
    EXPECT_EQ(platform.Calls("VLIBCErrSetEx"), 0U);
}

TEST_P(IndexLocationTest, TheShareRecordIsHeldToTheEnd) {
    Fault::Before(Call::Mkdir, [&](CallInfo &) { EXPECT_EQ(platform.LiveRecords(), 1U); });
    (void)Get("photos", buffer, sizeof(buffer));
    EXPECT_THAT(platform.Trace(),
                ElementsAre("VANOShareGet(photos)", "VANOEAMKDir(0, /volume1/photos/@eaDir)",
                            "VANOShareFree(photos)"));
}

TEST_P(IndexLocationTest, AMetadataDirectoryThatCannotBeMadeIsLoggedOnly) {
    MakeDirs("/volume1/photos/@eaDir");
    platform.lastError = 0x2900;
    platform.AnswerAlways("VANOEAMKDir", -1);
    EXPECT_EQ(Get("photos", buffer, sizeof(buffer)), static_cast<int>(Expected().size()));
    EXPECT_EQ(std::string(buffer), Expected());
    ExpectLog({Message(GetParam().metadataDirLine,
                       "VANOEAMKDir failed, path=/volume1/photos/@eaDir, code=10496")});
}

TEST_P(IndexLocationTest, APositiveAnswerIsSuccess) {
    MakeDirs("/volume1/photos/@eaDir");
    platform.Answer("VANOShareGet", {1});
    platform.Answer("VANOEAMKDir", {1});
    EXPECT_EQ(Get("photos", buffer, sizeof(buffer)), static_cast<int>(Expected().size()));
    ExpectLog({});
}

TEST_P(IndexLocationTest, ASharePathOfAnyLengthIsCut) {
    const std::string directory = "/volume1/" + std::string(5000, 'd');
    platform.FindShare("photos")->path = directory;
    platform.AnswerAlways("VANOEAMKDir", 0);
    Fault::Quiet(Call::Mkdir);
    EXPECT_EQ(Get("photos", buffer, sizeof(buffer)), 4095);
    EXPECT_EQ(std::string(buffer), directory.substr(0, 4095));
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, " + directory.substr(0, 4095) + ")"));
}

TEST_P(IndexLocationTest, TheSpellingIsThatOfTheSharesDirectory) {
    platform.ignoreCase = true;
    EXPECT_GT(Get("PHOTOS", buffer, sizeof(buffer)), 0);
    EXPECT_EQ(std::string(buffer), Expected());
}

INSTANTIATE_TEST_SUITE_P(Both, IndexLocationTest, ::testing::Values(kDatabase, kQueue),
                         [](const auto &row) { return std::string(row.param.name); });

class DatabaseLocationTest : public LibraryTest {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        platform.AddShare("photos", "/volume1/photos");
        EventTrace::Get().Clear();
    }

    const std::string database = "/volume1/photos/@eaDir/VANO@.fileindexdb";
    char buffer[4096] = {};
};

TEST_F(DatabaseLocationTest, MakesTheDirectoryAfterTheMetadataDirectory) {
    Fault::Record(Call::Mkdir);
    EXPECT_GT(FILEIDXDBPathGet("photos", buffer, sizeof(buffer)), 0);
    EXPECT_THAT(Effects(), ElementsAre("VANOEAMKDir(0, /volume1/photos/@eaDir)",
                                       "mkdir(" + database + ", 511)"));
    EXPECT_THAT(NamesIn("/volume1/photos/@eaDir"), ElementsAre("VANO@.fileindexdb"));
}

TEST_F(DatabaseLocationTest, TheDirectoryHasTheModeThatTheUmaskLeaves) {
    for (const mode_t mask : {022U, 0U, 077U}) {
        const UmaskScope scope(mask);
        RemoveTree(database);
        EXPECT_GT(FILEIDXDBPathGet("photos", buffer, sizeof(buffer)), 0);
        EXPECT_EQ(ModeOf(database), 0777U & ~mask);
    }
}

TEST_F(DatabaseLocationTest, WithoutMemoryForTheMessageTheAnswerIsTheFailureValue) {
    Fault::On(Call::Mkdir, [](CallInfo &) {
        ArmMemoryFault({1, false});
        errno = ENOENT;
        return std::optional<long>(-1);
    });
    int result = 0;
    EXPECT_NO_THROW(result = FILEIDXDBPathGet("photos", buffer, sizeof(buffer)));
    EXPECT_GT(DisarmMemoryFault(), 0);
    EXPECT_EQ(result, -1);
}

TEST_F(DatabaseLocationTest, WhateverExistsThereIsFine) {
    PutFile(database, "a file");
    EXPECT_GT(FILEIDXDBPathGet("photos", buffer, sizeof(buffer)), 0);
    EXPECT_EQ(ReadText(database), "a file");
    ExpectLog({});
}

TEST_F(DatabaseLocationTest, ADirectoryThatCannotBeMadeIsLoggedOnly) {
    Fault::Fail(Call::Mkdir, EROFS);
    EXPECT_EQ(FILEIDXDBPathGet("photos", buffer, sizeof(buffer)),
              static_cast<int>(database.size()));
    EXPECT_EQ(std::string(buffer), database);
    ExpectLog({"utils:750 mkdir failed, path=" + database + ", reason=Read-only file system"});
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(DatabaseLocationTest, BothFailuresAreLoggedInOrder) {
    platform.AnswerAlways("VANOEAMKDir", -1);
    EXPECT_GT(FILEIDXDBPathGet("photos", buffer, sizeof(buffer)), 0);
    ExpectLog({"utils:743 VANOEAMKDir failed, path=/volume1/photos/@eaDir, code=0",
               "utils:750 mkdir failed, path=" + database + ", reason=No such file or directory"});
}

TEST_F(DatabaseLocationTest, ACutPathIsTheDirectoryThatIsMade) {
    const std::string cut = "/volume1/photos/@eaDir/VANO";
    EXPECT_EQ(FILEIDXDBPathGet("photos", buffer, static_cast<int>(cut.size() + 1)),
              static_cast<int>(cut.size()));
    EXPECT_THAT(NamesIn("/volume1/photos/@eaDir"), ElementsAre("VANO"));
}

class QueueLocationTest : public DatabaseLocationTest {};

TEST_F(QueueLocationTest, TheQueueItselfIsNotMade) {
    Fault::Count(Call::Mkdir);
    EXPECT_GT(FILEIDXQueuePathGet("photos", buffer, sizeof(buffer)), 0);
    EXPECT_EQ(Fault::Calls(Call::Mkdir), 0U);
    EXPECT_THAT(NamesIn("/volume1/photos/@eaDir"), IsEmpty());
}

} // namespace

} // namespace VANO::TESTS
