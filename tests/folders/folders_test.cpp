#include <fileindex/folders.h>

#include <cerrno>
#include <map>
#include <sys/file.h>
#include <type_traits>

#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

constexpr std::size_t kMostFolders = 1000;
constexpr char kAllChanged[] = R"({"document":true,"audio":true,"video":true,"photo":true})";
constexpr char kNoneChanged[] = R"({"document":false,"audio":false,"video":false,"photo":false})";

static_assert(std::is_base_of_v<Config, Folders>);
// Ordered by the bytes of the paths.
static_assert(std::is_same_v<decltype(Folders::folders), std::map<std::string, Folder>>);

// The shares of every test: photos and music on /volume1, video on /volume2.
class FoldersTest : public LibraryTest {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        platform.AddShare("photos", "/volume1/photos");
        platform.AddShare("music", "/volume1/music");
        platform.AddShare("video", "/volume2/video");
    }

    static void Insert(Folders &folders, const std::string &request) {
        Json::Value changes;
        EXPECT_TRUE(folders.Upsert(changes, Json(request))) << request;
    }

    static std::vector<std::string> PathsOf(const std::vector<Folder> &list) {
        std::vector<std::string> paths;
        for (const Folder &folder : list) {
            paths.push_back(folder.path);
        }
        return paths;
    }

    static std::vector<std::string> KeysOf(const Folders &folders) {
        std::vector<std::string> keys;
        for (const auto &[key, folder] : folders.folders) {
            keys.push_back(key);
        }
        return keys;
    }
};

TEST_F(FoldersTest, TheFilesAreFixed) {
    const Folders folders;
    EXPECT_EQ(folders.GetPath(), "/usr/vano/etc/fileindex/folder.conf");
    EXPECT_EQ(folders.GetLockPath(), "/tmp/fileidx_cfg_folder.lock");
}

TEST_F(FoldersTest, ANewObjectIsEmptyAndUnlocked) {
    const Folders folders;
    EXPECT_THAT(folders.folders, IsEmpty());
    EXPECT_EQ(folders.root, Json("{}"));
    EXPECT_EQ(folders.lock_fd, -1);
}

TEST_F(FoldersTest, DestructionDoesNotUnlock) {
    int fd = -1;
    {
        Folders folders;
        ASSERT_TRUE(folders.Lock(true));
        fd = folders.lock_fd;
    }
    EXPECT_TRUE(IsLocked(kFolderLock));
    EXPECT_EQ(::flock(fd, LOCK_UN), 0);
    ExpectLeakedDescriptors(1);
}

TEST_F(FoldersTest, ASuccessKeepsTheLastError) {
    ErrorHandler::SetError(FILEINDEX_ERR_LOCK);
    Folders folders;
    EXPECT_TRUE(folders.Load());
    Insert(folders, R"({"path":"/photos/a"})");
    Insert(folders, R"({"path":"/photos/a","photo":true})");
    Json::Value out;
    EXPECT_TRUE(folders.Get(out, "/photos/a"));
    std::vector<Folder> list;
    EXPECT_TRUE(folders.List(list, "photos"));
    EXPECT_TRUE(folders.List(out, 0, 10, "", "", Json("[]")));
    EXPECT_TRUE(folders.Delete(out, "/photos/a"));
    EXPECT_TRUE(folders.Save());
    EXPECT_TRUE(Folders().Load());
    ExpectError(FILEINDEX_ERR_LOCK);
}

// --- loading ---

