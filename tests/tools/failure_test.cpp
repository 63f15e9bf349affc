// What is said where a command fails for the machine's reasons rather than its arguments'.

#include <gmock/gmock.h>
#include <sys/stat.h>

#include "tools/ctl.h"

namespace VANO::TESTS {
namespace {

// --- Advice -------------------------------------------------------------------------------------

TEST_F(CtlTest, ABrokenSettingsFileLeadsToTheDoctor) {
    for (const char *broken : {"{", "[]"}) {
        Save(broken);
        EXPECT_THAT(Ctl({"list"}).error,
                    HasSubstr("\n  fileindexctl doctor settings shows where."));
    }
    RemoveTree(kFolders);
    PutFile(kStatus, R"({"no_space":"word"})");
    EXPECT_THAT(Ctl({"share", "no-space", "photos", "--set"}).error,
                HasSubstr("\n  fileindexctl doctor settings shows where."));
}

TEST_F(CtlTest, ALockThatSomebodyHoldsLeadsToTheDoctor) {
    const HoldLock other(kStatusLock);
    EXPECT_THAT(Ctl({"marks", "set", "a"}).error,
                AllOf(HasSubstr("Cannot mark a as done: the settings are locked."),
                      HasSubstr("try again, or run fileindexctl doctor locks.")));
}

TEST_F(CtlTest, ALockThatCannotBeOpenedIsToldFromOneThatIsHeld) {
    RemoveTree(kFolderLock);
    MakeDirs(kFolderLock);
    const Outcome outcome = Ctl({"add", "/photos", "--photo"});
    RemoveTree(kFolderLock);
    EXPECT_EQ(outcome.status, kFailed);
    EXPECT_THAT(outcome.error,
                AllOf(HasSubstr("Cannot add /photos: a lock file cannot be opened: Is a directory"),
                      HasSubstr("\n  Run fileindexctl doctor locks.")));
}

TEST_F(CtlTest, ADaemonThatIsNotThereLeadsToTheDoctor) {
    for (const Words &arguments :
         {Words{"pause"}, Words{"resume"}, Words{"share", "no-space", "photos", "--revive"}}) {
        EXPECT_THAT(Ctl(arguments).error, HasSubstr("fileindexctl doctor daemon"));
    }
    Save(kTwo);
    for (const Words &arguments :
         {Words{"add", "/photos", "--photo"}, Words{"remove", "/photos"}}) {
        EXPECT_THAT(Ctl(arguments).error, HasSubstr("fileindexctl doctor shows what is wrong"));
    }
}

// --- Rights -------------------------------------------------------------------------------------

class RightsTest : public CtlTest {
  protected:
    void SetUp() override {
        CtlTest::SetUp();
        if (CtlAsNobody({"--help"}).status != kDone) {
            GTEST_SKIP() << "no other user can run the program here";
        }
        for (const char *lock : {kFolderLock, kStatusLock}) {
            RemoveTree(lock);
            PutFile(lock, ""); // root's, as after its first change
        }
    }

    static constexpr char kAdvice[] = "\n  This needs root: try again with sudo.\n";
};

TEST_F(RightsTest, AChangeWithoutThemSaysThatItNeedsRoot) {
    Save(kPhotos);
    for (const Words &arguments : {Words{"add", "/photos", "--all"}, Words{"remove", "/photos"},
                                   Words{"pause"}, Words{"share", "remove", "photos"}}) {
        const Outcome outcome = CtlAsNobody(arguments);
        EXPECT_EQ(outcome.status, kFailed) << arguments[0];
        EXPECT_THAT(outcome.error, HasSubstr(kAdvice)) << arguments[0];
    }
    EXPECT_EQ(ReadText(kFolders), kPhotos);
}

TEST_F(RightsTest, SettingsThatCannotBeReadNeedRoot) {
    Save(kPhotos);
    ASSERT_EQ(::chmod(kFolders, 0600), 0);
    EXPECT_THAT(CtlAsNobody({"list"}).error, HasSubstr(kAdvice));
}

TEST_F(RightsTest, BrokenSettingsDoNotNeedRoot) {
    Save("{");
    EXPECT_THAT(CtlAsNobody({"list"}).error,
                AllOf(HasSubstr("doctor settings"), Not(HasSubstr("sudo"))));
}

TEST_F(RightsTest, ALockThatIsHeldDoesNotNeedRoot) {
    ASSERT_EQ(::chmod(kFolderLock, 0666), 0);
    ASSERT_EQ(::chmod(kStatusLock, 0666), 0);
    const HoldLock other(kStatusLock);
    EXPECT_THAT(CtlAsNobody({"pause"}).error,
                AllOf(HasSubstr("the settings are locked"), Not(HasSubstr("sudo"))));
}

} // namespace
} // namespace VANO::TESTS
