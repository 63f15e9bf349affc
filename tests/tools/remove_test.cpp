#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, RemoveDropsTheSettingAndTellsTheDaemon) {
    StartDaemon();
    Save(kTwo);
    const Outcome outcome = Ctl({"remove", "/photos"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Removed /photos.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media/films"));
    EXPECT_THAT(Told(), ElementsAre(R"(command delete_folder_setting {"folder_path":"/photos"})"));
}

TEST_F(CtlTest, RemoveOfSomethingThatIsNotSetRemovesNothing) {
    StartDaemon();
    Save(kPhotos);
    const Outcome outcome = Ctl({"remove", "/photos", "/photo"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("Nothing was removed: /photo is not an indexed folder."));
    EXPECT_EQ(ReadText(kFolders), kPhotos);
    EXPECT_THAT(Told(), IsEmpty());
}

TEST_F(CtlTest, RemoveWithoutADaemonSaysThatOnlyTheSettingsFollowed) {
    Save(kTwo);
    const Outcome outcome = Ctl({"remove", "/photos"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("The setting is removed, but not every part"));
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media/films"));
}

TEST_F(CtlTest, RemoveOfTheLastFolderNeedsNoDaemon) {
    Save(kPhotos);
    EXPECT_EQ(Ctl({"remove", "/photos"}).status, kDone);
    EXPECT_EQ(ReadText(kFolders), "{}");
}

TEST_F(CtlTest, RemoveTakesAFullPath) {
    StartDaemon();
    Save(kTwo);
    EXPECT_EQ(Ctl({"remove", "/volume2/media/films"}).error,
              "fileindexctl: Removed /media/films.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/photos"));
}

TEST_F(CtlTest, RemoveDryRunTellsAndDoesNothing) {
    StartDaemon();
    Save(kTwo);
    MakeDirs(kPhotoIndex);
    const Outcome one = Ctl({"remove", "/photos", "--dry-run"});
    EXPECT_EQ(one.status, kDone);
    EXPECT_EQ(one.out, "Would remove /photos.\nWould delete the index of share photos.\n");
    EXPECT_EQ(one.error, "");
    EXPECT_EQ(Ctl({"remove", "/photos", "/media/films", "--dry-run"}).out,
              "Would remove /photos.\nWould remove /media/films.\n"
              "Would delete the index of share media.\nWould delete the index of share photos.\n"
              "Would stop fileindexd and switch Spotlight off: no folder would be left.\n");
    EXPECT_EQ(Ctl({"remove", "/nix", "--dry-run"}).status, kNotFound);
    EXPECT_EQ(ReadText(kFolders), kTwo);
    EXPECT_TRUE(Exists(kPhotoIndex));
    EXPECT_THAT(Told(), IsEmpty());
}

TEST_F(CtlTest, RemoveDryRunKeepsTheIndexOfAShareWithOtherFolders) {
    Save(R"({"/photos":{"photo":true},"/photos/2016":{"photo":true},"/media":{"audio":true}})");
    EXPECT_EQ(Ctl({"remove", "/photos", "--dry-run"}).out, "Would remove /photos.\n");
}

constexpr char kWithGone[] = R"({"/gone/x":{"photo":true},"/media":{"photo":true},)"
                             R"("/photos":{"photo":true}})";

TEST_F(CtlTest, RemoveOfAFolderWhoseShareIsGoneIsDone) {
    Save(kWithGone);
    const Outcome preview = Ctl({"remove", "/gone/x", "--dry-run"});
    EXPECT_EQ(preview.status, kDone);
    EXPECT_EQ(preview.out, "Would remove /gone/x.\n");
    const Outcome outcome = Ctl({"remove", "/gone/x"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error,
              "fileindexctl: Removed /gone/x.\n"
              "  There was no index to delete for /gone/x: no share has that name.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media", "/photos"));
}

TEST_F(CtlTest, RemoveGoesOnBeyondAShareThatIsGone) {
    StartDaemon();
    Save(kWithGone);
    MakeDirs(kPhotoIndex);
    const Outcome outcome = Ctl({"remove", "/gone/x", "/photos"});
    EXPECT_EQ(outcome.status, kDone) << outcome.error;
    EXPECT_FALSE(Exists(kPhotoIndex));
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/media"));
    EXPECT_THAT(Told(), ElementsAre(R"(command delete_folder_setting {"folder_path":"/gone/x"})",
                                    R"(command delete_folder_setting {"folder_path":"/photos"})"));
}

TEST_F(CtlTest, RemoveSaysThatTheSettingsAreLocked) {
    Save(kWithGone);
    const HoldLock other(kFolderLock);
    for (const char *path : {"/gone/x", "/photos"}) {
        const Outcome outcome = Ctl({"remove", path});
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_THAT(outcome.error,
                    HasSubstr(std::string("Cannot remove ") + path + ": the settings are locked"));
    }
    EXPECT_EQ(ReadText(kFolders), kWithGone);
}

} // namespace
} // namespace VANO::TESTS
