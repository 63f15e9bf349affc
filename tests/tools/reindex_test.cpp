#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, ReindexQueuesAnEventForEachFolder) {
    Save(kTwo);
    const Outcome outcome = Ctl({"reindex", "/photos", "/media/films"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "");
    EXPECT_EQ(outcome.error, "fileindexctl: Queued /photos, /media/films for reindexing.\n");
    EXPECT_EQ(ReadText(kPhotoQueue), R"({"data":null,"event":65536,"path":"/volume1/photos"})"
                                     "\n");
    EXPECT_EQ(ReadText("/volume2/media/@eaDir/VANO@file_index_queue"),
              R"({"data":null,"event":65536,"path":"/volume2/media/films"})"
              "\n");
}

TEST_F(CtlTest, ReindexOfWhatIsNotIndexedDoesNothing) {
    Save(kPhotos);
    const Outcome outcome = Ctl({"reindex", "/photos", "/media/films"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("Nothing was done: /media/films is not indexed."));
    EXPECT_FALSE(Exists(kPhotoQueue));
}

TEST_F(CtlTest, ReindexTakesFullPathsAndWhatHoldsFolders) {
    Save(kTwo);
    const Outcome outcome = Ctl({"reindex", "/volume1/photos/2016", "/media"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Queued /photos/2016, /media for reindexing.\n");
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr(R"("path":"/volume1/photos/2016")"));
}

TEST_F(CtlTest, ReindexAllQueuesEveryFolder) {
    Save(kTwo);
    const Outcome outcome = Ctl({"reindex", "--all"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Queued /media/films, /photos for reindexing.\n");
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr(R"("path":"/volume1/photos")"));
}

TEST_F(CtlTest, ReindexAllLeavesOutWhatIsGoneAndSaysSo) {
    Save(R"({"/gone":{"photo":true},"/photos":{"photo":true}})");
    const Outcome outcome = Ctl({"reindex", "--all"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Skipped /gone: no share has that name."));
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr(R"("path":"/volume1/photos")"));
}

TEST_F(CtlTest, ReindexAllOfNothingFindsNothing) {
    const Outcome outcome = Ctl({"reindex", "--all"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_EQ(outcome.error, "fileindexctl: No folder is indexed.\n");
}

TEST_F(CtlTest, ReindexDryRunTellsAndDoesNothing) {
    Save(kTwo);
    const Outcome outcome = Ctl({"reindex", "--all", "--dry-run"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "Would queue /media/films for reindexing.\n"
                           "Would queue /photos for reindexing.\n");
    EXPECT_EQ(outcome.error, "");
    EXPECT_FALSE(Exists(kPhotoQueue));
    EXPECT_EQ(Ctl({"reindex", "/nix", "--dry-run"}).status, kNotFound);
}

} // namespace
} // namespace VANO::TESTS
