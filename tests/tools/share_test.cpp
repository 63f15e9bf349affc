#include <gmock/gmock.h>
#include <sys/stat.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, ShareRenameMovesTheFolders) {
    Save(kTwo);
    PutFile(kShares, R"({"pictures":"/volume1/pictures","media":"/volume2/media"})");
    const Outcome outcome = Ctl({"share", "rename", "photos", "pictures"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Moved the folders of photos to pictures.\n"
                             "  Run fileindexctl share resume next.\n");
    const Json::Value folders = ReadJson(kFolders);
    EXPECT_THAT(folders.getMemberNames(), ElementsAre("/media/films", "/pictures"));
    EXPECT_EQ(folders["/pictures"]["name"].asString(), "Photos");
}

TEST_F(CtlTest, ShareRenameToAnUnknownShareChangesNothing) {
    Save(kTwo);
    const Outcome outcome = Ctl({"share", "rename", "photos", "pictures"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error,
                HasSubstr("Cannot move the folders of photos to pictures: no share has that "
                          "name"));
    EXPECT_EQ(ReadText(kFolders), kTwo);
}

TEST_F(CtlTest, ShareRenameOfAShareWithoutFoldersFindsNothing) {
    Save(kPhotos);
    const Outcome outcome = Ctl({"share", "rename", "media", "films"});
    EXPECT_EQ(outcome.status, kNotFound);
    EXPECT_THAT(outcome.error, HasSubstr("no folder of share media is indexed"));
    EXPECT_EQ(ReadText(kFolders), kPhotos);
}

TEST_F(CtlTest, SharePauseAndResumeTellTheDaemonAndTheMonitor) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(Ctl({"share", "resume", "photos"}).status, kDone);
    EXPECT_THAT(NamesIn(kMonitors), Not(IsEmpty()));
    EXPECT_EQ(Ctl({"share", "pause", "photos"}).status, kDone);
    EXPECT_THAT(NamesIn(kMonitors), IsEmpty());
    EXPECT_THAT(Told(), ElementsAre(R"(command revive_share_worker {"share_name":"photos"})",
                                    R"(command delete_share_worker {"share_name":"photos"})"));
}

