#include <fileindex/fileindex.h>
#include <fileindex/index_mgr.h>

#include <new>
#include <thread>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

using namespace std::string_literals;

class MembershipTest : public IndexMgrTest {};

Folder FolderAt(const std::string &path, const std::string &fullPath = "") {
    Folder folder;
    folder.path = path;
    folder.full_path = fullPath;
    return folder;
}

std::vector<std::string> PathsOf(const std::vector<Folder> &folders) {
    std::vector<std::string> paths;
    for (const Folder &folder : folders) {
        paths.push_back(folder.path);
    }
    return paths;
}

TEST_F(MembershipTest, WithoutSettingsNothingIsIndexed) {
    for (const char *settings : {"", "{}"}) {
        SCOPED_TRACE(settings);
        if (*settings != '\0') {
            PutFile(kFolderFile, settings);
        }
        EXPECT_FALSE(IndexMgr::IsShareIndexed("video"));
        EXPECT_FALSE(IndexMgr::IsShareIndexed(""));
        EXPECT_FALSE(IndexMgr::IsPathIndexed("/video/movies"));
        EXPECT_FALSE(IndexMgr::IsPathIndexed(""));
        EXPECT_FALSE(IndexMgr::IsPathContainIndexed("/video/movies"));
        EXPECT_FALSE(IndexMgr::IsPathContainIndexed(""));
        EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/video/movies"));
        EXPECT_EQ(FILEIDXIsShareIndexed("video"), 0);
        EXPECT_EQ(FILEIDXIsPathIndexed("/video/movies"), 0);
        EXPECT_EQ(FILEIDXIsFullPathIndexed("/volume1/video/movies"), 0);
    }
}

struct PathRow {
    std::string stored;
    std::string asked;
    bool indexed;  // is the stored folder or lies inside it
    bool contains; // is the stored folder or contains it
};

const std::vector<PathRow> kPathRows = {
    {"/video/movies", "/video/movies", true, true},
    {"/video/movies", "/video/movies/clips", true, false},
    {"/video/movies", "/video/movies/clips/new", true, false},
    {"/video/movies", "/video/movies2", false, false},
    {"/video/movies", "/video/movie", false, false},
    {"/video/movies", "/video", false, true},
    {"/video/movies", "/vide", false, false},
    {"/video/movies", "/video/m", false, false},
    {"/video/movies", "", false, true},
    {"/video/movies", "/", false, false},
    {"/video/movies", "video/movies", false, false},
    {"/video/movies", "/music", false, false},
    // byte for byte
    {"/video/movies", "/Video/movies", false, false},
    {"/video/movies", "/video/Movies/clips", false, false},
    {"/video/\xff\xfe", "/video/\xff\xfe/a", true, false},
    {"/video/\xff\xfe", "/video/\xff", false, false},
    {"/video/e\xcc\x81", "/video/\xc3\xa9", false, false},
    {"/video/100% %s", "/video/100% %s", true, true},
    // nothing is normalised
    {"/video/movies", "/video//movies", false, false},
    {"/video/movies", "/video/./movies", false, false},
    {"/video/movies", "/video/movies/..", true, false},
    {"/video/movies", "/video/x/../movies", false, false},
    // a trailing "/" meets only folders that are stored with one
    {"/video/movies", "/video/movies/", false, false},
    {"/video/movies", "/video/movies/clips/", false, false},
    {"/video/movies", "/video/", false, false},
    {"/video/movies/", "/video/movies/", true, true},
    {"/video/movies/", "/video/movies", false, true},
    {"/video/movies/", "/video/movies/clips", false, false},
    {"/video/movies/", "/video/movies//clips", true, false},
    {"/video/movies/", "/video", false, true},
    {"/video/movies/", "/video/", false, false},
    {"/video//movies", "/video/", false, false},
    {"/video//movies/", "/video/", false, true},
    // a whole share, and settings that no settings page writes
    {"/video", "/video", true, true},
    {"/video", "/video/movies", true, false},
    {"/video", "/video2", false, false},
    {"/", "/", true, true},
    {"/", "/video", false, false},
};

std::string LongPath(char last) {
    return "/video/" + std::string(5000, 'x') + last;
}

