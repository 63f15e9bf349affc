#include <fileindex/index_rules.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/vano_platform.h"
#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

constexpr int kRefusedType = 12;

class IndexRulesTest : public LibraryTest {
  protected:
    // CanShareBeIndexed() of the record that the platform has for the name.
    static bool CanBeIndexed(const std::string &name) {
        _tag_VANOSHARE *share = nullptr;
        EXPECT_EQ(VANOShareGet(name.c_str(), &share), 0);
        const bool result = CanShareBeIndexed(share);
        VANOShareFree(share);
        return result;
    }
};

// --- shares ---

TEST_F(IndexRulesTest, AnOrdinaryShareCanBeIndexed) {
    platform.AddShare("photos", kPhotos);
    EXPECT_TRUE(CanBeIndexed("photos"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(IndexRulesTest, NoShareCannotBeIndexed) {
    EXPECT_FALSE(CanShareBeIndexed(nullptr));
    EXPECT_THAT(platform.Trace(), IsEmpty());
}

TEST_F(IndexRulesTest, ExcludedSharesAreKnownByTheirExactNames) {
    struct Row {
        const char *name;
        bool expected;
    };
    const Row rows[] = {{"surveillance", false}, {"NetBackup", false},    {"Surveillance", true},
                        {"netBackup", true},     {"netbackup", true},     {"surveillance2", true},
                        {"surveillanc", true},   {" surveillance", true}, {"NetBackup ", true}};
    for (const Row &row : rows) {
        platform.AddShare(row.name, std::string("/volume1/") + row.name);
        EXPECT_EQ(CanBeIndexed(row.name), row.expected) << row.name;
    }
}

TEST_F(IndexRulesTest, AnExcludedShareIsNotAskedAbout) {
    platform.AddShare("surveillance", "/volume1/surveillance");
    EXPECT_FALSE(CanBeIndexed("surveillance"));
    EXPECT_EQ(platform.Calls("VLIBShareIsEncryptedGet"), 0U);
    EXPECT_EQ(platform.Calls("VLIBShareIsReadOnlyGet"), 0U);
}

TEST_F(IndexRulesTest, EncryptedAndReadOnlySharesCannotBeIndexed) {
    for (const bool encrypted : {false, true}) {
        for (const bool readOnly : {false, true}) {
            platform.Reset();
            FakeShare &share = platform.AddShare("photos", kPhotos);
            share.encrypted = encrypted;
            share.readOnly = readOnly;
            EXPECT_EQ(CanBeIndexed("photos"), !encrypted && !readOnly)
                << encrypted << " " << readOnly;
        }
    }
    ExpectLog({});
}

TEST_F(IndexRulesTest, BothPropertiesAreAskedBeforeEitherIsLookedAt) {
    platform.AddShare("photos", kPhotos).encrypted = true;
    EXPECT_FALSE(CanBeIndexed("photos"));
    EXPECT_THAT(platform.Trace(),
                ElementsAre("VANOShareGet(photos)", "VLIBShareIsEncryptedGet(photos)",
                            "VLIBShareIsReadOnlyGet(photos)", "VANOShareFree(photos)"));
}

TEST_F(IndexRulesTest, APropertyThatCannotBeReadRefuses) {
    platform.AddShare("photos", kPhotos);
    for (const char *property : {"VLIBShareIsEncryptedGet", "VLIBShareIsReadOnlyGet"}) {
        for (const int failure : {-1, -2}) {
            platform.Answer(property, {failure});
            EXPECT_FALSE(CanBeIndexed("photos")) << property << failure;
        }
        platform.Answer(property, {1}); // not negative: read
        EXPECT_TRUE(CanBeIndexed("photos")) << property;
    }
    platform.AnswerAlways("VLIBShareIsEncryptedGet", -1);
    platform.AnswerAlways("VLIBShareIsReadOnlyGet", -1);
    EXPECT_FALSE(CanBeIndexed("photos"));
    ExpectLog({});
}

TEST_F(IndexRulesTest, ASharesEncryptionInUseDoesNotMatter) {
    platform.AddShare("photos", kPhotos).encryption = true;
    EXPECT_TRUE(CanBeIndexed("photos"));
    EXPECT_EQ(platform.Calls("VLIBShareIsEncryptionGet"), 0U);
}

// --- reserved names ---

TEST_F(IndexRulesTest, ReservedNamesAreKnownExactly) {
    struct Row {
        const char *name;
        bool expected;
    };
    const Row rows[] = {{".TemporaryItems", true},
                        {"VANO@.fileindexdb", true},
                        {"VANO@file_index_queue", true},
                        {".VANOPPSDB", true},
                        {".DS_Store", true},
                        {"@eaDir", true}, // the platform's
                        {".ds_store", false},
                        {".DS_Store2", false},
                        {"DS_Store", false},
                        {"vano@.fileindexdb", false},
                        {"VANO@file_index_queue.tmp", false},
                        {"/.DS_Store", false},
                        {"photo.jpg", false},
                        {"", false},
                        {"\xff\xfe", false}};
    for (const Row &row : rows) {
        EXPECT_EQ(IsSystemPreservedFileName(row.name), row.expected) << row.name;
    }
}

TEST_F(IndexRulesTest, OnlyTheAnswerOneMeansAHiddenDirectory) {
    for (const int answer : {0, -1, 2, 100}) {
        platform.Answer("VANOEAIsHiddenDir", {answer});
        EXPECT_FALSE(IsSystemPreservedFileName("name")) << answer;
    }
    platform.Answer("VANOEAIsHiddenDir", {1});
    EXPECT_TRUE(IsSystemPreservedFileName("name"));
}

TEST_F(IndexRulesTest, ThePlatformIsAskedBeforeTheListOfNames) {
    EXPECT_TRUE(IsSystemPreservedFileName(".DS_Store"));
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOEAIsHiddenDir(.DS_Store)"));
}

// --- left out of the index ---

class SkipTest : public IndexRulesTest {};

TEST_F(SkipTest, AnOrdinaryFileIsNotLeftOut) {
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/a.jpg"));
}

TEST_F(SkipTest, TheFileSystemIsAskedFirst) {
    EXPECT_TRUE(IsSkipIndex("noslash"));
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOGetFSType(noslash, 0)"));
}

TEST_F(SkipTest, TheRulesAreAskedInTheirOrder) {
    EXPECT_FALSE(IsSkipIndex("/v/#snapshot/#recycle/a"));
    EXPECT_THAT(platform.Trace(),
                ElementsAre("VANOGetFSType(/v/#snapshot/#recycle/a, 0)", "VANOEAIsHiddenDir(a)",
                            "VANOShareIsShareRecycle(/v/#snapshot/#recycle/a)",
                            "VLIBFhsPathInSnapshot(/v/#snapshot/#recycle/a)", "VANOFSIsRemoteFS(1)",
                            "VANOFSIsImageFS(1)"));
}

TEST_F(SkipTest, ANameWithoutSlashIsLeftOut) {
    EXPECT_TRUE(IsSkipIndex("noslash"));
    EXPECT_TRUE(IsSkipIndex(""));
}

TEST_F(SkipTest, OnlyTheLastComponentIsLookedUpAsAReservedName) {
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/.DS_Store"));
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/@eaDir"));
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/.DS_Store/a"));
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/@eaDir/"));
}

TEST_F(SkipTest, ARecycleBinTakesTheNameAndThePlatformsWord) {
    platform.recyclePaths = {"/volume1/photos/#recycle/a", "/volume1/photos/plain"};
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/#recycle/a"));
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/x#recycled/a"));
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/plain"));
    EXPECT_EQ(platform.Calls("VANOShareIsShareRecycle"), 2U); // not about the plain path
    platform.AnswerAlways("VANOShareIsShareRecycle", -1);
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/#recycle/b")); // any answer but 0
}

TEST_F(SkipTest, ASnapshotTakesTheNameAndThePlatformsWord) {
    platform.snapshotPaths = {"/volume1/photos/#snapshot/a", "/volume1/photos/plain"};
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/#snapshot/a"));
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/#snapshots"));
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/plain"));
    EXPECT_EQ(platform.Calls("VLIBFhsPathInSnapshot"), 2U);
    for (const int failure : {-1, 1}) { // with the flag set; 0 alone is success
        platform.AnswerAlways("VLIBFhsPathInSnapshot", failure);
        EXPECT_FALSE(IsSkipIndex("/volume1/photos/#snapshot/a")) << failure;
    }
}

TEST_F(SkipTest, EarlierRulesHoldOnAnUnknownFileSystemToo) {
    platform.fileSystemType = -1;
    platform.recyclePaths = {"/v/#recycle"};
    platform.snapshotPaths = {"/v/#snapshot"};
    EXPECT_TRUE(IsSkipIndex("noslash"));
    EXPECT_TRUE(IsSkipIndex("/v/.DS_Store"));
    EXPECT_TRUE(IsSkipIndex("/v/#recycle"));
    EXPECT_TRUE(IsSkipIndex("/v/#snapshot"));
}

TEST_F(SkipTest, AnUnknownFileSystemIsNotLeftOutAndNotAskedAboutFurther) {
    platform.fileSystemType = -1;
    platform.remoteType = -1;
    platform.imageType = -1;
    EXPECT_FALSE(IsSkipIndex("/volume1/photos/a"));
    EXPECT_EQ(platform.Calls("VANOFSIsRemoteFS"), 0U);
    EXPECT_EQ(platform.Calls("VANOFSIsImageFS"), 0U);
}

TEST_F(SkipTest, RemoteImageAndRefusedFileSystemsAreLeftOut) {
    for (const int type : {platform.remoteType, platform.imageType, kRefusedType}) {
        platform.fileSystemType = type;
        EXPECT_TRUE(IsSkipIndex("/volume1/photos/a")) << type;
    }
    for (const int type : {0, 1, 11, 13}) {
        platform.fileSystemType = type;
        EXPECT_FALSE(IsSkipIndex("/volume1/photos/a")) << type;
    }
    platform.AnswerAlways("VANOFSIsRemoteFS", -1);
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/a")); // any answer but 0
}

TEST_F(SkipTest, NothingIsLoggedAndNoErrorSet) {
    platform.fileSystemType = kRefusedType;
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/a"));
    EXPECT_TRUE(IsSkipIndex("\xff"));
    EXPECT_TRUE(IsSkipIndex("/" + std::string(5000, 'a')));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({});
}

TEST_F(SkipTest, EveryAnswerButZeroMeansAnImage) {
    platform.AnswerAlways("VANOFSIsImageFS", -1);
    EXPECT_TRUE(IsSkipIndex("/volume1/photos/a"));
}

// --- room on a share ---

class SpaceTest : public IndexRulesTest {};

TEST_F(SpaceTest, TenMebibytesOfTheSharesDirectoryAreAskedFor) {
    platform.AddShare("photos", kPhotos);
    EXPECT_TRUE(IsShareSpaceEnough("photos"));
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOShareGet(photos)",
                                              "VANOQuotaIsEnough(0, /volume1/photos, 10485760)",
                                              "VANOShareFree(photos)"));
}

TEST_F(SpaceTest, OnlyAFullVolumeOrQuotaMeansNoRoom) {
    platform.AddShare("photos", kPhotos);
    platform.quotaIsEnough = false;
    struct Row {
        int error;
        bool expected;
    };
    for (const Row &row :
         {Row{0x2900, false}, Row{0x2400, false}, Row{0, true}, Row{0x0D00, true}, Row{-1, true}}) {
        platform.lastError = row.error;
        EXPECT_EQ(IsShareSpaceEnough("photos"), row.expected) << row.error;
    }
    ExpectLog({});
}

TEST_F(SpaceTest, TheReasonIsReadAnewForEachComparison) {
    platform.AddShare("photos", kPhotos);
    platform.quotaIsEnough = false;
    platform.Answer("VLIBCErrGet", {0x2900});
    EXPECT_FALSE(IsShareSpaceEnough("photos"));
    EXPECT_EQ(platform.Calls("VLIBCErrGet"), 1U);
    platform.Answer("VLIBCErrGet", {0, 0x2400});
    EXPECT_FALSE(IsShareSpaceEnough("photos"));
    EXPECT_EQ(platform.Calls("VLIBCErrGet"), 3U);
    platform.Answer("VLIBCErrGet", {0x2400, 0x2900});
    EXPECT_TRUE(IsShareSpaceEnough("photos"));
}

TEST_F(SpaceTest, ANonZeroAnswerNeedsNoReason) {
    platform.AddShare("photos", kPhotos);
    platform.lastError = 0x2900;
    platform.Answer("VANOQuotaIsEnough", {-1});
    EXPECT_TRUE(IsShareSpaceEnough("photos"));
    EXPECT_EQ(platform.Calls("VLIBCErrGet"), 0U);
}

TEST_F(SpaceTest, TheLastErrorIsKept) {
    platform.AddShare("photos", kPhotos);
    ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
    EXPECT_TRUE(IsShareSpaceEnough("photos"));
    platform.quotaIsEnough = false;
    platform.lastError = 0x2900;
    EXPECT_FALSE(IsShareSpaceEnough("photos"));
    ExpectError(FILEINDEX_ERR_SAVE);
}

TEST_F(SpaceTest, AnUnknownShareHasNoRoomAndIsLogged) {
    EXPECT_FALSE(IsShareSpaceEnough("none"));
    ExpectLog({"utils:361 VANOShareGet failed, share=none"});
    EXPECT_FALSE(IsShareSpaceEnough(""));
    ExpectLog({"utils:361 VANOShareGet failed, share="});
    EXPECT_FALSE(IsShareSpaceEnough("\xff\n%s"));
    ExpectLog({"utils:361 VANOShareGet failed, share=\xff\n%s"});
    ExpectError(FILEINDEX_ERR_NONE);
    EXPECT_EQ(platform.Calls("VANOQuotaIsEnough"), 0U);
}

// --- full paths ---

class FullPathTest : public IndexRulesTest {
  protected:
    void SetUp() override {
        IndexRulesTest::SetUp();
        platform.AddShare("photos", kPhotos);
        MakeDirs("/volume1/photos/trip");
    }
};

TEST_F(FullPathTest, AnOrdinaryFolderCanBeIndexed) {
    EXPECT_TRUE(CanFullPathBeIndexed("/volume1/photos/trip"));
    EXPECT_TRUE(CanFullPathBeIndexed(kPhotos));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(FullPathTest, TheChecksRunInTheirOrder) {
    Fault::Record(Call::Realpath);
    EXPECT_TRUE(CanFullPathBeIndexed(kPhotos));
    EXPECT_THAT(
        platform.Trace(),
        ElementsAre("VANOGetFSType(/volume1/photos, 0)", "VANOFSIsRemoteFS(1)",
                    "VANOFSIsImageFS(1)", "VANOShareNamePathGet(/volume1/photos, 492, 4096)",
                    "VANOShareGet(photos)", "VLIBShareIsEncryptedGet(photos)",
                    "VLIBShareIsReadOnlyGet(photos)", "VANOFSDirIsMntPoint(/volume1/photos)",
                    "realpath(/volume1/photos)", "VANOShareFree(photos)"));
}

TEST_F(FullPathTest, TheRecycleBinIsAskedAboutBeforeTheSnapshot) {
    const std::string path = "/volume1/photos/#snapshot/#recycle";
    platform.snapshotPaths = {path};
    EXPECT_FALSE(CanFullPathBeIndexed(path));
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOShareIsShareRecycle(" + path + ")",
                                              "VLIBFhsPathInSnapshot(" + path + ")"));
}

