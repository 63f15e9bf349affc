#include <fileindex/index_mgr.h>

#include <stdexcept>

#include "index_mgr/index_mgr_fixture.h"

namespace VANO::TESTS {

namespace {

constexpr char kLoadFailed[] =
    "config:22 Failed to load json from /usr/vano/etc/fileindex/folder.conf";

const Json::Value kUntouched("untouched");

class GetTest : public IndexMgrTest {};

TEST_F(GetTest, OneSettingIsGivenAsItIsStored) {
    PutFile(kFolderFile, R"({"/photos/a":{"name":"A","photo":true},"/gone/b":{"audio":true}})");
    Json::Value out = kUntouched;
    EXPECT_TRUE(IndexMgr::Get(out, "/photos/a"));
    EXPECT_EQ(out, Json(R"({"path":"/photos/a","name":"A","document":false,"audio":false,
                            "video":false,"photo":true})"));
    EXPECT_TRUE(IndexMgr::Get(out, "/gone/b"));
    EXPECT_EQ(out, Json(R"({"path":"/gone/b","name":"","document":false,"audio":true,
                            "video":false,"photo":false})"));
}

TEST_F(GetTest, TheLockIsHeldExclusivelyWhileTheSettingsAreRead) {
    PutFolders({"/photos/a"});
    bool locked = false;
    platform.Before("VANOShareGet", [&] { locked = IsLocked(kFolderLock); });
    Watch();
    Fault::Record(Call::Flock);
    Json::Value out;
    EXPECT_TRUE(IndexMgr::Get(out, "/photos/a"));
    EXPECT_TRUE(locked);
    EXPECT_THAT(Effects(), ElementsAre(Locked(kFolderLock), Unlocked(kFolderLock)));
}

TEST_F(GetTest, AnUnknownPathIsAnError) {
    PutFolders({"/photos/a"});
    for (const char *path : {"/photos", "/photos/a/", "/photos/a/b", "/Photos/a"}) {
        Json::Value out = kUntouched;
        EXPECT_FALSE(IndexMgr::Get(out, path));
        EXPECT_EQ(out, kUntouched);
        ExpectError(FILEINDEX_ERR_NO_SUCH_FOLDER);
        ExpectLog({std::string("folders:191 No such folder: ") + path});
        EXPECT_FALSE(IsLocked(kFolderLock));
    }
}

TEST_F(GetTest, SettingsThatCannotBeLoadedAreAnError) {
    Json::Value out = kUntouched;
    PutFile(kFolderFile, "{");
    EXPECT_FALSE(IndexMgr::Get(out, "/photos/a"));
    ExpectError(FILEINDEX_ERR_LOAD);
    ExpectLog({kLoadFailed});
    EXPECT_FALSE(IsLocked(kFolderLock));
    PutFile(kFolderFile, "[]");
    EXPECT_FALSE(IndexMgr::Get(out, "/photos/a"));
    ExpectError(FILEINDEX_ERR_MALFORMED);
    ExpectLog({"folders:80 Malformed folders: []"});
    EXPECT_EQ(out, kUntouched);
}

TEST_F(GetTest, AHeldLockIsAnErrorAndNothingIsRead) {
    PutFile(kFolderFile, "{");
    Fault::Quiet(Call::Usleep);
    const HoldLock lock(kFolderLock);
    Json::Value out = kUntouched;
    EXPECT_FALSE(IndexMgr::Get(out, "/photos/a"));
    EXPECT_EQ(out, kUntouched);
    ExpectLeakedDescriptors(2);
    ExpectError(FILEINDEX_ERR_LOCK);
    ExpectLog({"config:74 Failed to lock folder"});
}

TEST_F(GetTest, AnExceptionReleasesTheLock) {
    PutFolders({"/photos/a"});
    platform.On("VANOShareGet", [](const std::string &) -> std::optional<int> {
        throw std::runtime_error("the platform fails");
    });
    Json::Value out;
    EXPECT_THROW((void)IndexMgr::Get(out, "/photos/a"), std::runtime_error);
    EXPECT_FALSE(IsLocked(kFolderLock));
}

class PageTest : public IndexMgrTest {};

TEST_F(PageTest, EveryArgumentReachesTheListing) {
    PutFile(kFolderFile, R"({"/photos/a":{"name":"2"},"/photos/b":{"name":"3"},
                             "/photos/c":{"name":"1"}})");
    MakeDirs("/volume1/photos/c");
    Json::Value out;
    EXPECT_TRUE(IndexMgr::List(out, 1, 1, "name", "ASC", Json("[]")));
    EXPECT_EQ(out["total"].asUInt64(), 3U);
    EXPECT_EQ(out["offset"].asUInt64(), 1U);
    ASSERT_EQ(out["folder"].size(), 1U);
    EXPECT_EQ(out["folder"][0]["path"], "/photos/a");
    EXPECT_TRUE(IndexMgr::List(out, 0, 2, "path", "DESC", Json(R"(["is_valid"])")));
    ASSERT_EQ(out["folder"].size(), 2U);
    EXPECT_EQ(out["folder"][0]["path"], "/photos/b");
    EXPECT_EQ(out["folder"][1]["path"], "/photos/a");
    EXPECT_TRUE(out["folder"][0]["additional"].isMember("is_valid"));
    ExpectLog({"utils:263 check realpath failed, path=/volume1/photos/b",
               "utils:263 check realpath failed, path=/volume1/photos/a"});
}

TEST_F(PageTest, NoLockIsTaken) {
    PutFolders({"/photos/a"});
    const HoldLock lock(kFolderLock);
    Watch();
    Json::Value out;
    EXPECT_TRUE(IndexMgr::List(out, 0, 10, "path", "ASC", Json("[]")));
    EXPECT_EQ(out["total"].asUInt64(), 1U);
    EXPECT_THAT(Effects(), IsEmpty());
}

TEST_F(PageTest, SettingsThatCannotBeLoadedAreAnError) {
    PutFile(kFolderFile, "{");
    Json::Value out = kUntouched;
    EXPECT_FALSE(IndexMgr::List(out, 0, 10, "path", "ASC", Json("[]")));
    EXPECT_EQ(out, kUntouched);
    ExpectError(FILEINDEX_ERR_LOAD);
    ExpectLog({kLoadFailed});
}

} // namespace

} // namespace VANO::TESTS