TEST_F(MembershipTest, PathsAreComparedByWholeComponents) {
    for (const PathRow &row : kPathRows) {
        SCOPED_TRACE("stored " + row.stored + ", asked " + row.asked);
        PutFolders({row.stored});
        EXPECT_EQ(IndexMgr::IsPathIndexed(row.asked), row.indexed);
        EXPECT_EQ(IndexMgr::IsPathIndexed(row.asked, {FolderAt(row.stored)}), row.indexed);
        EXPECT_EQ(FILEIDXIsPathIndexed(row.asked.c_str()), row.indexed ? 1 : 0);
        EXPECT_EQ(IndexMgr::IsPathContainIndexed(row.asked), row.contains);
        EXPECT_EQ(IndexMgr::IsPathContainIndexed(row.asked, {FolderAt(row.stored)}), row.contains);
    }
}

TEST_F(MembershipTest, FullPathsAreComparedAsPathsAre) {
    for (const PathRow &row : kPathRows) {
        const std::string stored = "/volume1" + row.stored;
        const std::string asked = "/volume1" + row.asked;
        SCOPED_TRACE("stored " + stored + ", asked " + asked);
        EXPECT_EQ(IndexMgr::IsFullPathIndexed(asked, {FolderAt("/any", stored)}), row.indexed);
    }
}

TEST_F(MembershipTest, PathsMayBeLongerThanTheSystemAllows) {
    PutFolders({LongPath('a')});
    EXPECT_TRUE(IndexMgr::IsPathIndexed(LongPath('a')));
    EXPECT_TRUE(IndexMgr::IsPathIndexed(LongPath('a') + "/b"));
    EXPECT_FALSE(IndexMgr::IsPathIndexed(LongPath('b')));
    EXPECT_TRUE(IndexMgr::IsPathContainIndexed("/video"));
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume1" + LongPath('a')));
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1" + LongPath('b')));
}

TEST_F(MembershipTest, AZeroByteInBothEndsTheComparison) {
    EXPECT_TRUE(IndexMgr::IsPathIndexed("/video\0ab"s, {FolderAt("/video\0xy"s)}));
    EXPECT_FALSE(IndexMgr::IsPathIndexed("/video\0a"s, {FolderAt("/video\0xy"s)}));
    EXPECT_FALSE(IndexMgr::IsPathIndexed("/video1\0b"s, {FolderAt("/video\0xy"s)}));
}

TEST_F(MembershipTest, AnyOfSeveralFoldersCounts) {
    const std::vector<std::string> stored = {"/music", "/photos/a", "/video/b"};
    PutFolders(stored);
    std::vector<Folder> folders;
    ASSERT_TRUE(IndexMgr::List(folders));
    for (const char *path : {"/music", "/photos/a/x", "/video/b"}) {
        SCOPED_TRACE(path);
        EXPECT_TRUE(IndexMgr::IsPathIndexed(path));
        EXPECT_TRUE(IndexMgr::IsPathIndexed(path, folders));
    }
    for (const char *path : {"/music", "/photos", "/video"}) {
        SCOPED_TRACE(path);
        EXPECT_TRUE(IndexMgr::IsPathContainIndexed(path));
        EXPECT_TRUE(IndexMgr::IsPathContainIndexed(path, folders));
    }
    for (const char *path : {"/volume2/music/x", "/volume1/photos/a", "/volume1/video/b"}) {
        SCOPED_TRACE(path);
        EXPECT_TRUE(IndexMgr::IsFullPathIndexed(path));
        EXPECT_TRUE(IndexMgr::IsFullPathIndexed(path, folders));
    }
    EXPECT_FALSE(IndexMgr::IsPathIndexed("/photos"));
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/photos"));
}

TEST_F(MembershipTest, AnEmptyListCoversNothing) {
    PutFolders({"/video"});
    EXPECT_FALSE(IndexMgr::IsPathIndexed("/video", {}));
    EXPECT_FALSE(IndexMgr::IsPathContainIndexed("/video", {}));
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/video", {}));
}

TEST_F(MembershipTest, AListSavesReadingTheSettings) {
    PutFile(kFolderFile, "{");
    const std::vector<Folder> folders = {FolderAt("/video", kVideo)};
    EXPECT_TRUE(IndexMgr::IsPathIndexed("/video/a", folders));
    EXPECT_TRUE(IndexMgr::IsPathContainIndexed("/video", folders));
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume1/video/a", folders));
    ExpectLog({});
}

TEST_F(MembershipTest, AFullPathIsThatOfTheSharesVolume) {
    PutFolders({"/music/jazz"});
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume2/music/jazz"));
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume2/music/jazz/live"));
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/music/jazz"));
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume2/music"));
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/music/jazz"));
    EXPECT_EQ(FILEIDXIsFullPathIndexed("/volume2/music/jazz/live"), 1);
    EXPECT_EQ(FILEIDXIsFullPathIndexed("/volume2/music"), 0);
}