TEST_F(FullPathTest, ARecycleBinIsRefusedSilentlyBeforeAnythingElse) {
    const std::string path = "/volume1/photos/#recycle";
    MakeDirs(path);
    platform.recyclePaths = {path};
    EXPECT_FALSE(CanFullPathBeIndexed(path));
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOShareIsShareRecycle(" + path + ")"));
    platform.recyclePaths.clear();
    EXPECT_TRUE(CanFullPathBeIndexed(path)); // merely called so
}

TEST_F(FullPathTest, ASnapshotIsRefusedSilentlyBeforeTheFileSystem) {
    const std::string path = "/volume1/photos/#snapshot";
    MakeDirs(path);
    platform.snapshotPaths = {path};
    EXPECT_FALSE(CanFullPathBeIndexed(path));
    EXPECT_EQ(platform.Calls("VANOGetFSType"), 0U);
    platform.Answer("VLIBFhsPathInSnapshot", {-1}); // fails, with the flag set
    EXPECT_TRUE(CanFullPathBeIndexed(path));
    platform.Answer("VLIBFhsPathInSnapshot", {1}); // 0 alone is success
    EXPECT_TRUE(CanFullPathBeIndexed(path));
    platform.snapshotPaths.clear();
    EXPECT_TRUE(CanFullPathBeIndexed(path));
}