TEST_F(CtlTest, SharePauseWithoutADaemonFails) {
    Save(kPhotos);
    const Outcome outcome = Ctl({"share", "pause", "photos"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot stop indexing share photos"));
}

constexpr char kWithGone[] = R"({"/gone/x":{"photo":true},"/photos":{"photo":true},)"
                             R"("/photos/2016":{"photo":true}})";

TEST_F(CtlTest, ShareListShowsSharesFoldersAndMarks) {
    Save(kWithGone);
    PutFile(kStatus, R"({"no_space":{"photos":true},"need_reindex":{"photos":true,"old":true}})");
    const Outcome outcome = Ctl({"share", "list"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "gone    -                1  no such share\n"
                           "media   /volume2/media   0  -\n"
                           "old     -                0  no such share, needs reindexing\n"
                           "photos  /volume1/photos  2  out of space, needs reindexing\n");
    EXPECT_EQ(outcome.error, "");
}

TEST_F(CtlTest, ShareListAsJson) {
    Save(kPhotos);
    PutFile(kStatus, R"({"need_reindex":{"photos":true}})");
    EXPECT_EQ(Ctl({"share", "list", "--json"}).out,
              R"({"share":[{"directory":"/volume2/media","folders":0,"name":"media",)"
              R"("need_reindex":false,"no_space":false},{"directory":"/volume1/photos",)"
              R"("folders":1,"name":"photos","need_reindex":true,"no_space":false}]})"
              "\n");
}

TEST_F(CtlTest, ShareListWithZeroBytesHoldsAnyName) {
    PutFile(kShares, R"({"a\nb":"/volume1/a\nb","c d":"/volume1/c d"})");
    EXPECT_EQ(Ctl({"share", "list", "--null"}).out, std::string("a\nb\0c d\0", 8));
}

TEST_F(CtlTest, ShareListWithoutATableShowsSharesWithFolders) {
    Save(kPhotos);
    for (const char *table : {"", "[]", "{"}) {
        PutFile(kShares, table);
        EXPECT_EQ(Ctl({"share", "list"}).out, "photos  -  1  no such share\n") << table;
    }
    RemoveTree(kShares);
    RemoveTree(kFolders);
    EXPECT_EQ(Ctl({"share", "list"}).error, "fileindexctl: There are no shares.\n");
}

TEST_F(CtlTest, ShareListReadsTheTableAsThePlatformDoes) {
    Save(kPhotos);
    PutFile(kShares, R"({"media":"/volume2/media", /* a comment */ "x":"/volume1/x"})");
    EXPECT_EQ(Ctl({"share", "list"}).out, "photos  -  1  no such share\n");
    RemoveTree(kShares);
    ASSERT_EQ(::mkfifo(kShares, 0644), 0); // which nobody writes to
    EXPECT_EQ(Ctl({"share", "list"}).out, "photos  -  1  no such share\n");
    RemoveTree(kShares);
}

TEST_F(CtlTest, ShareListOfBrokenFilesFails) {
    Save("[]");
    EXPECT_THAT(Ctl({"share", "list"}).error, HasSubstr("Cannot list the shares"));
    Save("{}");
    for (const char *broken : {"{", "[]"}) {
        PutFile(kStatus, broken);
        const Outcome outcome = Ctl({"share", "list"});
        EXPECT_EQ(outcome.status, kFailed);
        EXPECT_THAT(outcome.error, HasSubstr("Cannot list the shares: a settings file"));
    }
}

TEST_F(CtlTest, ShareRemoveDropsTheFoldersOfAShareThatIsGone) {
    Save(kWithGone);
    EXPECT_EQ(Ctl({"share", "remove", "gone", "--dry-run"}).out, "Would remove /gone/x.\n");
    EXPECT_EQ(ReadText(kFolders), kWithGone);
    const Outcome outcome = Ctl({"share", "remove", "gone"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: Removed 1 folder of share gone.\n");
    EXPECT_THAT(ReadJson(kFolders).getMemberNames(), ElementsAre("/photos", "/photos/2016"));
}

TEST_F(CtlTest, ShareRemoveSaysThatTheIndexIsStillThere) {
    Save(kWithGone);
    MakeDirs(kPhotoIndex);
    const Outcome outcome = Ctl({"share", "remove", "photos"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.error, HasSubstr("Removed 2 folders of share photos.\n  Its index"));
    EXPECT_TRUE(Exists(kPhotoIndex));
}

TEST_F(CtlTest, ShareRemoveOfAShareWithoutFoldersFindsNothing) {
    Save(kPhotos);
    EXPECT_EQ(Ctl({"share", "remove", "media"}).status, kNotFound);
    EXPECT_EQ(ReadText(kFolders), kPhotos);
}

TEST_F(CtlTest, ShareCleanDeletesIndexAndQueue) {
    MakeDirs(kPhotoIndex);
    PutFile(kPhotoQueue, "x");
    EXPECT_EQ(Ctl({"share", "clean", "photos", "--dry-run"}).out,
              "Would delete the index of share photos.\n");
    EXPECT_TRUE(Exists(kPhotoQueue));
    const Outcome outcome = Ctl({"share", "clean", "photos"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_THAT(outcome.error, HasSubstr("Deleted the index of share photos."));
    EXPECT_FALSE(Exists(kPhotoQueue));
    EXPECT_FALSE(Exists(kPhotoIndex));
}

TEST_F(CtlTest, ShareRenameDryRunTellsAndDoesNothing) {
    Save(kWithGone);
    EXPECT_EQ(Ctl({"share", "rename", "gone", "media", "--dry-run"}).out,
              "Would move /gone/x to /media/x.\n");
    const Outcome unknown = Ctl({"share", "rename", "photos", "nix", "--dry-run"});
    EXPECT_EQ(unknown.status, kFailed);
    EXPECT_THAT(unknown.error, HasSubstr("photos to nix: no share has that name"));
    EXPECT_EQ(ReadText(kFolders), kWithGone);
}

TEST_F(CtlTest, SharePauseAndResumeDryRunTellAndDoNothing) {
    StartDaemon();
    Save(kPhotos);
    EXPECT_EQ(Ctl({"share", "pause", "photos", "--dry-run"}).out,
              "Would stop indexing share photos.\n");
    EXPECT_EQ(Ctl({"share", "resume", "photos", "--dry-run"}).out,
              "Would resume indexing share photos.\n");
    EXPECT_FALSE(Exists(kMonitors));
    EXPECT_THAT(Told(), IsEmpty());
}

TEST_F(CtlTest, WorkOnAnUnknownShareFindsNothing) {
    StartDaemon();
    for (const char *command : {"pause", "resume", "clean"}) {
        const Outcome outcome = Ctl({"share", command, "nix"});
        EXPECT_EQ(outcome.status, kNotFound) << command;
        EXPECT_EQ(outcome.error, "fileindexctl: No share has the name nix.\n"
                                 "  fileindexctl share list shows the shares.\n");
    }
    EXPECT_THAT(Told(), IsEmpty());
}

} // namespace
} // namespace VANO::TESTS