TEST_F(FoldersTest, NoFileAndAnEmptyObjectMeanNoSettings) {
    Folders missing;
    EXPECT_TRUE(missing.Load());
    EXPECT_THAT(missing.folders, IsEmpty());
    PutFile(kFolderFile, "{}");
    Folders empty;
    EXPECT_TRUE(empty.Load());
    EXPECT_THAT(empty.folders, IsEmpty());
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(FoldersTest, SettingsAreKeyedByPathInByteOrder) {
    PutFile(kFolderFile, R"({"/video":{},"/photos/a":{"name":"A","audio":true},
                             "/photos":{"photo":true},"/photos-x/b":{},"/photos/B":{}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    EXPECT_THAT(KeysOf(folders),
                ElementsAre("/photos", "/photos-x/b", "/photos/B", "/photos/a", "/video"));
    const Folder &folder = folders.folders.at("/photos/a");
    EXPECT_EQ(folder.path, "/photos/a");
    EXPECT_EQ(folder.full_path, "/volume1/photos/a");
    EXPECT_EQ(folder.name, "A");
    EXPECT_TRUE(folder.audio);
    EXPECT_FALSE(folder.photo);
    ExpectError(FILEINDEX_ERR_PATH); // of "photos-x", whose setting is kept
}

TEST_F(FoldersTest, MissingAndMistypedMembersGetTheirDefaults) {
    PutFile(kFolderFile, R"({"/photos/a":{"name":5,"document":"true","audio":1,"extra":[]},
                             "/photos/b":[],"/photos/c":null,"/photos/d":"text"})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    EXPECT_EQ(folders.folders.size(), 4U);
    for (const auto &[path, folder] : folders.folders) {
        EXPECT_EQ(folder.path, path);
        EXPECT_EQ(folder.name, "") << path;
        EXPECT_FALSE(folder.document || folder.audio || folder.video || folder.photo) << path;
    }
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(FoldersTest, TheMembersNameWinsOverThePathInsideAndSavingMakesThemAgree) {
    PutFile(kFolderFile, R"({"/photos/a":{"path":"/photos/other","name":"A"}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    EXPECT_EQ(folders.folders.at("/photos/a").path, "/photos/a");
    EXPECT_TRUE(folders.Save());
    EXPECT_EQ(ReadJson(kFolderFile)["/photos/a"]["path"], Json::Value("/photos/a"));
}

TEST_F(FoldersTest, ASettingWhoseShareIsGoneIsKept) {
    PutFile(kFolderFile, R"({"/none/a":{"name":"A"}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    EXPECT_EQ(folders.folders.at("/none/a").name, "A");
    EXPECT_EQ(folders.folders.at("/none/a").full_path, "");
    ExpectLog({});
}

TEST_F(FoldersTest, AnEmptyNameIsASettingToo) {
    PutFile(kFolderFile, R"({"":{"name":"A"}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    EXPECT_EQ(folders.folders.at("").name, "A");
    ExpectLog({"utils:389 GetShareNameByPath failed, path="});
}

TEST_F(FoldersTest, LoadingAgainKeepsWhatIsThere) {
    PutFile(kFolderFile, R"({"/photos/a":{"name":"first"}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    PutFile(kFolderFile, R"({"/photos/a":{"name":"second"},"/photos/b":{}})");
    EXPECT_TRUE(folders.Load());
    EXPECT_THAT(KeysOf(folders), ElementsAre("/photos/a", "/photos/b"));
    EXPECT_EQ(folders.folders.at("/photos/a").name, "first");
}

TEST_F(FoldersTest, ATopLevelThatIsNoObjectIsMalformed) {
    struct Row {
        const char *text;
        const char *message;
    };
    const Row rows[] = {{"[]", "[]"},
                        {" [ 1 ] ", "[1]"},
                        {"12", "12"},
                        {"null", "null"},
                        {R"("te\nxt")", R"("te\nxt")"},
                        {"true", "true"},
                        {R"([{"a":"b"}])", R"([{"a":"b"}])"}};
    for (const Row &row : rows) {
        PutFile(kFolderFile, row.text);
        Folders folders;
        EXPECT_FALSE(folders.Load()) << row.text;
        EXPECT_THAT(folders.folders, IsEmpty());
        ExpectError(FILEINDEX_ERR_MALFORMED);
        ExpectLog({std::string("folders:80 Malformed folders: ") + row.message});
    }
}

TEST_F(FoldersTest, AnUnreadableFileFailsToLoad) {
    for (const std::string &text : {std::string(""), std::string("{"), std::string("{} x"),
                                    std::string("{}\0", 3), std::string(R"({"/photos":{},})")}) {
        PutFile(kFolderFile, text);
        Folders folders;
        EXPECT_FALSE(folders.Load()) << text;
        EXPECT_THAT(folders.folders, IsEmpty());
        ExpectError(FILEINDEX_ERR_LOAD);
        ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/folder.conf"});
    }
}

TEST_F(FoldersTest, NamesThatAreNoUtf8ComeBackByteForByte) {
    const std::string path = "/photos/caf\xe9\xff";
    PutFile(kFolderFile, "{\"" + path + "\":{\"name\":\"\xfe\"}}");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    EXPECT_EQ(folders.folders.at(path).name, "\xfe");
    EXPECT_EQ(folders.folders.at(path).full_path, "/volume1" + path);
    EXPECT_TRUE(folders.Save());
    Folders again;
    EXPECT_TRUE(again.Load());
    EXPECT_EQ(again.folders.at(path).name, "\xfe");
}

TEST_F(FoldersTest, EveryShareRecordOfALoadIsReleased) {
    PutFile(kFolderFile, R"({"/photos/a":{},"/photos/b":{},"/none":{},"/music":{}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    EXPECT_EQ(platform.Calls("VANOShareFree"), 3U);
    EXPECT_EQ(platform.LiveRecords(), 0U);
}

// --- saving ---

TEST_F(FoldersTest, SavingWritesExactlyTheSettings) {
    Folders folders;
    folders.root = Json(R"({"stale":1})");
    Insert(folders, R"({"path":"/photos/a","name":"A","photo":true})");
    Insert(folders, R"({"path":"/music"})");
    EXPECT_TRUE(folders.Save());
    EXPECT_EQ(ReadJson(kFolderFile),
              Json(R"({"/photos/a":{"path":"/photos/a","name":"A","document":false,"audio":false,
                                    "video":false,"photo":true},
                       "/music":{"path":"/music","name":"","document":false,"audio":false,
                                 "video":false,"photo":false}})"));
    EXPECT_EQ(ModeOf(kFolderFile), 0644U);
    EXPECT_EQ(folders.root, ReadJson(kFolderFile));
}

TEST_F(FoldersTest, SavingNothingWritesAnEmptyObject) {
    PutFile(kFolderFile, R"({"/photos":{}})");
    Folders folders;
    EXPECT_TRUE(folders.Save());
    EXPECT_EQ(ReadText(kFolderFile), "{}");
}

TEST_F(FoldersTest, AFailedSaveKeepsTheRecordsAndTheFile) {
    PutFile(kFolderFile, R"({"/photos":{}})");
    Folders folders;
    Insert(folders, R"({"path":"/photos/a"})");
    Fault::Fail(Call::Write, ENOSPC);
    EXPECT_FALSE(folders.Save());
    ExpectError(FILEINDEX_ERR_SAVE);
    ExpectLog({"config:38 Failed to save json to /usr/vano/etc/fileindex/folder.conf"});
    EXPECT_THAT(KeysOf(folders), ElementsAre("/photos/a"));
    EXPECT_EQ(ReadText(kFolderFile), R"({"/photos":{}})");
}

// --- one setting ---

TEST_F(FoldersTest, GetGivesTheSettingsJson) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a","name":"A","video":true})");
    Json::Value out = "before";
    EXPECT_TRUE(folders.Get(out, "/photos/a"));
    EXPECT_EQ(out, Json(R"({"path":"/photos/a","name":"A","document":false,"audio":false,
                            "video":true,"photo":false})"));
}

TEST_F(FoldersTest, GetComparesByteForByte) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a"})");
    for (const std::string path : {"/photos/A", "/photos/a/", "/photos", "", "/photos/a\n%s"}) {
        Json::Value out = "before";
        EXPECT_FALSE(folders.Get(out, path)) << path;
        EXPECT_EQ(out, Json::Value("before"));
        ExpectError(FILEINDEX_ERR_NO_SUCH_FOLDER);
        ExpectLog({"folders:191 No such folder: " + path});
    }
}

// --- lists ---

TEST_F(FoldersTest, AnEmptyShareListsEverySettingInByteOrder) {
    Folders folders;
    for (const char *path : {"/video", "/photos/b", "/photos", "/music/x", "/photos/a"}) {
        Insert(folders, std::string(R"({"path":")") + path + R"("})");
    }
    std::vector<Folder> list(3);
    EXPECT_TRUE(folders.List(list));
    EXPECT_THAT(PathsOf(list),
                ElementsAre("/music/x", "/photos", "/photos/a", "/photos/b", "/video"));
    std::vector<Folder> named(3);
    EXPECT_TRUE(folders.List(named, ""));
    EXPECT_EQ(PathsOf(named), PathsOf(list));
}

TEST_F(FoldersTest, AShareListsItsOwnSettingsByItsExactName) {
    Folders folders;
    folders.folders["/photos"].SetPath("/photos");
    folders.folders["/photos/a"].SetPath("/photos/a");
    folders.folders["/photos2/a"].SetPath("/photos2/a");
    folders.folders["/Photos/a"].SetPath("/Photos/a");
    folders.folders["xphotos/a"].SetPath("xphotos/a");
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
    std::vector<Folder> list(1);
    EXPECT_TRUE(folders.List(list, "photos"));
    EXPECT_THAT(PathsOf(list), ElementsAre("/photos", "/photos/a", "xphotos/a"));
    EXPECT_TRUE(folders.List(list, "Photos"));
    EXPECT_THAT(PathsOf(list), ElementsAre("/Photos/a"));
    EXPECT_TRUE(folders.List(list, "none"));
    EXPECT_THAT(list, IsEmpty());
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(FoldersTest, ASettingWithoutAShareNameIsLeftOutSilently) {
    Folders folders;
    folders.folders[""]; // an empty path names no share
    folders.folders["/photos"].SetPath("/photos");
    std::vector<Folder> list;
    EXPECT_TRUE(folders.List(list, "photos"));
    EXPECT_THAT(PathsOf(list), ElementsAre("/photos"));
    ExpectLog({});
    EXPECT_TRUE(folders.List(list));
    EXPECT_EQ(list.size(), 2U);
}

TEST_F(FoldersTest, AListHoldsCopies) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a","name":"A"})");
    std::vector<Folder> list;
    EXPECT_TRUE(folders.List(list));
    list.at(0).name = "changed";
    EXPECT_EQ(folders.folders.at("/photos/a").name, "A");
}

// --- inserting and updating ---

TEST_F(FoldersTest, UpsertInsertsWithDefaultsForWhatTheRequestLacks) {
    Folders folders;
    Json::Value changes = "before";
    EXPECT_TRUE(folders.Upsert(changes, Json(R"({"path":"/photos/a"})")));
    EXPECT_EQ(folders.folders.at("/photos/a").asJson(),
              Json(R"({"path":"/photos/a","name":"","document":false,"audio":false,"video":false,
                       "photo":false})"));
    EXPECT_EQ(folders.folders.at("/photos/a").full_path, "/volume1/photos/a");
    EXPECT_EQ(changes, Json(kAllChanged));
}

TEST_F(FoldersTest, UpsertKeepsFieldsThatTheRequestLacks) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a","name":"A","document":true,"photo":true})");
    Json::Value changes = Json(R"({"stale":1})");
    EXPECT_TRUE(folders.Upsert(changes, Json(R"({"path":"/photos/a","video":true})")));
    EXPECT_EQ(folders.folders.at("/photos/a").asJson(),
              Json(R"({"path":"/photos/a","name":"A","document":true,"audio":false,"video":true,
                       "photo":true})"));
    EXPECT_EQ(changes, Json(R"({"document":false,"audio":false,"video":true,"photo":false})"));
    EXPECT_EQ(folders.folders.size(), 1U);
}

