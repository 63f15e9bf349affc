#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, SetChangesWhatIsNamedAndTellsTheDaemon) {
    StartDaemon();
    Save(kPhotos);
    const Outcome outcome = Ctl({"set", "/volume1/photos", "--document=yes", "--photo", "no"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Changed /photos.\n");
    EXPECT_EQ(ReadJson(kFolders),
              Json(R"({"/photos":{"path":"/photos","name":"Photos",)"
                   R"("document":true,"audio":false,"video":false,"photo":false}})"));
    EXPECT_THAT(Told(), ElementsAre(R"(command upsert_folder_setting {"folder_path":"/photos"})"));
}

TEST_F(CtlTest, SetChangesTheNameAlsoToNone) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(Ctl({"set", "/photos", "--name", "Ours"}).status, kDone);
    EXPECT_EQ(ReadJson(kFolders)["/photos"]["name"].asString(), "Ours");
    EXPECT_EQ(Ctl({"set", "/photos", "--name", ""}).status, kDone);
    EXPECT_EQ(ReadJson(kFolders)["/photos"]["name"].asString(), "");
    EXPECT_TRUE(ReadJson(kFolders)["/photos"]["photo"].asBool());
}

TEST_F(CtlTest, SetOfAFolderThatIsNotSetChangesNothing) {
    StartDaemon();
    Save(kPhotos);
    const Outcome outcome = Ctl({"set", "/photos", "/media", "--photo=no"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("Nothing was changed: /media is not an indexed folder."));
    EXPECT_EQ(ReadText(kFolders), kPhotos);
}

TEST_F(CtlTest, SetDryRunTellsAndDoesNothing) {
    Save(kTwo);
    const Outcome outcome =
        Ctl({"set", "/photos", "/media/films", "--video=yes", "--photo=no", "--dry-run"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "Would change /photos: video from no to yes, photo from yes to no.\n"
                           "Would leave /media/films as it is.\n");
    EXPECT_EQ(ReadText(kFolders), kTwo);
    EXPECT_EQ(Ctl({"set", "/photos", "--name=X", "--dry-run"}).out,
              "Would change /photos: name from 'Photos' to 'X'.\n");
}

TEST_F(CtlTest, SetSaysThatTheSettingsAreLocked) {
    Save(kPhotos);
    const HoldLock other(kFolderLock);
    const Outcome outcome = Ctl({"set", "/photos", "--photo=no"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, AllOf(HasSubstr("Cannot change /photos: the settings are locked"),
                                     HasSubstr("try again")));
    EXPECT_EQ(ReadText(kFolders), kPhotos);
}

TEST_F(CtlTest, SetOfAFolderWhoseShareIsGoneFails) {
    const std::string gone = R"({"/gone":{"photo":true}})";
    Save(gone);
    const Outcome outcome = Ctl({"set", "/gone", "--photo=no"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot change /gone: no share has that name"));
    EXPECT_EQ(ReadText(kFolders), gone);
}

} // namespace
} // namespace VANO::TESTS