TEST_F(FullPathTest, RecycleAndSnapshotAreAskedOnlyAboutPathsWithTheirNames) {
    platform.recyclePaths = {kPhotos};
    platform.snapshotPaths = {kPhotos};
    EXPECT_TRUE(CanFullPathBeIndexed(kPhotos));
}

TEST_F(FullPathTest, UnknownRemoteImageAndRefusedFileSystemsAreRefusedSilently) {
    for (const int type : {-1, platform.remoteType, platform.imageType, kRefusedType}) {
        platform.fileSystemType = type;
        EXPECT_FALSE(CanFullPathBeIndexed(kPhotos)) << type;
    }
    EXPECT_EQ(platform.Calls("VANOShareNamePathGet"), 0U);
    for (const int type : {0, 1, 11, 13}) {
        platform.fileSystemType = type;
        EXPECT_TRUE(CanFullPathBeIndexed(kPhotos)) << type;
    }
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({});
}

TEST_F(FullPathTest, APathInNoShareIsRefusedWithBothMessages) {
    for (const std::string &path :
         {std::string("/etc"), std::string(""), "/volume1/" + std::string(4096, 'a'),
          std::string("/\xff\xfe%s")}) {
        EXPECT_FALSE(CanFullPathBeIndexed(path));
        ExpectError(FILEINDEX_ERR_PATH);
        ExpectLog({"utils:418 VANOShareNamePathGet failed, path=" + path,
                   "utils:239 GetShareNamePathByFullPath failed, path=" + path});
    }
    EXPECT_EQ(platform.Calls("VANOShareGet"), 0U);
}