TEST_F(FoldersTest, UpdatingASettingWhoseShareCameBackResolvesItsPath) {
    PutFile(kFolderFile, R"({"/later/a":{"name":"A","photo":true}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    ExpectError(FILEINDEX_ERR_PATH);
    EXPECT_EQ(folders.folders.at("/later/a").full_path, "");
    platform.AddShare("later", "/volume2/later");
    Insert(folders, R"({"path":"/later/a","video":true})");
    const Folder &folder = folders.folders.at("/later/a");
    EXPECT_EQ(folder.full_path, "/volume2/later/a");
    EXPECT_EQ(folder.name, "A");
    EXPECT_TRUE(folder.photo && folder.video);
}

TEST_F(FoldersTest, ASettingWhoseShareIsGoneCannotBeUpdated) {
    PutFile(kFolderFile, R"({"/none/a":{"name":"A"}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    Json::Value changes = "before";
    EXPECT_FALSE(folders.Upsert(changes, Json(R"({"path":"/none/a","name":"B"})")));
    EXPECT_EQ(changes, Json::Value("before"));
    EXPECT_EQ(folders.folders.at("/none/a").name, "A");
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    ExpectLog({R"(folders:129 Bad param: {"name":"B","path":"/none/a"})"});
}

TEST_F(FoldersTest, UpsertIgnoresMistypedFields) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a","name":"A","photo":true})");
    Insert(folders, R"({"path":"/photos/a","name":null,"photo":"false","audio":1})");
    EXPECT_EQ(folders.folders.at("/photos/a").name, "A");
    EXPECT_TRUE(folders.folders.at("/photos/a").photo);
    EXPECT_FALSE(folders.folders.at("/photos/a").audio);
}

