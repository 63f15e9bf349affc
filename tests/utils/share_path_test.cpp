#include <fileindex/share_path.h>

#include <cerrno>
#include <sys/stat.h>
#include <unistd.h>

#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

class SharePathTest : public LibraryTest {};

// --- share name of a share path ---

struct NameRow {
    const char *path;
    const char *name;
};

TEST_F(SharePathTest, TheShareNameIsTheFirstComponentBehindTheFirstCharacter) {
    const NameRow rows[] = {{"/", ""},
                            {"//", ""},
                            {"//a", ""},
                            {"/photos", "photos"},
                            {"/photos/", "photos"},
                            {"/photos/a/b", "photos"},
                            {"xphotos/a", "photos"},
                            {"photos/a", "hotos"},
                            {"x", ""},
                            {"/caf\xe9\xff/a", "caf\xe9\xff"},
                            {"/a b\n/c", "a b\n"}};
    for (const NameRow &row : rows) {
        std::string name = "before";
        EXPECT_TRUE(GetShareNameByPath(name, row.path)) << row.path;
        EXPECT_EQ(name, row.name) << row.path;
    }
    EXPECT_THAT(platform.Trace(), IsEmpty());
}

TEST_F(SharePathTest, AnEmptyPathHasNoShareName) {
    std::string name = "before";
    EXPECT_FALSE(GetShareNameByPath(name, ""));
    EXPECT_EQ(name, "before");
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({});
}

// --- full path of a share path ---

TEST_F(SharePathTest, AFullPathIsTheVolumeAndTheSharePath) {
    platform.AddShare("photos", "/volume1/photos");
    std::string fullPath = "before";
    for (const char *path : {"/photos", "/photos/", "/photos/a", "/photos/a//b/../c"}) {
        EXPECT_TRUE(GetFullPath(fullPath, path));
        EXPECT_EQ(fullPath, "/volume1" + std::string(path));
    }
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(SharePathTest, TheShareKeepsTheSpellingOfTheRequest) {
    platform.AddShare("photos", "/volume1/photos");
    platform.ignoreCase = true;
    std::string fullPath;
    EXPECT_TRUE(GetFullPath(fullPath, "/Photos/a"));
    EXPECT_EQ(fullPath, "/volume1/Photos/a");
}

TEST_F(SharePathTest, TheShareIsAskedOnceAndReleased) {
    platform.AddShare("photos", "/volume1/photos");
    std::string fullPath;
    EXPECT_TRUE(GetFullPath(fullPath, "/photos/a"));
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOShareGet(photos)", "VANOShareFree(photos)"));
}

TEST_F(SharePathTest, EveryResultFromZeroUpIsSuccess) {
    platform.AddShare("photos", "/volume1/photos");
    platform.Answer("VANOShareGet", {5});
    std::string fullPath;
    EXPECT_TRUE(GetFullPath(fullPath, "/photos/a"));
    EXPECT_EQ(fullPath, "/volume1/photos/a");
}

struct VolumeRow {
    const char *directory;
    const char *fullPath;
};

TEST_F(SharePathTest, TheVolumeIsTheShareDirectoryUpToItsLastSlash) {
    const VolumeRow rows[] = {{"/volume1/photos", "/volume1/s/a"},
                              {"/volume1/other", "/volume1/s/a"},
                              {"/deep/er/volume/s", "/deep/er/volume/s/a"},
                              {"/s", "/s/a"},
                              {"volume", "volume/s/a"},
                              {"", "/s/a"},
                              {"/volume1/s/", "/volume1/s/s/a"}};
    for (const VolumeRow &row : rows) {
        platform.Reset();
        platform.AddShare("s", "").path = row.directory;
        std::string fullPath;
        EXPECT_TRUE(GetFullPath(fullPath, "/s/a")) << row.directory;
        EXPECT_EQ(fullPath, row.fullPath) << row.directory;
    }
}

TEST_F(SharePathTest, AnUnknownShareSetsTheErrorAndLogsNothing) {
    std::string fullPath = "before";
    EXPECT_FALSE(GetFullPath(fullPath, "/none/a"));
    EXPECT_EQ(fullPath, "");
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog({});
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOShareGet(none)"));
}

TEST_F(SharePathTest, EveryNegativeResultIsAFailure) {
    platform.AddShare("photos", "/volume1/photos");
    for (const int result : {-1, -2, -100}) {
        platform.Answer("VANOShareGet", {result});
        std::string fullPath;
        EXPECT_FALSE(GetFullPath(fullPath, "/photos/a")) << result;
        ExpectError(FILEINDEX_ERR_PATH);
        platform.Answer("VANOShareNamePathGet", {result});
        std::string name;
        std::string path;
        EXPECT_FALSE(GetShareNamePathByFullPath(name, path, "/volume1/photos/a")) << result;
        ExpectError(FILEINDEX_ERR_PATH);
        ExpectLog({"utils:418 VANOShareNamePathGet failed, path=/volume1/photos/a"});
    }
    EXPECT_EQ(platform.Calls("VANOShareFree"), 0U);
}

TEST_F(SharePathTest, ASuccessKeepsTheLastError) {
    platform.AddShare("photos", "/volume1/photos");
    ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
    std::string name;
    std::string path;
    EXPECT_TRUE(GetShareNameByPath(name, "/photos/a"));
    EXPECT_TRUE(GetFullPath(path, "/photos/a"));
    EXPECT_TRUE(GetShareNamePathByFullPath(name, path, "/volume1/photos/a"));
    ExpectError(FILEINDEX_ERR_SAVE);
}

TEST_F(SharePathTest, AnEmptyPathIsLoggedAndAsksNothing) {
    std::string fullPath = "before";
    EXPECT_FALSE(GetFullPath(fullPath, ""));
    EXPECT_EQ(fullPath, "");
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"utils:389 GetShareNameByPath failed, path="});
    EXPECT_EQ(platform.Calls("VANOShareGet"), 0U);
}

