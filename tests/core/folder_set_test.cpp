// Which folders hold which events. The class is hidden in the library: it is linked a second time.

#include "core/folder_set.h"

#include <fileindex/share_path.h>
#include <map>
#include <random>

#include "core/event.h"
#include "support/fixture.h"

namespace VANO::TESTS {

namespace {

class FolderSetTest : public LibraryTest {
  protected:
    static void Count(EventCounts &counts, const FolderSet &folders, const std::string &path,
                      const std::string &formerPath = "") {
        folders.Count(counts, {1, path, formerPath});
    }

    static std::uint64_t CountOf(const EventCounts &counts, const FolderSet &folders,
                                 const std::string &path) {
        return counts.Of(folders.Find(path));
    }
};

TEST_F(FolderSetTest, AnEventCountsInEveryFolderAroundIt) {
    const FolderSet folders({"/v/b", "/v/a/b/c", "/v/a", "/v/a/b", "/v/a-b", "/v/a"});
    EventCounts counts;
    Count(counts, folders, "/v/a/b/x");
    Count(counts, folders, "/v/a/b/c");
    EXPECT_EQ(CountOf(counts, folders, "/v/a"), 2U);
    EXPECT_EQ(CountOf(counts, folders, "/v/a/b"), 2U);
    EXPECT_EQ(CountOf(counts, folders, "/v/a/b/c"), 1U);
    EXPECT_EQ(CountOf(counts, folders, "/v/a-b"), 0U);
    EXPECT_EQ(CountOf(counts, folders, "/v/b"), 0U);
    EXPECT_EQ(counts.All(), 2U);
}

TEST_F(FolderSetTest, AMoveCountsOnceWhereItWasAndWhereItIs) {
    const FolderSet folders({"/v/a", "/v/a/b", "/v/a/c", "/v/d"});
    EventCounts counts;
    Count(counts, folders, "/v/a/b/x", "/v/a/c/x");
    Count(counts, folders, "/v/d/x", "/v/a/x");
    Count(counts, folders, "/v/d/x", "/v/d/y");
    EXPECT_EQ(CountOf(counts, folders, "/v/a"), 2U);
    EXPECT_EQ(CountOf(counts, folders, "/v/a/b"), 1U);
    EXPECT_EQ(CountOf(counts, folders, "/v/a/c"), 1U);
    EXPECT_EQ(CountOf(counts, folders, "/v/d"), 2U);
    EXPECT_EQ(counts.All(), 3U);
}

TEST_F(FolderSetTest, CountsOfSeveralFilesAreAdded) {
    const FolderSet folders({"/v/a", "/v/b"});
    EventCounts one;
    Count(one, folders, "/v/a");
    EventCounts other;
    Count(other, folders, "/v/b");
    Count(other, folders, "/v/x");
    one.Add(other);
    EXPECT_EQ(CountOf(one, folders, "/v/a"), 1U);
    EXPECT_EQ(CountOf(one, folders, "/v/b"), 1U);
    EXPECT_EQ(one.All(), 3U);
}

TEST_F(FolderSetTest, FindsTheFoldersThatItWasMadeOf) {
    const FolderSet folders({"/v/b", "/v/a", ""});
    EXPECT_NE(folders.Find("/v/a"), FolderSet::kNone);
    EXPECT_NE(folders.Find("/v/b"), folders.Find("/v/a"));
    for (const char *path : {"/v", "/v/a/b", "/v/c", ""}) {
        EXPECT_EQ(folders.Find(path), FolderSet::kNone) << path;
    }
    EXPECT_EQ(FolderSet({}).Find("/v/a"), FolderSet::kNone);
    EXPECT_EQ(EventCounts().Of(FolderSet::kNone), 0U);
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

TEST_F(FolderSetTest, EveryFolderIsAnsweredAsIfItWereAlone) {
    const auto isIn = [](const std::string &path, const std::string &folder) {
        return FILEINDEX::StringStartWith(path + "/", folder + "/");
    };
    std::mt19937 random(7);
    for (int round = 0; round < 2000; ++round) {
        std::map<std::string, std::uint64_t> expected;
        std::vector<std::string> paths;
        for (std::size_t count = random() % 30; count > 0; --count) {
            paths.push_back(SomePath(random));
            expected[paths.back()] = 0;
        }
        const FolderSet folders(paths);
        EventCounts counts;
        for (std::size_t count = random() % 8; count > 0; --count) {
            const std::string path = random() % 20 == 0 ? "" : SomePath(random);
            const std::string former = random() % 3 == 0 ? SomePath(random) : "";
            Count(counts, folders, path, former);
            for (auto &[folder, events] : expected) {
                events += isIn(path, folder) || isIn(former, folder) ? 1 : 0;
            }
        }
        for (const auto &[folder, events] : expected) {
            ASSERT_EQ(CountOf(counts, folders, folder), events) << folder << " in round " << round;
        }
    }
}

} // namespace

} // namespace VANO::TESTS