TEST_F(FoldersTest, UpsertOfTheSameSettingReportsNoChange) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a","photo":true})");
    Json::Value changes;
    EXPECT_TRUE(folders.Upsert(changes, Json(R"({"path":"/photos/a","photo":true,"name":"N"})")));
    EXPECT_EQ(changes, Json(kNoneChanged));
}

TEST_F(FoldersTest, UpsertReportsAgainstTheSettingThatGovernedBefore) {
    Folders folders;
    Insert(folders, R"({"path":"/photos","photo":true,"audio":true})");
    Insert(folders, R"({"path":"/photos/a/b","video":true})"); // deeper: governs nothing here
    Json::Value changes;
    EXPECT_TRUE(folders.Upsert(changes, Json(R"({"path":"/photos/a","photo":true,"video":true})")));
    EXPECT_EQ(changes, Json(R"({"document":false,"audio":true,"video":true,"photo":false})"));
}

TEST_F(FoldersTest, UpsertComparesWholeComponents) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a","photo":true})");
    Json::Value changes;
    EXPECT_TRUE(folders.Upsert(changes, Json(R"({"path":"/photos/ab","photo":true})")));
    EXPECT_EQ(changes, Json(kAllChanged));
}

TEST_F(FoldersTest, ASettingOfAGoneShareGovernsNothing) {
    PutFile(kFolderFile, R"({"/none":{"photo":true},"":{"photo":true}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    (void)SystemLog::Get().Lines(); // of the two paths that do not resolve
    Json::Value changes;
    EXPECT_TRUE(folders.Upsert(changes, Json(R"({"path":"/photos","photo":true})")));
    EXPECT_EQ(changes, Json(kAllChanged));
    // The old settings are walked through once.
    ExpectLog(
        {"utils:389 GetShareNameByPath failed, path=", "folder:16 Failed to get full path from ",
         "folder:16 Failed to get full path from /none"});
    ErrorHandler::SetError(FILEINDEX_ERR_NONE);
}

TEST_F(FoldersTest, APathIsTakenAsItIsSpelled) {
    platform.ignoreCase = true;
    Folders folders;
    Insert(folders, R"({"path":"/photos/a"})");
    Insert(folders, R"({"path":"/Photos/a"})");
    Insert(folders, R"({"path":"/photos/a/"})");
    EXPECT_THAT(KeysOf(folders), ElementsAre("/Photos/a", "/photos/a", "/photos/a/"));
}

TEST_F(FoldersTest, ARequestWithoutAResolvablePathIsABadParameter) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a"})");
    struct Row {
        const char *request;
        const char *message;
    };
    const Row rows[] = {{"{}", "{}"},
                        {R"({ "name" : "A\nB" })", R"({"name":"A\nB"})"},
                        {R"({"path":12})", R"({"path":12})"},
                        {R"({"path":null})", R"({"path":null})"},
                        {R"({"path":["/photos"]})", R"({"path":["/photos"]})"},
                        {R"({"path":"/none/a"})", R"({"path":"/none/a"})"},
                        {R"({"path":"/"})", R"({"path":"/"})"},
                        {"[]", "[]"},
                        {R"("/photos")", R"("/photos")"},
                        {"null", "null"},
                        {"true", "true"},
                        {"7", "7"}};
    for (const Row &row : rows) {
        Json::Value changes = "before";
        EXPECT_FALSE(folders.Upsert(changes, Json(row.request))) << row.request;
        EXPECT_EQ(changes, Json::Value("before"));
        ExpectError(FILEINDEX_ERR_BAD_PARAM);
        ExpectLog({std::string("folders:129 Bad param: ") + row.message});
    }
    EXPECT_THAT(KeysOf(folders), ElementsAre("/photos/a"));
}

