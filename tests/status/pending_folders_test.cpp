// Which folders have events at or below them. The class is inside the library: it is compiled into
// this test.

#include "status/pending_folders.h"

#include <fileindex/share_path.h>
#include <map>
#include <random>

#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

class PendingFoldersTest : public LibraryTest {};

TEST_F(PendingFoldersTest, AnEventReachesEveryFolderAroundIt) {
    PendingFolders folders({"/v/b", "/v/a/b/c", "/v/a", "/v/a/b", "/v/a-b", "/v/a"});
    folders.AddEvent("/v/a/b/x");
    EXPECT_TRUE(folders.IsPending("/v/a"));
    EXPECT_TRUE(folders.IsPending("/v/a/b"));
    EXPECT_FALSE(folders.IsPending("/v/a/b/c"));
    EXPECT_FALSE(folders.IsPending("/v/a-b"));
    EXPECT_FALSE(folders.IsPending("/v/b"));
    folders.AddEvent("/v/a/b/c");
    EXPECT_TRUE(folders.IsPending("/v/a/b/c"));
}

TEST_F(PendingFoldersTest, HoldsTheFoldersThatItWasMadeOf) {
    const PendingFolders folders({"/v/b", "/v/a"});
    EXPECT_TRUE(folders.Holds("/v/a"));
    EXPECT_TRUE(folders.Holds("/v/b"));
    EXPECT_FALSE(folders.Holds("/v"));
    EXPECT_FALSE(folders.Holds("/v/a/b"));
    EXPECT_FALSE(PendingFolders({}).Holds("/v/a"));
    EXPECT_FALSE(folders.IsPending("/v/c"));
}

// Names that sort around "/", and prefixes of one another.
std::string SomePath(std::mt19937 &random) {
    static const char *const kNames[] = {"a", "a-", "a0", "aa", "b", "\xc3\xbc"};
    std::string path;
    for (std::size_t depth = 1 + random() % 4; depth > 0; --depth) {
        path += std::string("/") + kNames[random() % std::size(kNames)];
    }
    return path;
}

TEST_F(PendingFoldersTest, EveryFolderIsAnsweredAsIfItWereAlone) {
    std::mt19937 random(7);
    for (int round = 0; round < 2000; ++round) {
        std::map<std::string, bool> expected;
        std::vector<std::string> paths;
        for (std::size_t count = random() % 30; count > 0; --count) {
            paths.push_back(random() % 20 == 0 ? "" : SomePath(random)); // "": of a gone share
            expected[paths.back()] = false;
        }
        PendingFolders folders(paths);
        for (std::size_t count = random() % 8; count > 0; --count) {
            const std::string event = random() % 20 == 0 ? "" : SomePath(random);
            folders.AddEvent(event);
            for (auto &[path, isPending] : expected) {
                isPending = isPending || FILEINDEX::StringStartWith(event + "/", path + "/");
            }
        }
        for (const auto &[path, isPending] : expected) {
            ASSERT_TRUE(folders.Holds(path)) << path;
            ASSERT_EQ(folders.IsPending(path), isPending) << path << " in round " << round;
        }
    }
}

} // namespace

} // namespace VANO::TESTS