TEST_F(FullPathTest, AShareThatIsGoneIsRefusedWithItsName) {
    platform.Answer("VANOShareGet", {-1});
    EXPECT_FALSE(CanFullPathBeIndexed("/volume1/photos/trip"));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"utils:245 VANOShareGet failed, share=photos"});
}

TEST_F(FullPathTest, AShareThatCannotBeIndexedRefusesSilently) {
    platform.FindShare("photos")->readOnly = true;
    EXPECT_FALSE(CanFullPathBeIndexed("/volume1/photos/trip"));
    EXPECT_EQ(platform.Calls("VANOFSDirIsMntPoint"), 0U);
    ExpectLog({});
}

TEST_F(FullPathTest, AnExcludedShareRefusesSilently) {
    platform.AddShare("NetBackup", "/volume1/NetBackup");
    MakeDirs("/volume1/NetBackup");
    EXPECT_FALSE(CanFullPathBeIndexed("/volume1/NetBackup"));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({});
}

TEST_F(FullPathTest, AnAllowedFolderKeepsTheLastError) {
    ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
    EXPECT_TRUE(CanFullPathBeIndexed("/volume1/photos/trip"));
    EXPECT_TRUE(CanPathBeIndexed("/photos/trip"));
    ExpectError(FILEINDEX_ERR_SAVE);
}

