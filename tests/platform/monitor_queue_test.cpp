#include "platform/monitor_queue.h"

#include <gmock/gmock.h>
#include <json/writer.h>
#include <string>
#include <sys/stat.h>
#include <utility>
#include <vector>

#include "platform/diagnosis.h"
#include "platform/linux/error_codes.h"
#include "platform/vano_platform.h"
#include "support/files.h"

namespace {

using namespace VANO::TESTS;
using namespace VANO::PLATFORM;
using VANO::VANOTIFYD::_tag_monitor_queue_type_;
using VANO::VANOTIFYD::MONITOR_QUEUE_TYPE_FILE;
using VANO::VANOTIFYD::MonitorQueue;

constexpr char kDirectory[] = "/usr/vano/etc/vanotifyd";
constexpr char kQueue[] = "/volume1/photos/@eaDir/VANO@file_index_queue";
constexpr char kConsumer[] = "fileindex";

Json::Value Description(const std::string &queue = kQueue,
                        const std::string &path = "/volume1/photos") {
    Json::Value entry;
    entry["path"] = path;
    entry["mask"] = 65486;
    entry["ignore"].append("@eaDir");
    Json::Value description;
    description["queue"] = queue;
    description["config"].append(entry);
    return description;
}

bool Upsert(const Json::Value &description, const std::string &consumer = kConsumer) {
    return MonitorQueue::Upsert(MonitorQueue(description), consumer, MONITOR_QUEUE_TYPE_FILE);
}

bool Delete(const std::string &queue, const std::string &consumer = kConsumer) {
    return MonitorQueue::Delete(queue, consumer, MONITOR_QUEUE_TYPE_FILE);
}

Json::Value Stored(const std::string &name) {
    return ReadJson(std::string(kDirectory) + "/" + name);
}

class MonitorQueueTest : public ::testing::Test {
  protected:
    void SetUp() override {
        RemoveTree(kDirectory);
        VLIBCErrSetEx(0, "", 0);
    }
    void TearDown() override { RemoveTree(kDirectory); }
};

TEST_F(MonitorQueueTest, UpsertStoresTheWholeDescription) {
    ASSERT_TRUE(Upsert(Description()));
    const auto names = NamesIn(kDirectory);
    ASSERT_EQ(1U, names.size());
    EXPECT_THAT(names[0], ::testing::MatchesRegex("fileindex-[0-9a-f]{16}\\.json"));
    Json::Value expected = Description();
    expected["consumer"] = kConsumer;
    expected["type"] = 1;
    EXPECT_EQ(expected, Stored(names[0]));
}

TEST_F(MonitorQueueTest, OnlyTheOwnerMayWriteToTheStore) {
    const mode_t old = ::umask(0);
    const bool stored = Upsert(Description());
    ::umask(old);
    ASSERT_TRUE(stored);
    EXPECT_EQ(mode_t{0755}, ModeOf(kDirectory));
    EXPECT_EQ(mode_t{0644}, ModeOf(std::string(kDirectory) + "/" + NamesIn(kDirectory)[0]));
}

TEST_F(MonitorQueueTest, UpsertReplaces) {
    ASSERT_TRUE(Upsert(Description(kQueue, "/volume1/photos/old")));
    ASSERT_TRUE(Upsert(Description(kQueue, "/volume1/photos/new")));
    const auto names = NamesIn(kDirectory);
    ASSERT_EQ(1U, names.size());
    EXPECT_EQ(Description(kQueue, "/volume1/photos/new")["config"], Stored(names[0])["config"]);
}

TEST_F(MonitorQueueTest, AnEmptyConfigurationIsStored) {
    Json::Value description = Description();
    description["config"] = Json::Value(Json::arrayValue);
    ASSERT_TRUE(Upsert(description));
    EXPECT_TRUE(Stored(NamesIn(kDirectory)[0])["config"].isArray());
}

TEST_F(MonitorQueueTest, EveryConsumerAndQueueHasItsOwnFile) {
    const std::string lengthy(250, 'x');
    const std::vector<std::pair<std::string, std::string>> pairs = {
        {"a", "b-c"}, {"a-b", "c"}, {"a", "/b"},          {"a", "b/c"},
        {"a", "B-c"}, {"a", " "},   {"a", lengthy + "1"}, {"a", lengthy + "2"}};
    for (const auto &[consumer, queue] : pairs) {
        ASSERT_TRUE(Upsert(Description(queue), consumer)) << consumer << " " << queue;
    }
    ASSERT_EQ(pairs.size(), NamesIn(kDirectory).size());
    for (const auto &[consumer, queue] : pairs) {
        const auto before = NamesIn(kDirectory).size();
        ASSERT_TRUE(Delete(queue, consumer));
        ASSERT_EQ(before - 1, NamesIn(kDirectory).size()) << consumer << " " << queue;
    }
}

TEST_F(MonitorQueueTest, AConsumersNameMustBeginAFileName) {
    const std::string zero("a\0b", 3);
    for (const std::string &consumer :
         {std::string("a/b"), std::string(".a"), std::string(".."), std::string(65, 'x'), zero}) {
        EXPECT_FALSE(Upsert(Description(), consumer)) << consumer;
        EXPECT_EQ(kErrBadParameter, VLIBCErrGet()) << consumer;
        EXPECT_FALSE(Delete(kQueue, consumer)) << consumer;
    }
    EXPECT_TRUE(Upsert(Description(), std::string(64, 'x')));
}

TEST_F(MonitorQueueTest, AFileThatHoldsAnotherQueueIsNeverTouched) {
    const std::string queue = "/volume1/" + std::string(250, 'x');
    ASSERT_TRUE(Upsert(Description(queue)));
    const std::string file = std::string(kDirectory) + "/" + NamesIn(kDirectory)[0];
    const std::string foreign = R"({"consumer":"fileindex","queue":"/other","config":[],"type":1})";
    PutFile(file, foreign);
    EXPECT_FALSE(Upsert(Description(queue)));
    EXPECT_EQ(kErrMonitorStore, VLIBCErrGet());
    EXPECT_TRUE(Delete(queue)) << "its own is not there, as wished";
    EXPECT_EQ(foreign, ReadText(file));
}

TEST_F(MonitorQueueTest, ADamagedFileIsReplaced) {
    ASSERT_TRUE(Upsert(Description()));
    const std::string name = NamesIn(kDirectory)[0];
    PutFile(std::string(kDirectory) + "/" + name, "{\"queue\":");
    ASSERT_TRUE(Upsert(Description()));
    EXPECT_EQ(kQueue, Stored(name)["queue"].asString());
}

TEST_F(MonitorQueueTest, NamesThatAreNotUtf8AreKept) {
    const std::string queue = "/volume1/\xFF\xFE/queue";
    ASSERT_TRUE(Upsert(Description(queue)));
    EXPECT_EQ(queue, Stored(NamesIn(kDirectory)[0])["queue"].asString());
}

TEST_F(MonitorQueueTest, DeleteRemovesTheFile) {
    ASSERT_TRUE(Upsert(Description()));
    ASSERT_TRUE(Upsert(Description("/volume1/music/@eaDir/queue")));
    EXPECT_TRUE(Delete(kQueue));
    EXPECT_EQ(1U, NamesIn(kDirectory).size());
}

TEST_F(MonitorQueueTest, DeleteOfWhatIsNotThereSucceeds) {
    EXPECT_TRUE(Delete(kQueue)) << "without the directory";
    ASSERT_TRUE(Upsert(Description()));
    EXPECT_TRUE(Delete(kQueue));
    EXPECT_TRUE(Delete(kQueue));
}

TEST_F(MonitorQueueTest, BadDescriptionsAreRefused) {
    Json::Value noConfig = Description();
    noConfig.removeMember("config");
    Json::Value configObject = Description();
    configObject["config"] = Json::Value(Json::objectValue);
    Json::Value queueNumber = Description();
    queueNumber["queue"] = 1;
    for (const Json::Value &bad :
         {Json::Value(), Json::Value("text"), Json::Value(Json::arrayValue),
          Json::Value(Json::objectValue), noConfig, configObject, queueNumber}) {
        VLIBCErrSetEx(0, "", 0);
        EXPECT_FALSE(Upsert(bad)) << bad;
        EXPECT_EQ(kErrMonitorDescription, VLIBCErrGet()) << bad;
    }
    EXPECT_FALSE(Exists(kDirectory));
}

TEST_F(MonitorQueueTest, BadArgumentsAreRefused) {
    EXPECT_FALSE(Upsert(Description(), ""));
    EXPECT_EQ(kErrBadParameter, VLIBCErrGet());
    EXPECT_FALSE(Upsert(Description("")));
    EXPECT_FALSE(Delete(""));
    EXPECT_FALSE(Delete(kQueue, ""));
    const auto unknown = static_cast<_tag_monitor_queue_type_>(2);
    EXPECT_FALSE(MonitorQueue::Upsert(MonitorQueue(Description()), kConsumer, unknown));
    EXPECT_FALSE(MonitorQueue::Delete(kQueue, kConsumer, unknown));
}

TEST_F(MonitorQueueTest, AStoreThatCannotBeWrittenIsAFailure) {
    PutFile(kDirectory, "a file in the directory's place");
    EXPECT_FALSE(Upsert(Description()));
    EXPECT_EQ(kErrMonitorStore, VLIBCErrGet());
    VLIBCErrSetEx(0, "", 0);
    EXPECT_FALSE(Delete(kQueue));
    EXPECT_EQ(kErrMonitorStore, VLIBCErrGet());
}

// --- what is told for diagnosis -------------------------------------------------------------

TEST_F(MonitorQueueTest, WatchesAreListed) {
    EXPECT_TRUE(ListMonitorWatches(kConsumer).watches.empty());
    EXPECT_TRUE(ListMonitorWatches(kConsumer).faults.empty()) << "without the directory";
    ASSERT_TRUE(Upsert(Description()));
    ASSERT_TRUE(Upsert(Description(), "another"));
    PutFile(std::string(kDirectory) + "/fileindex-notes.txt", "");
    const auto known = ListMonitorWatches(kConsumer);
    EXPECT_EQ(kDirectory, known.directory);
    ASSERT_EQ(1U, known.watches.size());
    EXPECT_EQ(kQueue, known.watches[0].queue);
    EXPECT_THAT(known.watches[0].paths, ::testing::ElementsAre("/volume1/photos"));
    EXPECT_TRUE(Exists(known.watches[0].file));
    EXPECT_TRUE(known.faults.empty());
}

TEST_F(MonitorQueueTest, FilesThatDescribeNoQueueAreFaults) {
    const std::string file = std::string(kDirectory) + "/fileindex-x.json";
    MakeDirs(kDirectory);
    for (const char *text : {"{", "[]", R"({"queue":"/q","config":[]})",
                             R"({"queue":"/q","config":[],"consumer":"other"})",
                             R"({"queue":1,"config":[],"consumer":"fileindex"})"}) {
        PutFile(file, text);
        const auto known = ListMonitorWatches(kConsumer);
        EXPECT_TRUE(known.watches.empty()) << text;
        ASSERT_EQ(1U, known.faults.size()) << text;
        EXPECT_EQ(StoreFault::Kind::kMalformed, known.faults[0].kind) << text;
        EXPECT_EQ(file, known.faults[0].file) << text;
    }
    RemoveTree(file);
    MakeDirs(file);
    EXPECT_EQ(StoreFault::Kind::kUnreadable, ListMonitorWatches(kConsumer).faults.at(0).kind);
    RemoveTree(kDirectory);
    PutFile(kDirectory, "");
    const auto known = ListMonitorWatches(kConsumer);
    ASSERT_EQ(1U, known.faults.size());
    EXPECT_EQ(StoreFault::Kind::kUnreadable, known.faults[0].kind);
    EXPECT_EQ(kDirectory, known.faults[0].file);
}

} // namespace
