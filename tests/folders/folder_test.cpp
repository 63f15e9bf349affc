#include <fileindex/folder.h>

#include <type_traits>

#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

constexpr char kUnresolved[] = "folder:16 Failed to get full path from /none/a";

static_assert(std::is_copy_constructible_v<Folder> && std::is_copy_assignable_v<Folder>);
static_assert(!std::is_polymorphic_v<Folder>);

class FolderTest : public LibraryTest {
  protected:
    void SetUp() override {
        LibraryTest::SetUp();
        platform.AddShare("photos", "/volume1/photos");
    }
};

Folder FullFolder() {
    Folder folder;
    folder.full_path = "/volume1/photos/old";
    folder.path = "/photos/old";
    folder.name = "Old";
    folder.document = folder.audio = folder.video = folder.photo = true;
    return folder;
}

std::vector<bool> FlagsOf(const Folder &folder) {
    return {folder.document, folder.audio, folder.video, folder.photo};
}

// "path full_path name", and then the flags' first letters.
std::string All(const Folder &folder) {
    return folder.path + " " + folder.full_path + " " + folder.name + " " +
           (folder.document ? "d" : "-") + (folder.audio ? "a" : "-") + (folder.video ? "v" : "-") +
           (folder.photo ? "p" : "-");
}

TEST_F(FolderTest, ANewRecordIsEmptyAndIndexesNothing) {
    const Folder folder;
    EXPECT_EQ(All(folder), "   ----");
}

// --- reading ---