TEST_F(FoldersTest, AnEmptyPathIsABadParameterWithThePathsMessageBefore) {
    Folders folders;
    Json::Value changes;
    EXPECT_FALSE(folders.Upsert(changes, Json(R"({"path":""})")));
    ExpectError(FILEINDEX_ERR_BAD_PARAM);
    ExpectLog(
        {"utils:389 GetShareNameByPath failed, path=", R"(folders:129 Bad param: {"path":""})"});
    EXPECT_THAT(folders.folders, IsEmpty());
}

TEST_F(FoldersTest, TheReportMayReplaceTheRequestItself) {
    Folders folders;
    Json::Value both = Json(R"({"path":"/photos/a","photo":true})");
    EXPECT_TRUE(folders.Upsert(both, both));
    EXPECT_EQ(both, Json(kAllChanged));
    EXPECT_TRUE(folders.folders.at("/photos/a").photo);
}

class FolderLimitTest : public FoldersTest {
  protected:
    void SetUp() override {
        FoldersTest::SetUp();
        for (std::size_t i = 0; i < kMostFolders; ++i) {
            const std::string path = "/photos/" + std::to_string(i);
            folders.folders[path].SetPath(path);
        }
    }

    Folders folders;
};

TEST_F(FolderLimitTest, TheOneThousandthIsTaken) {
    folders.folders.erase("/photos/7");
    Insert(folders, R"({"path":"/photos/7"})");
    EXPECT_EQ(folders.folders.size(), kMostFolders);
}