TEST_F(SharePathTest, AnEmptyShareNameIsAskedForLikeAnyOther) {
    std::string fullPath;
    EXPECT_FALSE(GetFullPath(fullPath, "/"));
    ExpectError(FILEINDEX_ERR_PATH);
    EXPECT_THAT(platform.Trace(), ElementsAre("VANOShareGet()"));
}

TEST_F(SharePathTest, LongAndStrangePathsPassThrough) {
    platform.AddShare("photos", "/volume1/photos");
    for (const std::string &rest :
         {std::string(8192, 'a'), std::string("\xff\xc3 \n\t%s"), std::string("a\0b", 3)}) {
        std::string fullPath;
        EXPECT_TRUE(GetFullPath(fullPath, "/photos/" + rest));
        EXPECT_EQ(fullPath, "/volume1/photos/" + rest);
    }
}

TEST_F(SharePathTest, TheOutputMayBeTheInput) {
    platform.AddShare("photos", "/volume1/photos");
    std::string path = "/photos/a";
    EXPECT_TRUE(GetFullPath(path, path));
    EXPECT_EQ(path, "/volume1/photos/a");
}

// --- share of a full path ---

TEST_F(SharePathTest, AFullPathIsLookedUpWithBuffersOfThePlatformsSizes) {
    platform.AddShare("photos", "/volume1/photos");
    std::string name;
    std::string path;
    EXPECT_TRUE(GetShareNamePathByFullPath(name, path, "/volume1/photos/a/b"));
    EXPECT_EQ(name, "photos");
    EXPECT_EQ(path, "/a/b");
    EXPECT_THAT(platform.Trace(),
                ElementsAre("VANOShareNamePathGet(/volume1/photos/a/b, 492, 4096)"));
}

