#include "monitor_queue.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>

#include "base/file_io.h"
#include "base/json_io.h"
#include "diagnosis.h"
#include "error.h"
#include "places.h"

namespace VANO::VANOTIFYD {

namespace {

using namespace PLATFORM;

constexpr mode_t kStoreMode = 0755;
constexpr char kSuffix[] = ".json";
constexpr std::size_t kMaxConsumer = 64;

// FNV-1a.
std::uint64_t Hash(std::string_view text) {
    std::uint64_t hash = 0xCBF29CE484222325;
    for (const char c : text) {
        hash = (hash ^ static_cast<unsigned char>(c)) * 0x100000001B3;
    }
    return hash;
}

// The file of one consumer and queue. Its content tells whether it is that queue's.
std::string FileOf(const std::string &consumer, const std::string &queue) {
    char hash[sizeof "0123456789abcdef"];
    (void)std::snprintf(hash, sizeof hash, "%016llx", static_cast<unsigned long long>(Hash(queue)));
    return std::string(kMonitorDirectory) + "/" + consumer + "-" + hash + kSuffix;
}

// A consumer's name begins file names.
bool IsConsumer(const std::string &name) {
    return !name.empty() && name.size() <= kMaxConsumer && name[0] != '.' &&
           name.find('/') == std::string::npos && name.find('\0') == std::string::npos;
}

bool IsRequest(const std::string &queue, const std::string &consumer,
               _tag_monitor_queue_type_ type) {
    return !queue.empty() && IsConsumer(consumer) && type == MONITOR_QUEUE_TYPE_FILE;
}

// Whether the file holds another queue's description; a file that is missing or of no use does not.
bool IsTaken(const std::string &file, const std::string &consumer, const std::string &queue) {
    Json::Value stored;
    if (!FILEINDEX::JsonFromFile(stored, file) || !stored.isObject() ||
        !stored["queue"].isString() || !stored["consumer"].isString()) {
        return false;
    }
    return stored["queue"].asString() != queue || stored["consumer"].asString() != consumer;
}

// Only the owner may write, whatever the umask: a watcher trusts what it finds here.
bool MakeStore() {
    return ::mkdir(kMonitorDirectory, kStoreMode) == 0 || errno == EEXIST;
}

bool IsDescription(const Json::Value &description) {
    return description.isObject() && description["queue"].isString() &&
           description["config"].isArray();
}

bool Store(const Json::Value &description, const std::string &consumer,
           _tag_monitor_queue_type_ type) {
    if (!IsDescription(description)) {
        (void)PLATFORM_FAIL(kErrMonitorDescription);
        return false;
    }
    const std::string queue = description["queue"].asString();
    if (!IsRequest(queue, consumer, type)) {
        (void)PLATFORM_FAIL(kErrBadParameter);
        return false;
    }
    Json::Value stored(Json::objectValue);
    stored["consumer"] = consumer;
    stored["type"] = static_cast<int>(type);
    stored["queue"] = queue;
    stored["config"] = description["config"];

    const std::string file = FileOf(consumer, queue);
    if (!MakeStore() || IsTaken(file, consumer, queue) || !FILEINDEX::JsonToFile(stored, file)) {
        (void)PLATFORM_FAIL(kErrMonitorStore);
        return false;
    }
    return true;
}

bool Remove(const std::string &queue, const std::string &consumer, _tag_monitor_queue_type_ type) {
    if (!IsRequest(queue, consumer, type)) {
        (void)PLATFORM_FAIL(kErrBadParameter);
        return false;
    }
    const std::string file = FileOf(consumer, queue);
    if (IsTaken(file, consumer, queue) || ::unlink(file.c_str()) == 0 || errno == ENOENT) {
        return true;
    }
    (void)PLATFORM_FAIL(kErrMonitorStore);
    return false;
}

// Whether a file's name is one that FileOf() gives for the consumer.
bool IsFileOf(const std::string &consumer, const std::string &name) {
    const std::string begin = consumer + "-";
    const std::string_view suffix = kSuffix;
    return name.size() > begin.size() + suffix.size() &&
           name.compare(0, begin.size(), begin) == 0 &&
           name.compare(name.size() - suffix.size(), suffix.size(), suffix) == 0;
}

void AddWatch(MonitorWatches &known, const std::string &file, const std::string &consumer) {
    std::string text;
    Json::Value stored;
    if (!FILEINDEX::ReadFile(text, file, FILEINDEX::kMaxJsonFileBytes)) {
        known.faults.push_back({StoreFault::Kind::kUnreadable, file, {}, std::strerror(errno)});
        return;
    }
    if (!FILEINDEX::JsonFromString(stored, text) || !IsDescription(stored) ||
        stored["consumer"] != consumer) {
        known.faults.push_back({StoreFault::Kind::kMalformed, file, {}, "it describes no queue"});
        return;
    }
    MonitorWatch watch{file, stored["queue"].asString(), {}};
    for (const Json::Value &entry : stored["config"]) {
        if (entry.isObject() && entry["path"].isString()) {
            watch.paths.push_back(entry["path"].asString());
        }
    }
    known.watches.push_back(std::move(watch));
}

} // namespace

MonitorQueue::MonitorQueue(const Json::Value &queueDescription) : description(queueDescription) {}

MonitorQueue::~MonitorQueue() = default;

bool MonitorQueue::Upsert(const MonitorQueue &queue, const std::string &consumer,
                          _tag_monitor_queue_type_ type) {
    return Guarded(false, [&] { return Store(queue.description, consumer, type); });
}

bool MonitorQueue::Delete(const std::string &queue, const std::string &consumer,
                          _tag_monitor_queue_type_ type) {
    return Guarded(false, [&] { return Remove(queue, consumer, type); });
}

} // namespace VANO::VANOTIFYD

namespace VANO::PLATFORM {

MonitorWatches ListMonitorWatches(const std::string &consumer) {
    MonitorWatches known{kMonitorDirectory, {}, {}};
    std::error_code error;
    std::vector<std::string> names;
    for (auto entry = std::filesystem::directory_iterator(kMonitorDirectory, error);
         !error && entry != std::filesystem::directory_iterator(); entry.increment(error)) {
        names.push_back(entry->path().filename());
    }
    if (error && error != std::errc::no_such_file_or_directory) {
        known.faults.push_back(
            {StoreFault::Kind::kUnreadable, kMonitorDirectory, {}, error.message()});
    }
    std::sort(names.begin(), names.end());
    for (const std::string &name : names) {
        if (VANOTIFYD::IsFileOf(consumer, name)) {
            VANOTIFYD::AddWatch(known, known.directory + "/" + name, consumer);
        }
    }
    return known;
}

} // namespace VANO::PLATFORM