TEST_F(MembershipTest, AFolderThatWasNotResolvedIsResolvedWhenItIsAskedAbout) {
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume2/music/a", {FolderAt("/music")}));
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/music/a", {FolderAt("/music")}));
}

TEST_F(MembershipTest, AFolderThatNoLongerResolvesCoversNoFullPath) {
    PutFolders({"/gone/a", "/video/b"});
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/gone/a"));
    ExpectLog({"folder:16 Failed to get full path from /gone/a"});
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/"));
    ExpectLog({"folder:16 Failed to get full path from /gone/a"});
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed(""));
    ExpectLog({"folder:16 Failed to get full path from /gone/a"});
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume1/video/b/c"));
    ExpectLog({"folder:16 Failed to get full path from /gone/a"});
    EXPECT_TRUE(IndexMgr::IsPathIndexed("/gone/a/b"));
    EXPECT_TRUE(IndexMgr::IsPathContainIndexed("/gone"));
}

TEST_F(MembershipTest, TheFirstMatchEndsTheWalk) {
    const std::vector<Folder> folders = {FolderAt("/video/b", "/volume1/video/b"),
                                         FolderAt("/video/b/c", "/volume1/video/b/c"),
                                         FolderAt("/gone/z")};
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume1/video/b/c", folders));
    ExpectLog({}); // the last folder was not resolved
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/music", folders));
    ExpectLog({"folder:16 Failed to get full path from /gone/z"});
    PutFolders({"/video/b", "/zgone/z"});
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume1/video/b/c"));
    ExpectLog({});
}

TEST_F(MembershipTest, AShareIsIndexedThroughAnyFolderInIt) {
    PutFolders({"/music", "/photos/a/deep/one"});
    EXPECT_TRUE(IndexMgr::IsShareIndexed("music"));
    EXPECT_TRUE(IndexMgr::IsShareIndexed("photos"));
    for (const char *share : {"video", "Music", "musi", "music2", "/music", "music/", "", "a"}) {
        SCOPED_TRACE(share);
        EXPECT_FALSE(IndexMgr::IsShareIndexed(share));
        EXPECT_EQ(FILEIDXIsShareIndexed(share), 0);
    }
    EXPECT_EQ(FILEIDXIsShareIndexed("photos"), 1);
}

TEST_F(MembershipTest, ShareNamesMayHoldOddBytes) {
    for (const char *share : {"my share", "100% %s%n", "\xff\xfe", "a\"b\\c", "#recycle"}) {
        SCOPED_TRACE(share);
        PutFolders({"/"s + share + "/a"});
        EXPECT_TRUE(IndexMgr::IsShareIndexed(share));
        EXPECT_FALSE(IndexMgr::IsShareIndexed("my"));
    }
    PutFolders({"/video\0x/a"s});
    EXPECT_TRUE(IndexMgr::IsShareIndexed("video\0x"s));
    EXPECT_FALSE(IndexMgr::IsShareIndexed("video"));
    EXPECT_FALSE(IndexMgr::IsShareIndexed("video\0y"s));
}

TEST_F(MembershipTest, TheShareOfAStoredPathIsCutOutWithoutThePlatform) {
    PutFolders({"/gone/a", "xphotos/a", "/"});
    EXPECT_TRUE(IndexMgr::IsShareIndexed("gone"));
    EXPECT_TRUE(IndexMgr::IsShareIndexed("photos"));
    EXPECT_TRUE(IndexMgr::IsShareIndexed(""));
}

TEST_F(MembershipTest, ASettingWithoutAShareIsSkippedWithALine) {
    PutFolders({"", "/video/a"});
    const std::string loading = "utils:389 GetShareNameByPath failed, path=";
    const std::string skipped = "index_mgr:* Failed to get share name from path: ";
    EXPECT_TRUE(IndexMgr::IsShareIndexed("video"));
    ExpectLog({loading, skipped});
    EXPECT_FALSE(IndexMgr::IsShareIndexed("music"));
    ExpectLog({loading, skipped});
    EXPECT_FALSE(IndexMgr::IsShareIndexed(""));
    ExpectLog({loading, skipped});
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(MembershipTest, ASettingWithTheEmptyPathContainsEveryRootedPath) {
    const std::vector<Folder> folders = {FolderAt("")};
    EXPECT_TRUE(IndexMgr::IsPathIndexed("/video/a", folders));
    EXPECT_FALSE(IndexMgr::IsPathIndexed("video/a", folders));
    EXPECT_TRUE(IndexMgr::IsPathContainIndexed("", folders));
    EXPECT_FALSE(IndexMgr::IsPathContainIndexed("/video", folders));
}

TEST_F(MembershipTest, NeitherStatusNorFileTypesPlayAPart) {
    PutFile(kFolderFile, R"({"/video/a":{"document":false,"audio":false}})");
    PutFile(kStatusFile, R"({"resume_time":0,"no_space":{"video":true},
                             "need_reindex":{"video":true}})");
    EXPECT_TRUE(IndexMgr::IsShareIndexed("video"));
    EXPECT_TRUE(IndexMgr::IsPathIndexed("/video/a"));
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume1/video/a"));
}