TEST_F(SharePathTest, BuffersThatThePlatformLeavesAreEmpty) {
    for (const int result : {0, 1, 5}) { // none of them negative
        platform.Answer("VANOShareNamePathGet", {result});
        std::string name = "before";
        std::string path = "before";
        EXPECT_TRUE(GetShareNamePathByFullPath(name, path, "/volume1/photos")) << result;
        EXPECT_EQ(name, "");
        EXPECT_EQ(path, "");
    }
}

TEST_F(SharePathTest, AFullPathInNoShareIsLoggedAndLeavesTheOutputs) {
    for (const std::string &fullPath : {std::string("/etc/passwd"), std::string(""),
                                        std::string("/\xff\n%s"), "/" + std::string(4096, 'a')}) {
        std::string name = "name";
        std::string path = "path";
        EXPECT_FALSE(GetShareNamePathByFullPath(name, path, fullPath));
        EXPECT_EQ(name, "name");
        EXPECT_EQ(path, "path");
        ExpectError(FILEINDEX_ERR_PATH);
        ExpectLog({"utils:418 VANOShareNamePathGet failed, path=" + fullPath});
    }
}

// --- renaming the share ---

struct ReplaceRow {
    const char *path;
    const char *name;
    const char *result;
};

TEST_F(SharePathTest, TheFirstComponentIsReplaced) {
    const ReplaceRow rows[] = {{"", "b", ""},
                               {"/a", "b", "/b"},
                               {"/a/", "b", "/b/"},
                               {"/old/a/b", "new", "/new/a/b"},
                               {"/old", "new", "/new"},
                               {"/old//a", "new", "/new//a"},
                               {"/", "new", "/new"},
                               {"//a", "new", "/new/a"},
                               {"xold/a", "new", "/new/a"},
                               {"x", "new", "/new"},
                               {"/old/a", "", "//a"}};
    for (const ReplaceRow &row : rows) {
        EXPECT_EQ(ReplaceShareName(row.path, row.name), row.result) << row.path;
    }
}

// --- prefixes ---

struct PrefixRow {
    std::string text;
    std::string prefix;
    bool expected;
};

TEST_F(SharePathTest, APrefixIsComparedByteForByte) {
    const PrefixRow rows[] = {
        {"/a/bc/", "/a/b/", false}, {"/a/b/c/", "/a/b/", true}, {"/a/b/", "/a/b/", true},
        {"/a/b", "/a/b/", false},   {"/A/b/", "/a/", false},    {"", "", true},
        {"anything", "", true},     {"", "a", false},           {"\xff\xfe", "\xff", true}};
    for (const PrefixRow &row : rows) {
        EXPECT_EQ(StringStartWith(row.text, row.prefix), row.expected)
            << row.text << " begins with " << row.prefix;
    }
}

TEST_F(SharePathTest, AZeroByteEndsThePrefixComparison) {
    EXPECT_TRUE(StringStartWith(std::string("ab\0xyz", 6), std::string("ab\0q", 4)));
    EXPECT_FALSE(StringStartWith(std::string("ab\0", 3), std::string("ab\0q", 4))); // shorter
    EXPECT_FALSE(StringStartWith(std::string("ab\0xyz", 6), "abc"));
    EXPECT_FALSE(StringStartWith("abcdef", std::string("ab\0q", 4)));
}

// --- what stands at a path ---

TEST_F(SharePathTest, FilesAndDirectoriesAreToldApartAndLinksAreNeither) {
    // /volume1/d/        a directory
    // /volume1/f         a file
    // /volume1/dl, fl    links to them
    // /volume1/dangling  a link to nothing
    // /volume1/fifo
    MakeDirs("/volume1/d");
    PutFile("/volume1/f", "");
    ASSERT_EQ(::symlink("d", "/volume1/dl"), 0);
    ASSERT_EQ(::symlink("f", "/volume1/fl"), 0);
    ASSERT_EQ(::symlink("none", "/volume1/dangling"), 0);
    ASSERT_EQ(::mkfifo("/volume1/fifo", 0600), 0);
    struct Row {
        std::string path;
        bool file;
        bool directory;
    };
    const Row rows[] = {{"/volume1/d", false, true},
                        {"/volume1/d/", false, true},
                        {"/volume1/f", true, false},
                        {"/volume1/f/", false, false},
                        {"/volume1/dl", false, false},
                        {"/volume1/fl", false, false},
                        {"/volume1/dl/../f", true, false},
                        {"/volume1/dangling", false, false},
                        {"/volume1/fifo", false, false},
                        {"/volume1/none", false, false},
                        {"/dev/null", false, false},
                        {"", false, false},
                        {"/" + std::string(5000, 'a'), false, false}};
    for (const Row &row : rows) {
        EXPECT_EQ(IsFileExist(row.path), row.file) << row.path;
        EXPECT_EQ(IsDirExist(row.path), row.directory) << row.path;
    }
    ExpectError(FILEINDEX_ERR_NONE);
}