TEST_F(FolderTest, LoadTakesEveryMember) {
    Folder folder;
    EXPECT_TRUE(folder.Load("/photos/a", Json(R"({"name":"A","document":true,"audio":false,
                                                 "video":true,"photo":true})")));
    EXPECT_EQ(All(folder), "/photos/a /volume1/photos/a A d-vp");
    ExpectError(FILEINDEX_ERR_NONE);
}

TEST_F(FolderTest, EachFlagIsReadFromTheMemberOfItsName) {
    const char *keys[] = {"document", "audio", "video", "photo"};
    for (std::size_t i = 0; i < 4; ++i) {
        Json::Value object(Json::objectValue);
        object[keys[i]] = true;
        Folder folder;
        EXPECT_TRUE(folder.Load("/photos", object));
        std::vector<bool> expected(4, false);
        expected[i] = true;
        EXPECT_EQ(FlagsOf(folder), expected) << keys[i];
    }
}

TEST_F(FolderTest, LoadKeepsWhatTheObjectLacks) {
    Folder folder = FullFolder();
    EXPECT_TRUE(folder.Load("/photos/a", Json("{}")));
    EXPECT_EQ(All(folder), "/photos/a /volume1/photos/a Old davp");
    EXPECT_TRUE(folder.Load("/photos/a", Json(R"({"video":false})")));
    EXPECT_THAT(FlagsOf(folder), ElementsAre(true, true, false, true));
}

TEST_F(FolderTest, MistypedMembersAreIgnoredWithoutError) {
    Folder folder = FullFolder();
    EXPECT_TRUE(folder.Load("/photos/a", Json(R"({"name":12,"document":"false","audio":0,
                                                 "video":null,"photo":[false]})")));
    EXPECT_EQ(folder.name, "Old");
    EXPECT_THAT(FlagsOf(folder), ElementsAre(true, true, true, true));
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({});
}

TEST_F(FolderTest, WhatIsNoObjectChangesThePathOnly) {
    for (const char *text : {"[]", "null", "12", R"("name")", "true", R"([{"name":"x"}])"}) {
        Folder folder = FullFolder();
        EXPECT_TRUE(folder.Load("/photos/a", Json(text))) << text;
        EXPECT_EQ(folder.path, "/photos/a");
        EXPECT_EQ(folder.name, "Old");
    }
}

TEST_F(FolderTest, ThePathComesFromTheCallerAndNeverFromTheObject) {
    Folder folder;
    EXPECT_TRUE(folder.Load("/photos/a", Json(R"({"path":"/photos/b","full_path":"/x"})")));
    EXPECT_EQ(folder.path, "/photos/a");
    EXPECT_EQ(folder.full_path, "/volume1/photos/a");
}

TEST_F(FolderTest, AnUnresolvableFolderIsLoadedAllTheSame) {
    Folder folder = FullFolder();
    EXPECT_FALSE(folder.Load("/none/a", Json(R"({"name":"A","photo":false})")));
    EXPECT_EQ(All(folder), "/none/a  A dav-");
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog({});
}

TEST_F(FolderTest, AnEmptyPathLoadsWithThePathsOwnMessage) {
    Folder folder = FullFolder();
    EXPECT_FALSE(folder.Load("", Json(R"({"name":"A"})")));
    EXPECT_EQ(folder.path, "");
    EXPECT_EQ(folder.full_path, "");
    EXPECT_EQ(folder.name, "A");
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({"utils:389 GetShareNameByPath failed, path="});
}

TEST_F(FolderTest, ReloadStartsFromNothing) {
    Folder folder = FullFolder();
    EXPECT_TRUE(folder.Reload("/photos/a", Json("{}")));
    EXPECT_EQ(All(folder), "/photos/a /volume1/photos/a  ----");
    EXPECT_TRUE(folder.Reload("/photos/a", Json(R"({"name":"A","audio":true})")));
    EXPECT_EQ(folder.name, "A");
    EXPECT_THAT(FlagsOf(folder), ElementsAre(false, true, false, false));
}

TEST_F(FolderTest, ReloadOfAnUnresolvableFolderStillReads) {
    Folder folder = FullFolder();
    EXPECT_FALSE(folder.Reload("/none/a", Json(R"({"name":"A"})")));
    EXPECT_EQ(folder.full_path, "");
    EXPECT_EQ(folder.name, "A");
    EXPECT_THAT(FlagsOf(folder), ElementsAre(false, false, false, false));
    ExpectError(FILEINDEX_ERR_PATH);
}

TEST_F(FolderTest, ReloadTakesThePathFromTheCallerToo) {
    Folder folder;
    EXPECT_TRUE(folder.Reload("/photos/a", Json(R"({"path":"/photos/b","name":5})")));
    EXPECT_EQ(folder.path, "/photos/a");
    EXPECT_EQ(folder.full_path, "/volume1/photos/a");
    EXPECT_EQ(folder.name, "");
}

TEST_F(FolderTest, ASuccessKeepsTheLastError) {
    ErrorHandler::SetError(FILEINDEX_ERR_SAVE);
    Folder folder;
    EXPECT_TRUE(folder.Load("/photos/a", Json("{}")));
    EXPECT_TRUE(folder.Reload("/photos/a", Json("{}")));
    EXPECT_TRUE(folder.SetPath("/photos/a"));
    folder.full_path.clear();
    EXPECT_EQ(folder.GetFullPath(), "/volume1/photos/a");
    Json::Value object(Json::objectValue);
    EXPECT_TRUE(folder.AddToJson(object));
    ExpectError(FILEINDEX_ERR_SAVE);
}

TEST_F(FolderTest, TheNewPathMayBeTheRecordsOwn) {
    Folder folder = FullFolder();
    EXPECT_TRUE(folder.Load(folder.path, Json("{}")));
    EXPECT_EQ(folder.path, "/photos/old");
    EXPECT_TRUE(folder.SetPath(folder.path));
    EXPECT_EQ(folder.full_path, "/volume1/photos/old");
}

// --- the path ---

TEST_F(FolderTest, SetPathResolvesAndLeavesTheRest) {
    Folder folder = FullFolder();
    EXPECT_TRUE(folder.SetPath("/photos/a"));
    EXPECT_EQ(All(folder), "/photos/a /volume1/photos/a Old davp");
}

TEST_F(FolderTest, SetPathOfAnUnresolvablePathSetsThePathOnly) {
    Folder folder = FullFolder();
    EXPECT_FALSE(folder.SetPath("/none/a"));
    EXPECT_EQ(folder.path, "/none/a");
    EXPECT_EQ(folder.full_path, "");
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog({});
}

TEST_F(FolderTest, TheCachedFullPathIsGivenWithoutAsking) {
    Folder folder;
    folder.path = "/none/a";
    folder.full_path = "/cached";
    EXPECT_EQ(folder.GetFullPath(), "/cached");
    EXPECT_EQ(platform.Calls("VANOShareGet"), 0U);
}

TEST_F(FolderTest, AnUncachedFullPathIsResolvedEachTimeAndNotKept) {
    Folder folder;
    folder.path = "/photos/a";
    EXPECT_EQ(folder.GetFullPath(), "/volume1/photos/a");
    EXPECT_EQ(folder.GetFullPath(), "/volume1/photos/a");
    EXPECT_EQ(folder.full_path, "");
    EXPECT_EQ(platform.Calls("VANOShareGet"), 2U);
}

TEST_F(FolderTest, AFullPathThatCannotBeResolvedIsEmptyAndLogged) {
    Folder folder;
    folder.path = "/none/a";
    EXPECT_EQ(folder.GetFullPath(), "");
    ExpectError(FILEINDEX_ERR_PATH);
    ExpectLog({kUnresolved});
}

// --- writing ---

TEST_F(FolderTest, TheJsonHoldsTheSixMembersAndNoFullPath) {
    Folder folder = FullFolder();
    folder.audio = false;
    EXPECT_EQ(folder.asJson(), Json(R"({"path":"/photos/old","name":"Old","document":true,
                                        "audio":false,"video":true,"photo":true})"));
    EXPECT_EQ(Folder().asJson(), Json(R"({"path":"","name":"","document":false,"audio":false,
                                          "video":false,"photo":false})"));
}

TEST_F(FolderTest, EveryByteOfPathAndNameIsWrittenAndReadBack) {
    Folder folder;
    folder.path = "/photos/\xff\n";
    folder.name = std::string("a\0\xfe", 3);
    const Json::Value json = folder.asJson();
    EXPECT_EQ(json["path"].asString(), folder.path);
    EXPECT_EQ(json["name"].asString(), folder.name);
    Folder back;
    EXPECT_TRUE(back.Load(folder.path, json));
    EXPECT_EQ(back.name, folder.name);
}

TEST_F(FolderTest, AddToJsonStoresTheRecordUnderItsPath) {
    Json::Value object = Json(R"({"/photos/old":{"extra":1},"/other":2})");
    EXPECT_TRUE(FullFolder().AddToJson(object));
    EXPECT_EQ(object["/photos/old"], FullFolder().asJson());
    EXPECT_EQ(object["/other"], Json("2"));
    EXPECT_EQ(object.size(), 2U);
}

TEST_F(FolderTest, AddToJsonRefusesWhatIsNoObject) {
    for (const char *text : {"[]", "null", "12", R"("text")", "true", "[1]"}) {
        Json::Value value = Json(text);
        EXPECT_FALSE(FullFolder().AddToJson(value)) << text;
        EXPECT_EQ(value, Json(text));
    }
    ExpectError(FILEINDEX_ERR_NONE);
    ExpectLog({});
}

} // namespace

} // namespace VANO::TESTS