TEST_F(FolderLimitTest, OneMoreIsRefusedAndStaysInMemory) {
    Json::Value changes = "before";
    EXPECT_FALSE(folders.Upsert(changes, Json(R"({"path":"/photos/new","photo":true})")));
    EXPECT_EQ(changes, Json::Value("before"));
    ExpectError(FILEINDEX_ERR_FOLDER_LIMIT);
    ExpectLog({"folders:140 Exceed max folder size"});
    EXPECT_EQ(folders.folders.size(), kMostFolders + 1);
    EXPECT_TRUE(folders.folders.at("/photos/new").photo);
}

TEST_F(FolderLimitTest, UpdatesAreNeverRefused) {
    for (const char *path : {"/photos/0", "/photos/999"}) {
        Json::Value request(Json::objectValue);
        request["path"] = path;
        request["video"] = true;
        Json::Value changes;
        EXPECT_TRUE(folders.Upsert(changes, request));
        EXPECT_TRUE(folders.folders.at(path).video);
    }
    folders.folders["/photos/one-too-many"].SetPath("/photos/one-too-many");
    Json::Value changes;
    EXPECT_TRUE(folders.Upsert(changes, Json(R"({"path":"/photos/1","video":true})")));
}

TEST_F(FolderLimitTest, AThousandSettingsAreSavedAndLoaded) {
    EXPECT_TRUE(folders.Save());
    Folders loaded;
    EXPECT_TRUE(loaded.Load());
    EXPECT_EQ(loaded.folders.size(), kMostFolders);
}

// --- deleting ---