TEST_F(FullPathTest, EveryAnswerButZeroMeansARecycleBinOrAFileSystemThatIsRefused) {
    const std::string path = "/volume1/photos/#recycle";
    MakeDirs(path);
    for (const char *question :
         {"VANOShareIsShareRecycle", "VANOFSIsRemoteFS", "VANOFSIsImageFS"}) {
        for (const int answer : {-1, 1, 2}) {
            platform.Answer(question, {answer});
            EXPECT_FALSE(CanFullPathBeIndexed(path)) << question << answer;
        }
    }
    EXPECT_TRUE(CanFullPathBeIndexed(path));
}

TEST_F(FullPathTest, AMountPointIsRefusedUnlessItsShareUsesEncryption) {
    const std::string path = "/volume1/photos/trip";
    platform.mountPoints = {path};
    EXPECT_FALSE(CanFullPathBeIndexed(path));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"utils:256 Mount point[/volume1/photos/trip] is not allowed to be indexed"});
    platform.FindShare("photos")->encryption = true;
    EXPECT_TRUE(CanFullPathBeIndexed(path));
    platform.FindShare("photos")->encryption = false;
    for (const int failure : {-1, 1}) {
        platform.Answer("VLIBShareIsEncryptionGet", {failure});
        EXPECT_TRUE(CanFullPathBeIndexed(path)) << failure;
    }
}