TEST_F(MembershipTest, QueriesTakeNoLockAndChangeNothing) {
    PutFolders({"/video/a"});
    Watch();
    Fault::Count(Call::Flock);
    EXPECT_TRUE(IndexMgr::IsShareIndexed("video"));
    EXPECT_TRUE(IndexMgr::IsPathIndexed("/video/a"));
    EXPECT_TRUE(IndexMgr::IsPathContainIndexed("/video"));
    EXPECT_TRUE(IndexMgr::IsFullPathIndexed("/volume1/video/a"));
    EXPECT_EQ(FILEIDXIsShareIndexed("video"), 1);
    EXPECT_EQ(FILEIDXIsPathIndexed("/video/a"), 1);
    EXPECT_EQ(FILEIDXIsFullPathIndexed("/volume1/video/a"), 1);
    std::vector<Folder> folders;
    EXPECT_TRUE(IndexMgr::List(folders));
    EXPECT_EQ(Fault::Calls(Call::Flock), 0U);
    EXPECT_FALSE(Exists(kFolderLock));
    EXPECT_THAT(Effects(), IsEmpty());
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(MembershipTest, QueriesAnswerWhileAWriterHoldsTheLock) {
    PutFolders({"/video/a"});
    const HoldLock lock(kFolderLock);
    EXPECT_TRUE(IndexMgr::IsShareIndexed("video"));
    EXPECT_TRUE(IndexMgr::IsPathIndexed("/video/a"));
    std::vector<Folder> folders;
    EXPECT_TRUE(IndexMgr::List(folders));
}

TEST_F(MembershipTest, ThreadsAskAtTheSameTime) {
    constexpr int kThreads = 4;
    constexpr int kQuestions = 25;
    PutFolders({"/photos/a", "/video/b"});
    std::vector<int> right(kThreads, 0);
    std::vector<std::thread> threads;
    for (int &answers : right) {
        threads.emplace_back([&answers] {
            for (int question = 0; question < kQuestions; ++question) {
                answers += IndexMgr::IsShareIndexed("video") ? 1 : 0;
                answers += IndexMgr::IsPathIndexed("/photos/a/x") ? 1 : 0;
                answers += IndexMgr::IsPathContainIndexed("/photos") ? 1 : 0;
                answers += IndexMgr::IsFullPathIndexed("/volume1/video/b") ? 1 : 0;
                answers += IndexMgr::IsPathIndexed("/music") ? 0 : 1;
            }
        });
    }
    for (std::thread &thread : threads) {
        thread.join();
    }
    EXPECT_THAT(right, Each(kQuestions * 5));
}

TEST_F(MembershipTest, SettingsThatCannotBeLoadedAnswerNo) {
    PutFile(kFolderFile, R"({"/video/a":{)");
    const std::vector<std::string> line = {"config:22 Failed to load json from "s + kFolderFile};
    std::vector<Folder> folders;
    EXPECT_FALSE(IndexMgr::List(folders));
    ExpectLog(line);
    EXPECT_FALSE(IndexMgr::IsShareIndexed("video"));
    ExpectLog(line);
    EXPECT_FALSE(IndexMgr::IsPathIndexed("/video/a"));
    ExpectLog(line);
    EXPECT_FALSE(IndexMgr::IsPathContainIndexed("/video"));
    ExpectLog(line);
    EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/video/a"));
    ExpectLog(line);
    EXPECT_EQ(FILEIDXIsShareIndexed("video"), 0);
    ExpectLog(line);
    EXPECT_EQ(FILEIDXIsPathIndexed("/video/a"), 0);
    ExpectLog(line);
    EXPECT_EQ(FILEIDXIsFullPathIndexed("/volume1/video/a"), 0);
    ExpectLog(line);
}

TEST_F(MembershipTest, HostileSettingsNeverMakeAQueryThrow) {
    struct Row {
        std::string text;
        bool indexed; // "/photos/a"
    };
    const std::vector<Row> rows = {
        {"", false},
        {" \n", false},
        {"null", false},
        {"[]", false},
        {"3", false},
        {"\"/photos/a\"", false},
        {"\xff\xfe\x80", false},
        {std::string(16, '\0'), false},
        {R"({"/photos/a":{}} x)", false},
        {R"({"/photos/a":)" + std::string(5000, '[') + std::string(5000, ']') + "}", false},
        {R"({"/photos/a":{"name":)" + std::string(5000, '{'), false},
        {R"({"/photos/a":null})", true},
        {R"({"/photos/a":[1,2]})", true},
        {R"({"/photos/a":-1e308})", true},
        {R"({"/photos/a":{"path":7,"name":[],"photo":"x","audio":{}}})", true},
        {R"({"/photos/a":{},"\u0000":{},"\udbff\udfff":1})", true},
    };
    for (const Row &row : rows) {
        SCOPED_TRACE(row.text.substr(0, 40));
        PutFile(kFolderFile, row.text);
        EXPECT_NO_THROW({
            EXPECT_EQ(IndexMgr::IsShareIndexed("photos"), row.indexed);
            EXPECT_EQ(IndexMgr::IsPathIndexed("/photos/a"), row.indexed);
            EXPECT_EQ(IndexMgr::IsPathContainIndexed("/photos/a"), row.indexed);
            EXPECT_EQ(IndexMgr::IsFullPathIndexed("/volume1/photos/a"), row.indexed);
            EXPECT_EQ(FILEIDXIsShareIndexed("photos"), row.indexed ? 1 : 0);
            EXPECT_EQ(FILEIDXIsPathIndexed("/photos/a"), row.indexed ? 1 : 0);
            EXPECT_EQ(FILEIDXIsFullPathIndexed("/volume1/photos/a"), row.indexed ? 1 : 0);
        });
        (void)SystemLog::Get().Lines(); // of the loading, tested elsewhere
    }
}

TEST_F(MembershipTest, QueriesThatRunOutOfMemoryAnswerNo) {
    PutFolders({"/photos/a"});
    platform.On("VANOShareGet",
                [](const std::string &) -> std::optional<int> { throw std::bad_alloc(); });
    EXPECT_NO_THROW({
        EXPECT_FALSE(IndexMgr::IsShareIndexed("photos"));
        EXPECT_FALSE(IndexMgr::IsPathIndexed("/photos/a"));
        EXPECT_FALSE(IndexMgr::IsPathContainIndexed("/photos/a"));
        EXPECT_FALSE(IndexMgr::IsFullPathIndexed("/volume1/photos/a"));
        EXPECT_EQ(FILEIDXIsShareIndexed("photos"), 0);
        EXPECT_EQ(FILEIDXIsPathIndexed("/photos/a"), 0);
        EXPECT_EQ(FILEIDXIsFullPathIndexed("/volume1/photos/a"), 0);
    });
}

TEST_F(MembershipTest, ANullPointerIsNotIndexed) {
    PutFolders({"/", "/photos/a"});
    EXPECT_EQ(FILEIDXIsShareIndexed(nullptr), 0);
    EXPECT_EQ(FILEIDXIsPathIndexed(nullptr), 0);
    EXPECT_EQ(FILEIDXIsFullPathIndexed(nullptr), 0);
}

TEST_F(MembershipTest, TheListHasEverySettingInByteOrder) {
    PutFile(kFolderFile, R"({"/video/b":{"name":"B"},"/gone/x":{},"/Zoo":{},"/photos/a":{}})");
    std::vector<Folder> folders = {FolderAt("/old")};
    EXPECT_TRUE(IndexMgr::List(folders));
    EXPECT_THAT(PathsOf(folders), ElementsAre("/Zoo", "/gone/x", "/photos/a", "/video/b"));
    EXPECT_EQ(folders[3].name, "B");
    EXPECT_EQ(folders[3].GetFullPath(), "/volume1/video/b");
}

TEST_F(MembershipTest, TheListFailsOnSettingsOfAnotherShape) {
    PutFile(kFolderFile, "[1]");
    std::vector<Folder> folders;
    EXPECT_FALSE(IndexMgr::List(folders));
    EXPECT_THAT(folders, IsEmpty());
    ExpectError(FILEINDEX_ERR_MALFORMED);
    ExpectLog({"folders:80 Malformed folders: [1]"});
}

} // namespace

} // namespace VANO::TESTS
