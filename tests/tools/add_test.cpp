#include <gmock/gmock.h>
#include <unistd.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, AddSavesAndTellsEverybody) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/photos", "--photo", "--video", "--name", "Our photos"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Added /photos.\n");
    EXPECT_EQ(ReadJson(kFolders),
              Json(R"({"/photos":{"path":"/photos","name":"Our photos",)"
                   R"("document":false,"audio":false,"video":true,"photo":true}})"));
    EXPECT_THAT(NamesIn(kMonitors), ElementsAre(HasSubstr("fileindex")));
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr(R"("event":131072,"path":"/volume1/photos")"));
    EXPECT_THAT(Told(), ElementsAre(R"(command upsert_folder_setting {"folder_path":"/photos"})"));
}

TEST_F(CtlTest, AddKeepsTheNameAndTheOtherTypes) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(Ctl({"add", "/photos", "--document"}).status, kDone);
    EXPECT_EQ(ReadJson(kFolders),
              Json(R"({"/photos":{"path":"/photos","name":"Photos",)"
                   R"("document":true,"audio":false,"video":false,"photo":true}})"));
}

TEST_F(CtlTest, AddTakesSeveralFoldersOfAllTypes) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/photos/2016", "/media/films", "--all"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Added /photos/2016, /media/films.\n");
    const Json::Value folders = ReadJson(kFolders);
    for (const char *path : {"/photos/2016", "/media/films"}) {
        for (const char *type : {"document", "audio", "video", "photo"}) {
            EXPECT_TRUE(folders[path][type].asBool()) << path << ' ' << type;
        }
    }
}

TEST_F(CtlTest, AddOfAnUnknownShareSaysSoAndSavesNothing) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/nowhere", "--all"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.error, AllOf(StartsWith("fileindexctl: Cannot add /nowhere: no share has "
                                                "that name (platform error 0x1400, "),
                                     HasSubstr("\n  Paths begin with /SHARE")));
    EXPECT_FALSE(Exists(kFolders));
}

TEST_F(CtlTest, AddOfAMissingFolderWarns) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/photos/nowhere", "--all"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.error, HasSubstr("/photos/nowhere cannot be indexed as it is"));
}

TEST_F(CtlTest, AddWithoutADaemonSaysThatOnlyTheSettingsFollowed) {
    const Outcome outcome = Ctl({"add", "/photos", "--photo"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("/photos is saved, but not every part"));
    EXPECT_TRUE(ReadJson(kFolders)["/photos"]["photo"].asBool());
}

TEST_F(CtlTest, AddSaysThatTheSettingsAreLocked) {
    const HoldLock other(kFolderLock);
    const Outcome outcome = Ctl({"add", "/photos", "--photo"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, AllOf(HasSubstr("Cannot add /photos: the settings are locked"),
                                     HasSubstr("try again")));
    EXPECT_FALSE(Exists(kFolders));
}

TEST_F(CtlTest, AddOfWhatIsSetAlreadySaysThatTheSettingsAreLocked) {
    Save(kPhotos);
    const HoldLock other(kFolderLock);
    for (const Words &arguments :
         {Words{"add", "/photos", "--photo"}, Words{"set", "/photos", "--photo=yes"}}) {
        const Outcome outcome = Ctl(arguments);
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_THAT(outcome.error, HasSubstr("/photos: the settings are locked"));
    }
}

TEST_F(CtlTest, AddOfAFolderThatIsSetAndWhoseShareIsGoneFails) {
    StartDaemon();
    Save(R"({"/gone":{"photo":true}})");
    const Outcome outcome = Ctl({"add", "/gone", "--photo"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot add /gone: no share has that name"));
}

TEST_F(CtlTest, AddOfAFolderBesideOneThatIsGoneSaysThatItIsSaved) {
    Save(R"({"/gone":{"photo":true}})");
    const Outcome outcome = Ctl({"add", "/photos", "--photo"}); // nobody listens
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("/photos is saved, but not every part"));
}

TEST_F(CtlTest, AddTakesAFullPathForAFolderOfAShare) {
    StartDaemon();
    const Outcome outcome = Ctl({"add", "/volume1/photos/2016", "--photo"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Added /photos/2016.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/photos/2016"));
}

TEST_F(CtlTest, AddNamesTheRuleThatRefusesTheFolder) {
    StartDaemon();
    ASSERT_EQ(::symlink("2016", "/volume1/photos/link"), 0);
    const Outcome outcome = Ctl({"add", "/photos/link", "--photo"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.error, AllOf(HasSubstr("symbolic links"),
                                     HasSubstr("the real path is /volume1/photos/2016")));
}

TEST_F(CtlTest, AddDryRunTellsAndDoesNothing) {
    Save(kPhotos);
    const Outcome outcome =
        Ctl({"add", "/photos", "/media/films", "--photo", "--video", "--dry-run"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "Would change /photos: video from no to yes.\n"
                           "Would add /media/films for video,photo.\n");
    EXPECT_EQ(outcome.error, "");
    EXPECT_EQ(ReadText(kFolders), kPhotos);
    EXPECT_FALSE(Exists(kFolderLock) && IsLocked(kFolderLock));
}

TEST_F(CtlTest, AddDryRunFailsForWhatWouldFail) {
    const Outcome outcome = Ctl({"add", "/nowhere", "--all", "--dry-run"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.error, HasSubstr("no share has that name"));
}

TEST_F(CtlTest, AddDryRunFindsTheLimit) {
    Json::Value folders(Json::objectValue);
    for (int i = 0; i < 1000; ++i) {
        const std::string path = "/photos/" + std::to_string(i);
        folders[path]["path"] = path;
    }
    Save(CompactText(folders));
    const Outcome outcome = Ctl({"add", "/photos/x", "--all", "--dry-run"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("limit of 1000 folders"));
}

} // namespace
} // namespace VANO::TESTS