TEST_F(FullPathTest, OnlyTheAnswerOneMeansAMountPoint) {
    for (const int answer : {0, -1, 2}) {
        platform.Answer("VANOFSDirIsMntPoint", {answer});
        EXPECT_TRUE(CanFullPathBeIndexed(kPhotos)) << answer;
    }
    EXPECT_EQ(platform.Calls("VLIBShareIsEncryptionGet"), 0U);
}

TEST_F(FullPathTest, ADetourInThePathIsRefused) {
    // /volume1/photos/trip/a
    //                 link, tri -> trip
    MakeDirs("/volume1/photos/trip/a");
    ASSERT_EQ(::symlink("trip", "/volume1/photos/tri"), 0);
    ASSERT_EQ(::symlink("trip", "/volume1/photos/link"), 0);
    for (const char *path :
         {"/volume1/photos/", "/volume1/photos/trip/", "/volume1/photos//trip",
          "/volume1/photos/./trip", "/volume1/photos/trip/../trip", "/volume1/photos/link",
          "/volume1/photos/link/a", "/volume1/photos/tri", "/volume1/photos/none",
          "/volume1/photos/trip/."}) {
        EXPECT_FALSE(CanFullPathBeIndexed(path)) << path;
        ExpectError(FILEINDEX_ERR_NONE);
        ExpectLog({std::string("utils:263 check realpath failed, path=") + path});
    }
}

TEST_F(FullPathTest, ALongOrStrangePathIsAnAnswerAndNoCrash) {
    const std::string strange = "/volume1/photos/\xff\xfe \n%s";
    MakeDirs(strange);
    EXPECT_TRUE(CanFullPathBeIndexed(strange));
    const std::string path = "/volume1/photos/" + std::string(4096, 'a');
    EXPECT_FALSE(CanFullPathBeIndexed(path));
    ExpectLog({"utils:263 check realpath failed, path=" + path});
}

TEST_F(FullPathTest, APathOf4095BytesIsRead) {
    std::string path = kPhotos;
    while (path.size() + 202 < 4095) {
        path += "/" + std::string(200, 'd');
    }
    path += "/" + std::string(4095 - path.size() - 1, 'e');
    ASSERT_EQ(path.size(), 4095U);
    // The system takes no path of that length, so it is made step by step.
    char *before = ::getcwd(nullptr, 0);
    ASSERT_EQ(::chdir(kPhotos), 0);
    std::size_t start = std::string(kPhotos).size() + 1;
    while (start < path.size()) {
        const std::size_t end = std::min(path.find('/', start), path.size());
        const std::string name = path.substr(start, end - start);
        ASSERT_EQ(::mkdir(name.c_str(), 0755), 0);
        ASSERT_EQ(::chdir(name.c_str()), 0);
        start = end + 1;
    }
    ASSERT_EQ(::chdir(before), 0);
    std::free(before);
    EXPECT_TRUE(CanFullPathBeIndexed(path));
}

TEST_F(FullPathTest, ARealpathThatFailsRefuses) {
    Fault::FailAlways(Call::Realpath, EIO);
    EXPECT_FALSE(CanFullPathBeIndexed(kPhotos));
    ExpectLog({"utils:263 check realpath failed, path=/volume1/photos"});
}

// --- share paths ---