// --- members of a request ---

class SharePathMemberTest : public SharePathTest,
                            public ::testing::WithParamInterface<const char *> {};

TEST_F(SharePathTest, AMemberOfTheRightTypeIsRead) {
    bool flag = false;
    EXPECT_TRUE(RetrieveBoolFromJsonObj(flag, "key", Json(R"({"key":true})")));
    EXPECT_TRUE(flag);
    EXPECT_TRUE(RetrieveBoolFromJsonObj(flag, "key", Json(R"({"key":false})")));
    EXPECT_FALSE(flag);
    std::string text = "before";
    EXPECT_TRUE(RetrieveStringFromJsonObj(text, "key", Json(R"({"key":"text","x":1})")));
    EXPECT_EQ(text, "text");
    EXPECT_TRUE(RetrieveStringFromJsonObj(text, "key", Json(R"({"key":""})")));
    EXPECT_EQ(text, "");
    EXPECT_TRUE(RetrieveStringFromJsonObj(text, "key", Json(R"({"key":"a\u0000b"})")));
    EXPECT_EQ(text, std::string("a\0b", 3));
    EXPECT_TRUE(RetrieveStringFromJsonObj(text, "", Json(R"({"":"empty name"})")));
    EXPECT_EQ(text, "empty name");
}

TEST_P(SharePathMemberTest, IsNoBoolean) {
    for (const bool before : {true, false}) {
        bool flag = before;
        EXPECT_FALSE(RetrieveBoolFromJsonObj(flag, "key", Json(GetParam())));
        EXPECT_EQ(flag, before);
    }
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_P(SharePathMemberTest, IsNoString) {
    std::string text = "before";
    EXPECT_FALSE(RetrieveStringFromJsonObj(text, "key", Json(GetParam())));
    EXPECT_EQ(text, "before");
    ExpectError(FILEINDEX_ERR_NONE);
}

INSTANTIATE_TEST_SUITE_P(Values, SharePathMemberTest,
                         ::testing::Values("{}", R"({"Key":true})", R"({"Key":"x"})",
                                           R"({"key":1})", R"({"key":0})", R"({"key":1.5})",
                                           R"({"key":null})", R"({"key":[true]})",
                                           R"({"key":{"key":true}})", "[]", R"([{"key":true}])",
                                           "null", "true", R"("key")", "12"));

TEST_F(SharePathTest, AStringIsNoBooleanAndABooleanNoString) {
    bool flag = true;
    EXPECT_FALSE(RetrieveBoolFromJsonObj(flag, "key", Json(R"({"key":"false"})")));
    EXPECT_TRUE(flag);
    std::string text = "before";
    EXPECT_FALSE(RetrieveStringFromJsonObj(text, "key", Json(R"({"key":true})")));
    EXPECT_EQ(text, "before");
}

TEST_F(SharePathTest, TheRequestIsNotChangedByLooking) {
    const Json::Value request = Json(R"({"a":1})");
    Json::Value copy = request;
    bool flag = false;
    EXPECT_FALSE(RetrieveBoolFromJsonObj(flag, "key", copy));
    EXPECT_EQ(copy, request);
}

} // namespace

} // namespace VANO::TESTS
