// The platform finds shares in any case; settings, marks and the daemon know one spelling of each.

#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, AddTakesTheSharesOwnSpelling) {
    StartDaemon();
    EXPECT_EQ(Ctl({"add", "/PHOTOS", "/Photos/2016", "--photo"}).error,
              "fileindexctl: Added /photos, /photos/2016.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/photos", "/photos/2016"));
}

TEST_F(CtlTest, AFolderIsFoundByAnySpellingOfItsShare) {
    StartDaemon();
    Save(kTwo);
    EXPECT_EQ(Ctl({"show", "/PHOTOS"}).out, Ctl({"show", "/photos"}).out);
    EXPECT_EQ(Ctl({"status", "/PHOTOS"}).out, Ctl({"status", "/photos"}).out);
    EXPECT_EQ(Ctl({"query", "/PHOTOS/2016"}).status, kDone);
    EXPECT_EQ(Ctl({"query", "--share", "PHOTOS"}).status, kDone);
    EXPECT_EQ(Ctl({"list", "--share", "PHOTOS"}).out, Ctl({"list", "--share", "photos"}).out);
    EXPECT_EQ(Ctl({"set", "/PHOTOS", "--video=yes"}).error, "fileindexctl: Changed /photos.\n");
    EXPECT_EQ(Ctl({"reindex", "/PHOTOS"}).status, kDone);
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr(R"("event":65536,"path":"/volume1/photos")"));
    EXPECT_EQ(Ctl({"remove", "/PHOTOS"}).error, "fileindexctl: Removed /photos.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media/films"));
}

TEST_F(CtlTest, AShareIsFoundByAnySpelling) {
    StartDaemon();
    Save(kTwo);
    EXPECT_EQ(Ctl({"share", "no-space", "PHOTOS", "--set"}).status, kDone);
    EXPECT_EQ(ReadText(kStatus), R"({"no_space":{"photos":true}})");
    EXPECT_EQ(Ctl({"share", "no-space", "Photos"}).out,
              "Share photos is marked as out of space.\n");
    EXPECT_EQ(Ctl({"share", "pause", "PHOTOS"}).status, kDone);
    EXPECT_EQ(Ctl({"share", "remove", "PHOTOS"}).status, kDone);
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media/films"));
    EXPECT_EQ(Ctl({"share", "rename", "media", "PHOTOS"}).status, kDone);
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/photos/films"));
    EXPECT_THAT(Told(), ElementsAre(R"(command delete_share_worker {"share_name":"photos"})"));
}

TEST_F(CtlTest, AShareThatIsGoneKeepsTheSpellingThatWasTyped) {
    Save(R"({"/Gone":{"photo":true}})");
    PutFile(kStatus, R"({"need_reindex":{"Gone":true}})");
    EXPECT_EQ(Ctl({"show", "/Gone"}).status, kDone);
    EXPECT_EQ(Ctl({"show", "/gone"}).status, kNotFound);
    EXPECT_EQ(Ctl({"share", "need-reindex", "Gone", "--clear"}).status, kDone);
    EXPECT_EQ(Ctl({"share", "remove", "gone"}).status, kNotFound);
    EXPECT_EQ(Ctl({"share", "remove", "Gone"}).status, kDone);
}

TEST_F(CtlTest, ARenamingToAnotherCaseMovesTheFolders) {
    Save(kPhotos);
    PutFile(kShares, R"({"Photos":"/volume1/Photos"})");
    EXPECT_EQ(Ctl({"share", "rename", "photos", "photos"}).status, kDone);
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/Photos"));
}

TEST_F(CtlTest, PathsAreSpeltAsTheirDirectoryIs) {
    StartDaemon();
    PutFile(kShares, R"({"Photos":"/volume1/photos"})");
    const Outcome outcome = Ctl({"add", "/Photos", "/volume1/photos/2016", "--photo"});
    EXPECT_EQ(outcome.error, "fileindexctl: Added /photos, /photos/2016.\n");
}

TEST_F(CtlTest, RemoveOfAMisspeltFolderKeepsTheIndexOfItsShare) {
    const std::string misspelt = R"({"/Photos":{"photo":true},"/photos/2016":{"audio":true}})";
    Save(misspelt);
    MakeDirs(kPhotoIndex);
    const Outcome outcome = Ctl({"remove", "/Photos"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error,
                AllOf(HasSubstr("/Photos is set under another spelling of share photos"),
                      HasSubstr("\n  fileindexctl share rename Photos photos corrects that")));
    EXPECT_EQ(ReadText(kFolders), misspelt);
    EXPECT_TRUE(Exists(kPhotoIndex));
    EXPECT_EQ(Ctl({"share", "rename", "Photos", "photos"}).status, kDone);
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/photos", "/photos/2016"));
    EXPECT_TRUE(Exists(kPhotoIndex));
}

} // namespace
} // namespace VANO::TESTS