TEST_F(FullPathTest, ASharePathIsResolvedAndChecked) {
    EXPECT_TRUE(CanPathBeIndexed("/photos/trip"));
    EXPECT_TRUE(CanPathBeIndexed("/photos"));
    EXPECT_FALSE(CanPathBeIndexed("/photos/"));
    ExpectLog({"utils:263 check realpath failed, path=/volume1/photos/"});
    platform.FindShare("photos")->encrypted = true;
    EXPECT_FALSE(CanPathBeIndexed("/photos/trip"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(FullPathTest, ASharePathThatCannotBeResolvedIsLoggedWithTheError) {
    EXPECT_FALSE(CanPathBeIndexed("/none/a"));
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog({"utils:191 GetFullPath failed, path=/none/a"});
    EXPECT_FALSE(CanPathBeIndexed(""));
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog(
        {"utils:389 GetShareNameByPath failed, path=", "utils:191 GetFullPath failed, path="});
    EXPECT_EQ(platform.Calls("VANOGetFSType"), 0U);
}

// --- the governing setting ---

Folder FolderAt(const std::string &fullPath, const std::string &name) {
    Folder folder;
    folder.full_path = fullPath;
    folder.path = "/share" + fullPath;
    folder.name = name;
    return folder;
}

class GoverningTest : public IndexRulesTest {
  protected:
    static std::string NameOf(const Json::Value &setting) {
        return setting.isMember("name") ? setting["name"].asString() : setting.toStyledString();
    }
};

TEST_F(GoverningTest, WithoutASettingNothingGoverns) {
    EXPECT_EQ(GetMostSuitableCfg({}, "/volume1/a"), Json::Value(Json::objectValue));
    EXPECT_EQ(GetMostSuitableCfg({FolderAt("/volume1/b", "b")}, "/volume1/a"),
              Json::Value(Json::objectValue));
}

TEST_F(GoverningTest, TheSettingComesAsItsJson) {
    Folder folder = FolderAt("/volume1/a", "a");
    folder.video = true;
    EXPECT_EQ(GetMostSuitableCfg({folder}, "/volume1/a/b"),
              Json(R"({"path":"/share/volume1/a","name":"a","document":false,"audio":false,
                       "video":true,"photo":false})"));
}

TEST_F(GoverningTest, TheLastFolderThatContainsThePathWins) {
    const Folder outer = FolderAt("/volume1/a", "outer");
    const Folder inner = FolderAt("/volume1/a/b", "inner");
    EXPECT_EQ(NameOf(GetMostSuitableCfg({outer, inner}, "/volume1/a/b/c")), "inner");
    EXPECT_EQ(NameOf(GetMostSuitableCfg({inner, outer}, "/volume1/a/b/c")), "outer");
    EXPECT_EQ(NameOf(GetMostSuitableCfg({outer, inner}, "/volume1/a/x")), "outer");
    EXPECT_EQ(
        NameOf(GetMostSuitableCfg({outer, inner, FolderAt("/volume1/z", "z")}, "/volume1/a/b")),
        "inner");
}

TEST_F(GoverningTest, WholeComponentsAreCompared) {
    const std::vector<Folder> folders = {FolderAt("/volume1/a/b", "b")};
    struct Row {
        const char *path;
        bool expected;
    };
    const Row rows[] = {{"/volume1/a/b", true},    {"/volume1/a/b/c", true},
                        {"/volume1/a/b/", true},   {"/volume1/a/bc", false},
                        {"/volume1/a", false},     {"/volume1/a/B", false},
                        {"/volume1/a/b c", false}, {"", false}};
    for (const Row &row : rows) {
        EXPECT_EQ(GetMostSuitableCfg(folders, row.path).isMember("name"), row.expected) << row.path;
    }
}

TEST_F(GoverningTest, ATrailingSlashOfTheSettingIsAComponentOfItsOwn) {
    const std::vector<Folder> folders = {FolderAt("/volume1/a/", "a")};
    struct Row {
        const char *path;
        bool expected;
    };
    for (const Row &row : {Row{"/volume1/a/", true}, Row{"/volume1/a//b", true},
                           Row{"/volume1/a", false}, Row{"/volume1/a/b", false}}) {
        EXPECT_EQ(GetMostSuitableCfg(folders, row.path).isMember("name"), row.expected) << row.path;
    }
}

TEST_F(GoverningTest, AnUncachedFullPathIsResolved) {
    platform.AddShare("photos", kPhotos);
    Folder folder;
    folder.path = "/photos/a";
    folder.name = "a";
    EXPECT_EQ(NameOf(GetMostSuitableCfg({folder}, "/volume1/photos/a/b")), "a");
}

TEST_F(GoverningTest, AFolderThatNoLongerResolvesGovernsNothing) {
    Folder gone;
    gone.path = "/none/a";
    for (const char *path : {"/volume1/photos/a", "", "/", "/none/a"}) {
        EXPECT_EQ(GetMostSuitableCfg({gone}, path), Json("{}")) << path;
        ExpectLog({"folder:16 Failed to get full path from /none/a"});
    }
    EXPECT_EQ(NameOf(GetMostSuitableCfg({FolderAt("/volume1/a", "a"), gone}, "/volume1/a")), "a");
    ExpectLog({"folder:16 Failed to get full path from /none/a"});
}

} // namespace

} // namespace VANO::TESTS
