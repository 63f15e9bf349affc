#include <gmock/gmock.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

TEST_F(CtlTest, MigrateWithoutFoldersStopsTheDaemon) {
    EXPECT_EQ(Ctl({"migrate", "--dry-run"}).out, "Would stop fileindexd: no folder is indexed.\n");
    const Outcome outcome = Ctl({"migrate"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.error, "fileindexctl: fileindexd is stopped: no folder is indexed.\n");
}

TEST_F(CtlTest, MigrateQueuesEveryFolder) {
    constexpr char kSamba[] = "/etc/samba/smb.conf";
    if (!Exists("/usr/bin/testparm") || !Exists("/usr/bin/net")) {
        GTEST_SKIP() << "no Samba: Spotlight cannot be switched on";
    }
    Save(kTwo);
    PutFile(kSamba, "[global]\nspotlight = yes\n");
    const Outcome outcome = Ctl({"migrate", "--json"});
    RemoveTree(kSamba);
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, R"({"command":"migrate","done":true,"dry_run":false,)"
                           R"("paths":["/media/films","/photos"]})"
                           "\n");
    EXPECT_EQ(outcome.error, "fileindexctl: The services are up to date, and every folder is "
                             "queued for reindexing.\n");
    EXPECT_THAT(ReadText(kPhotoQueue), HasSubstr(R"("event":65536,"path":"/volume1/photos")"));
    EXPECT_THAT(NamesIn(kMonitors), SizeIs(2));
}

TEST_F(CtlTest, MigrateDryRunTellsAndDoesNothing) {
    Save(kTwo);
    const Outcome outcome = Ctl({"migrate", "--dry-run"});
    EXPECT_EQ(outcome.status, kDone);
    EXPECT_EQ(outcome.out, "Would start fileindexd and switch Spotlight on.\n"
                           "Would watch every share that has indexed folders.\n"
                           "Would queue /media/films for reindexing.\n"
                           "Would queue /photos for reindexing.\n");
    EXPECT_FALSE(Exists(kPhotoQueue));
    EXPECT_FALSE(Exists(kMonitors));
}

TEST_F(CtlTest, MigrateThatStopsHalfWaySaysSo) {
    Save(kTwo);
    RemoveTree("/etc/init.d/fileindexd"); // there is no such service to start
    const Outcome outcome = Ctl({"migrate"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("The migration stopped halfway"));
    EXPECT_FALSE(Exists(kPhotoQueue));
}

TEST_F(CtlTest, MigrateOfBrokenSettingsFails) {
    Save("[]");
    const Outcome outcome = Ctl({"migrate"});
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error, HasSubstr("Cannot migrate: a settings file"));
}

} // namespace
} // namespace VANO::TESTS
