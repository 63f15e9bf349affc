// What other local users can put in place of a lock file: it lies in a directory that all can write
// to. Whatever it is, the call ends at once, says so, and no content changes.

#include <fileindex/status_mgr.h>

#include "support/fixture.h"

#include <chrono>
#include <sys/stat.h>
#include <unistd.h>

namespace VANO::TESTS {

namespace {

class HostileLockTest : public LibraryTest {
  protected:
    static bool Mark() { return StatusMgr::ShareSetNeedReindex("photos", true); }

    void ExpectRefused() {
        EXPECT_FALSE(Mark());
        ExpectError(FILEINDEX_ERR_LOCK);
        ExpectLog({"config:74 Failed to lock folder"});
        EXPECT_FALSE(Exists(kStatusFile));
    }
};

TEST_F(HostileLockTest, ADirectoryIsALockThatFails) {
    MakeDirs(kStatusLock);
    ExpectRefused();
    RemoveTree(kStatusLock);
}

TEST_F(HostileLockTest, ALinkToADirectoryIsALockThatFails) {
    ASSERT_EQ(::symlink("/volume1", kStatusLock), 0);
    ExpectRefused();
}

TEST_F(HostileLockTest, ALinkToItselfIsALockThatFails) {
    ASSERT_EQ(::symlink(kStatusLock, kStatusLock), 0);
    ExpectRefused();
}

TEST_F(HostileLockTest, AFifoIsNotWaitedFor) {
    ASSERT_EQ(::mkfifo(kStatusLock, 0666), 0);
    const auto begin = std::chrono::steady_clock::now();
    EXPECT_TRUE(Mark());
    EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::seconds(5));
}

TEST_F(HostileLockTest, WhatALinkLeadsToIsNotWrittenTo) {
    PutFile("/volume1/precious", "precious\n");
    ASSERT_EQ(::symlink("/volume1/precious", kStatusLock), 0);
    (void)Mark(); // the kernel may refuse to follow the link
    (void)SystemLog::Get().Lines();
    EXPECT_EQ(ReadText("/volume1/precious"), "precious\n");
    EXPECT_EQ(ModeOf("/volume1/precious"), mode_t{0644});
}

TEST_F(HostileLockTest, ALockFileThatRootMadeForItselfIsTakenAsItIs) {
    PutFile(kStatusLock, "");
    ASSERT_EQ(::chmod(kStatusLock, 0600), 0);
    EXPECT_TRUE(Mark());
    EXPECT_EQ(ModeOf(kStatusLock), mode_t{0600});
}

} // namespace

} // namespace VANO::TESTS
