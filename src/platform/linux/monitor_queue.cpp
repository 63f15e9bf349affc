#include "monitor_queue.h"

#include <cerrno>
#include <climits>
#include <cstdint>
#include <cstdio>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>

#include "base/json_io.h"
#include "error.h"
#include "paths.h"

namespace VANO::VANOTIFYD {

namespace {

using namespace PLATFORM;

constexpr mode_t kStoreMode = 0755;
constexpr std::string_view kSuffix = ".json";
// What the temporary file beside a description adds to its name.
constexpr std::size_t kTemporarySuffix = sizeof(".XXXXXX") - 1;
constexpr std::size_t kMaxName = NAME_MAX - kTemporarySuffix;

// A part of a file name: "/", "%", "~", "-" and control characters as "%XX", all else as it is.
std::string Escape(std::string_view text) {
    std::string escaped;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte > ' ' && byte != 0x7F &&
            std::string_view("/%~-").find(c) == std::string_view::npos) {
            escaped.push_back(c);
            continue;
        }
        char code[sizeof "%XX"];
        (void)std::snprintf(code, sizeof code, "%%%02X", byte);
        escaped.append(code);
    }
    return escaped;
}

// FNV-1a.
std::uint64_t Hash(std::string_view text) {
    std::uint64_t hash = 0xCBF29CE484222325;
    for (const char c : text) {
        hash = (hash ^ static_cast<unsigned char>(c)) * 0x100000001B3;
    }
    return hash;
}

// The file of one consumer and queue: "<consumer>-<queue>.json", both escaped, which no other pair
// has. Where that is too long for a file name, the queue's hash takes its place behind a "~"; the
// file's content then tells whether it is this queue's.
std::string FileOf(const std::string &consumer, const std::string &queue) {
    const std::string prefix = Escape(consumer) + "-";
    std::string name = prefix + Escape(queue);
    if (name.size() + kSuffix.size() > kMaxName) {
        char hash[sizeof "~0123456789ABCDEF"];
        (void)std::snprintf(hash, sizeof hash, "~%016llX",
                            static_cast<unsigned long long>(Hash(queue)));
        name = prefix + hash;
    }
    return std::string(kMonitorDirectory) + "/" + name.append(kSuffix);
}

bool IsRequest(const std::string &queue, const std::string &consumer,
               _tag_monitor_queue_type_ type) {
    return !queue.empty() && !consumer.empty() && type == MONITOR_QUEUE_TYPE_FILE;
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

} // namespace

MonitorQueue::MonitorQueue(const Json::Value &queueDescription) : description(queueDescription) {}

MonitorQueue::~MonitorQueue() = default;

bool MonitorQueue::Upsert(const MonitorQueue &queue, const std::string &consumer,
                          _tag_monitor_queue_type_ type) {
    return NoThrow(false, [&] { return Store(queue.description, consumer, type); });
}

bool MonitorQueue::Delete(const std::string &queue, const std::string &consumer,
                          _tag_monitor_queue_type_ type) {
    return NoThrow(false, [&] { return Remove(queue, consumer, type); });
}

} // namespace VANO::VANOTIFYD