TEST_F(FoldersTest, DeleteRemovesAndReportsUnderThePath) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a","photo":true})");
    Insert(folders, R"({"path":"/photos/a/b"})");
    Json::Value changes = Json(R"({"/earlier":{}})");
    EXPECT_TRUE(folders.Delete(changes, "/photos/a"));
    EXPECT_THAT(KeysOf(folders), ElementsAre("/photos/a/b"));
    EXPECT_EQ(changes, Json(std::string(R"({"/photos/a":)") + kAllChanged + "}"));
}

TEST_F(FoldersTest, DeleteReportsAgainstTheSettingThatGovernsAfterwards) {
    Folders folders;
    Insert(folders, R"({"path":"/photos","photo":true,"audio":true})");
    Insert(folders, R"({"path":"/photos/a","photo":true,"video":true})");
    Json::Value changes;
    EXPECT_TRUE(folders.Delete(changes, "/photos/a"));
    EXPECT_EQ(changes, Json(R"({"/photos/a":{"document":false,"audio":true,"video":true,
                                             "photo":false}})"));
}

TEST_F(FoldersTest, DeletingWhatIsNotSetReportsNoChangeWhereASettingGoverns) {
    Folders folders;
    Insert(folders, R"({"path":"/photos","photo":true})");
    Json::Value changes;
    EXPECT_TRUE(folders.Delete(changes, "/photos/a"));
    EXPECT_EQ(changes, Json(std::string(R"({"/photos/a":)") + kNoneChanged + "}"));
    EXPECT_TRUE(folders.Delete(changes, "/music/a"));
    EXPECT_EQ(changes, Json(std::string(R"({"/music/a":)") + kAllChanged + "}"));
    EXPECT_THAT(KeysOf(folders), ElementsAre("/photos"));
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(FoldersTest, DeleteComparesByteForByte) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a"})");
    Json::Value changes;
    EXPECT_TRUE(folders.Delete(changes, "/photos/a/"));
    EXPECT_THAT(KeysOf(folders), ElementsAre("/photos/a"));
}

TEST_F(FoldersTest, DeletingAnUnresolvablePathSucceedsWithoutAReport) {
    PutFile(kFolderFile, R"({"/none/a":{}})");
    Folders folders;
    EXPECT_TRUE(folders.Load());
    Json::Value changes = "before";
    EXPECT_TRUE(folders.Delete(changes, "/none/a"));
    EXPECT_EQ(changes, Json::Value("before"));
    EXPECT_THAT(folders.folders, IsEmpty());
    ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
    EXPECT_TRUE(folders.Delete(changes, "/none/b"));
    EXPECT_EQ(changes, Json::Value("before"));
    ExpectError(FILEINDEX_ERR_PATH); // of the resolution
    ExpectLog({});
    ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
    EXPECT_TRUE(folders.Delete(changes, ""));
    EXPECT_EQ(changes, Json::Value("before"));
    ExpectError(FILEINDEX_ERR_SAVE); // none of its own
    ExpectLog({"utils:389 GetShareNameByPath failed, path="});
}

TEST_F(FoldersTest, DeleteMayBeGivenTheRecordsOwnPath) {
    Folders folders;
    Insert(folders, R"({"path":"/photos/a"})");
    Json::Value changes;
    EXPECT_TRUE(folders.Delete(changes, folders.folders.at("/photos/a").path));
    EXPECT_THAT(folders.folders, IsEmpty());
    EXPECT_TRUE(changes.isMember("/photos/a"));
}

TEST_F(FoldersTest, AChangedSettingIsSavedAndLoadedUnderTheLock) {
    Folders folders;
    ASSERT_TRUE(folders.Lock(true));
    EXPECT_TRUE(IsLocked(kFolderLock));
    EXPECT_TRUE(folders.Load());
    Insert(folders, R"({"path":"/photos/a","name":"A"})");
    EXPECT_TRUE(folders.Save());
    folders.Unlock();
    Folders again;
    EXPECT_TRUE(again.Load());
    EXPECT_EQ(again.folders.at("/photos/a").name, "A");
}

} // namespace

} // namespace VANO::TESTS
