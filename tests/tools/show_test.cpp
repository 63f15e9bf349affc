#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, ShowShowsOneFolder) {
    Save(kTwo);
    const Outcome outcome = Ctl({"show", "/media/films"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "path       /media/films\n"
                           "full path  /volume2/media/films\n"
                           "name       -\n"
                           "types      document,video\n"
                           "status     finished\n");
    EXPECT_EQ(outcome.error, "");
}

TEST_F(CtlTest, ShowAsJsonIsOneCompactObject) {
    Save(kTwo);
    EXPECT_EQ(Ctl({"show", "/photos", "--json"}).out,
              R"({"additional":{"is_valid":true,"status":"finished"},"audio":false,)"
              R"("document":false,"full_path":"/volume1/photos","name":"Photos","path":"/photos",)"
              R"("photo":true,"refusal":null,"video":false})"
              "\n");
}

TEST_F(CtlTest, ShowOfWhatIsNotSetFindsNothing) {
    Save(kPhotos);
    for (const char *path : {"/photo", "/photos/2016"}) {
        const Outcome outcome = Ctl({"show", path});
        EXPECT_EQ(outcome.status, kNotFound);
        EXPECT_EQ(outcome.out, "");
        EXPECT_THAT(outcome.error, HasSubstr(std::string(path) + " is not an indexed folder."));
    }
}

TEST_F(CtlTest, ShowOfAFolderWhoseShareIsGoneStillShowsIt) {
    Save(R"({"/gone":{"name":"G","photo":true}})");
    const Outcome outcome = Ctl({"show", "/gone"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.out, AllOf(HasSubstr("full path  -\n"), HasSubstr("cannot be indexed")));
}

TEST_F(CtlTest, ShowTakesAFullPath) {
    Save(kTwo);
    EXPECT_EQ(Ctl({"show", "/volume2/media/films"}).out, Ctl({"show", "/media/films"}).out);
    EXPECT_EQ(Ctl({"show", "/volume2/media/films"}).status, kDone);
}

TEST_F(CtlTest, ShowOfWhatLiesInAFolderNamesThatFolder) {
    Save(kPhotos);
    const Outcome outcome = Ctl({"show", "/volume1/photos/2016"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_EQ(outcome.error, "fileindexctl: /photos/2016 is not an indexed folder.\n"
                             "  It lies in /photos, which is indexed.\n");
}

TEST_F(CtlTest, ShowNamesTheRuleThatRefusesTheFolder) {
    Save(kTwo);
    RemoveTree("/volume2/media/films");
    EXPECT_THAT(Ctl({"show", "/media/films"}).error,
                HasSubstr("/media/films cannot be indexed: the directory does not exist"));
    EXPECT_EQ(Json(Ctl({"show", "/media/films", "--json"}).out)["refusal"]["rule"].asString(),
              "missing");
}

TEST_F(CtlTest, AShareWinsOverAFullPath) {
    // Of two meanings of /volume1/x the share's is taken.
    PutFile(kShares, R"({"photos":"/volume1/photos","volume1":"/mnt/volume1"})");
    Save(R"({"/photos":{"photo":true},"/volume1/photos":{"audio":true}})");
    EXPECT_THAT(Ctl({"show", "/volume1/photos"}).out, HasSubstr("types      audio\n"));
    PutFile(kShares, R"({"photos":"/volume1/photos"})");
    EXPECT_THAT(Ctl({"show", "/volume1/photos"}).out, HasSubstr("types      photo\n"));
}

TEST_F(CtlTest, ShowTakesNoLockAndNeedsNoRights) {
    if (CtlAsNobody({"--help"}).status != kDone) {
        GTEST_SKIP() << "no other user can run the program here";
    }
    Save(kPhotos);
    RemoveTree(kFolderLock);
    EXPECT_EQ(CtlAsNobody({"show", "/photos"}).status, kDone);
    EXPECT_FALSE(Exists(kFolderLock));
    const HoldLock other(kFolderLock);
    EXPECT_EQ(CtlAsNobody({"show", "/photos"}).out, Ctl({"show", "/photos"}).out);
}

} // namespace
} // namespace VANO::TESTS
