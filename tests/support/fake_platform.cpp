#include "support/fake_platform.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <mutex>
#include <strings.h>
#include <sys/stat.h>

#include "platform/monitor_queue.h"
#include "platform/vano_platform.h"
#include "support/event_trace.h"
#include "support/files.h"

namespace VANO::TESTS {

namespace {

constexpr char kMetadataDirectory[] = "@eaDir";

std::recursive_mutex &Mutex() {
    static std::recursive_mutex &mutex = *new std::recursive_mutex;
    return mutex;
}

using Lock = std::lock_guard<std::recursive_mutex>;

} // namespace

FakePlatform &FakePlatform::Get() {
    static FakePlatform &platform = *new FakePlatform;
    return platform;
}

void FakePlatform::Reset() {
    const Lock lock(Mutex());
    shares_.clear();
    answers_.clear();
    always_.clear();
    hooks_.clear();
    calls_.clear();
    violations_.clear();
    records_.clear();
    monitorQueues_ = 0;
    ignoreCase = false;
    fileSystemType = 1;
    remoteType = 2;
    imageType = 3;
    hiddenNames = {kMetadataDirectory};
    recyclePaths.clear();
    snapshotPaths.clear();
    mountPoints.clear();
    quotaIsEnough = true;
    spotlight = false;
    lastError = 0;
    lastErrorFile.clear();
    lastErrorLine = 0;
    monitorCalls.clear();
}

FakeShare &FakePlatform::AddShare(const std::string &name, const std::string &path) {
    const Lock lock(Mutex());
    if (!path.empty() && path[0] == '/') {
        MakeDirs(path);
    }
    FakeShare share;
    share.name = name;
    share.path = path;
    return shares_.emplace_back(share);
}

void FakePlatform::RemoveShare(const std::string &name) {
    const Lock lock(Mutex());
    shares_.remove_if([&](const FakeShare &share) { return share.name == name; });
}

FakeShare *FakePlatform::FindShare(const std::string &name) {
    const Lock lock(Mutex());
    for (FakeShare &share : shares_) {
        if (share.name == name ||
            (ignoreCase && ::strcasecmp(share.name.c_str(), name.c_str()) == 0)) {
            return &share;
        }
    }
    return nullptr;
}

void FakePlatform::Answer(const std::string &function, const std::vector<int> &results) {
    const Lock lock(Mutex());
    std::vector<int> &queue = answers_[function];
    queue.insert(queue.end(), results.begin(), results.end());
}

void FakePlatform::AnswerAlways(const std::string &function, int result) {
    const Lock lock(Mutex());
    always_[function] = result;
}

void FakePlatform::On(const std::string &function, Hook hook) {
    const Lock lock(Mutex());
    hooks_[function] = std::move(hook);
}

void FakePlatform::Before(const std::string &function, std::function<void()> action) {
    On(function, [action = std::move(action)](const std::string & /*entry*/) {
        action();
        return std::optional<int>();
    });
}

std::vector<std::string> FakePlatform::Trace() {
    return EventTrace::Get().Entries();
}

std::size_t FakePlatform::Calls(const std::string &function) {
    const Lock lock(Mutex());
    return calls_[function];
}

void FakePlatform::AddMonitorQueue(int count) {
    const Lock lock(Mutex());
    monitorQueues_ += count;
}

int FakePlatform::LiveMonitorQueues() {
    const Lock lock(Mutex());
    return monitorQueues_;
}

std::size_t FakePlatform::LiveRecords() {
    const Lock lock(Mutex());
    return records_.size();
}

std::vector<std::string> FakePlatform::Violations() {
    const Lock lock(Mutex());
    return violations_;
}

void FakePlatform::Violation(const std::string &text) {
    const Lock lock(Mutex());
    violations_.push_back(text);
}

void FakePlatform::AddMonitorCall(MonitorCall call) {
    const Lock lock(Mutex());
    monitorCalls.push_back(std::move(call));
}

std::optional<int> FakePlatform::Enter(const std::string &function, const std::string &arguments,
                                       bool query) {
    const std::string entry = function + "(" + arguments + ")";
    EventTrace::Get().Add(entry, query);
    Hook hook;
    {
        const Lock lock(Mutex());
        ++calls_[function];
        if (const auto found = hooks_.find(function); found != hooks_.end()) {
            hook = found->second;
        }
    }
    if (hook) {
        if (const std::optional<int> result = hook(entry)) {
            return result;
        }
    }
    const Lock lock(Mutex());
    if (std::vector<int> &queue = answers_[function]; !queue.empty()) {
        const int result = queue.front();
        queue.erase(queue.begin());
        return result;
    }
    const auto always = always_.find(function);
    return always != always_.end() ? std::optional<int>(always->second) : std::nullopt;
}

_tag_VANOSHARE *FakePlatform::NewRecord(const FakeShare &share) {
    const Lock lock(Mutex());
    auto *record = static_cast<_tag_VANOSHARE *>(std::malloc(sizeof(_tag_VANOSHARE)));
    record->name = ::strdup(share.name.c_str());
    record->path = ::strdup(share.path.c_str());
    records_.insert(record);
    return record;
}

void FakePlatform::FreeRecord(_tag_VANOSHARE *record) {
    const Lock lock(Mutex());
    if (records_.erase(record) == 0) {
        Violation("VANOShareFree of what is no live share record");
        return;
    }
    std::free(record->name);
    std::free(record->path);
    std::free(record);
}

namespace {

constexpr bool kQuery = true;

std::string Text(const char *text) {
    return text != nullptr ? text : "(null)";
}

std::string NameOf(const _tag_VANOSHARE *share) {
    return share != nullptr ? Text(share->name) : "(null)";
}

// Copies as snprintf does; the platform's buffers are always terminated.
void CopyOut(char *out, int size, const std::string &text) {
    if (out != nullptr && size > 0) {
        std::snprintf(out, static_cast<std::size_t>(size), "%s", text.c_str());
    }
}

int ShareFlag(const char *function, _tag_VANOSHARE *share, int *flag, bool FakeShare::*member) {
    FakePlatform &platform = FakePlatform::Get();
    if (const auto answer = platform.Enter(function, NameOf(share), kQuery)) {
        return *answer;
    }
    const FakeShare *found = platform.FindShare(NameOf(share));
    if (found == nullptr) {
        return -1;
    }
    *flag = found->*member ? 1 : 0;
    return 0;
}

int IsAmong(const char *function, const char *text, const std::set<std::string> &texts) {
    const auto answer = FakePlatform::Get().Enter(function, Text(text), kQuery);
    return answer ? *answer : static_cast<int>(texts.count(Text(text)));
}

int Simple(const char *function, const std::string &arguments, int result = 0) {
    return FakePlatform::Get().Enter(function, arguments).value_or(result);
}

} // namespace

} // namespace VANO::TESTS

using namespace VANO::TESTS;

int VANOShareGet(const char *name, _tag_VANOSHARE **share) {
    FakePlatform &platform = FakePlatform::Get();
    const auto answer = platform.Enter("VANOShareGet", Text(name), kQuery);
    const FakeShare *found = platform.FindShare(Text(name));
    if (answer.value_or(0) < 0 || found == nullptr) {
        return answer.value_or(-1);
    }
    *share = platform.NewRecord(*found);
    return answer.value_or(0);
}

void VANOShareFree(_tag_VANOSHARE *share) {
    if (share == nullptr) {
        FakePlatform::Get().Violation("VANOShareFree of a null record");
        return;
    }
    (void)FakePlatform::Get().Enter("VANOShareFree", NameOf(share), kQuery);
    FakePlatform::Get().FreeRecord(share);
}

int VANOShareNamePathGet(const char *fullPath, char *name, int nameSize, char *path, int pathSize) {
    FakePlatform &platform = FakePlatform::Get();
    const std::string full = Text(fullPath);
    const auto answer = platform.Enter(
        "VANOShareNamePathGet",
        full + ", " + std::to_string(nameSize) + ", " + std::to_string(pathSize), kQuery);
    if (answer) {
        return *answer;
    }
    // "/volume1/photos/a" lies in the share at "/volume1/photos".
    for (std::size_t end = full.size(); end != 0 && end != std::string::npos;
         end = full.rfind('/', end - 1)) {
        const std::string directory = full.substr(0, end);
        const FakeShare *share = platform.FindShare(directory.substr(directory.rfind('/') + 1));
        if (share != nullptr && share->path == directory) {
            CopyOut(name, nameSize, share->name);
            CopyOut(path, pathSize, full.substr(end));
            return 0;
        }
    }
    return -1;
}

int VLIBShareIsEncryptedGet(_tag_VANOSHARE *share, int *flag) {
    return ShareFlag("VLIBShareIsEncryptedGet", share, flag, &FakeShare::encrypted);
}

int VLIBShareIsReadOnlyGet(_tag_VANOSHARE *share, int *flag) {
    return ShareFlag("VLIBShareIsReadOnlyGet", share, flag, &FakeShare::readOnly);
}

int VLIBShareIsEncryptionGet(_tag_VANOSHARE *share, int *flag) {
    return ShareFlag("VLIBShareIsEncryptionGet", share, flag, &FakeShare::encryption);
}

int VANOEAIsHiddenDir(const char *name) {
    return IsAmong("VANOEAIsHiddenDir", name, FakePlatform::Get().hiddenNames);
}

int VANOEAMKDir(int flags, const char *path) {
    const auto answer =
        FakePlatform::Get().Enter("VANOEAMKDir", std::to_string(flags) + ", " + Text(path));
    if (answer) {
        return *answer;
    }
    const KitScope kit;
    return ::mkdir(path, 0777) == 0 || errno == EEXIST ? 0 : -1;
}

int VANOGetFSType(const char *path, int flags) {
    FakePlatform &platform = FakePlatform::Get();
    return platform.Enter("VANOGetFSType", Text(path) + ", " + std::to_string(flags), kQuery)
        .value_or(platform.fileSystemType);
}

int VANOFSIsRemoteFS(int type) {
    FakePlatform &platform = FakePlatform::Get();
    return platform.Enter("VANOFSIsRemoteFS", std::to_string(type), kQuery)
        .value_or(type == platform.remoteType ? 1 : 0);
}

int VANOFSIsImageFS(int type) {
    FakePlatform &platform = FakePlatform::Get();
    return platform.Enter("VANOFSIsImageFS", std::to_string(type), kQuery)
        .value_or(type == platform.imageType ? 1 : 0);
}

int VANOShareIsShareRecycle(const char *fullPath) {
    return IsAmong("VANOShareIsShareRecycle", fullPath, FakePlatform::Get().recyclePaths);
}

int VLIBFhsPathInSnapshot(const char *fullPath, int *flag) {
    FakePlatform &platform = FakePlatform::Get();
    // With an answer too the flag is set, so that a failing probe can be told from a "no".
    *flag = static_cast<int>(platform.snapshotPaths.count(Text(fullPath)));
    return platform.Enter("VLIBFhsPathInSnapshot", Text(fullPath), kQuery).value_or(0);
}

int VANOFSDirIsMntPoint(const char *fullPath) {
    return IsAmong("VANOFSDirIsMntPoint", fullPath, FakePlatform::Get().mountPoints);
}

int VANOQuotaIsEnough(int reserved, const char *dir, long long bytes) {
    FakePlatform &platform = FakePlatform::Get();
    return platform
        .Enter("VANOQuotaIsEnough",
               std::to_string(reserved) + ", " + Text(dir) + ", " + std::to_string(bytes), kQuery)
        .value_or(platform.quotaIsEnough ? 1 : 0);
}

int VLIBCErrGet(void) {
    FakePlatform &platform = FakePlatform::Get();
    return platform.Enter("VLIBCErrGet", "", kQuery).value_or(platform.lastError);
}

void VLIBCErrSetEx(int code, const char *file, int line) {
    FakePlatform &platform = FakePlatform::Get();
    char hex[16];
    std::snprintf(hex, sizeof(hex), "0x%04X", static_cast<unsigned>(code));
    (void)platform.Enter("VLIBCErrSetEx", hex);
    platform.lastError = code;
    platform.lastErrorFile = Text(file);
    platform.lastErrorLine = line;
}

const char *VLIBCErrorGetFile(void) {
    return FakePlatform::Get().lastErrorFile.c_str();
}

int VLIBCErrorGetLine(void) {
    return FakePlatform::Get().lastErrorLine;
}

int VLIBCUnicodeUTF8StrCaseCmp(const char *a, const char *b) {
    return FakePlatform::Get()
        .Enter("VLIBCUnicodeUTF8StrCaseCmp", Text(a) + ", " + Text(b), kQuery)
        .value_or(::strcasecmp(a, b));
}

int VLIBCExecv(const char *path, const char *const *argv, int wait) {
    std::string arguments = Text(path) + ", [";
    for (std::size_t i = 0; argv != nullptr && argv[i] != nullptr; ++i) {
        arguments += (i == 0 ? "" : ", ") + std::string(argv[i]);
    }
    return Simple("VLIBCExecv", arguments + "], " + std::to_string(wait));
}

int VLIBCExec(const char *path, ...) {
    std::string arguments = Text(path);
    va_list list;
    va_start(list, path);
    while (const char *argument = va_arg(list, const char *)) {
        arguments += std::string(", ") + argument;
    }
    const bool ended = va_arg(list, const char *) == nullptr;
    va_end(list);
    if (!ended) {
        FakePlatform::Get().Violation("VLIBCExec without its second null argument");
    }
    return Simple("VLIBCExec", arguments);
}

int VLIBServiceStart(const char *name, int flag) {
    return Simple("VLIBServiceStart", Text(name) + ", " + std::to_string(flag));
}

int VLIBServiceStop(const char *name, int flag) {
    return Simple("VLIBServiceStop", Text(name) + ", " + std::to_string(flag));
}

int VLIBServiceRestart(const char *name) {
    return Simple("VLIBServiceRestart", Text(name));
}

int VANOSMBIsEnableSpotlight(void) {
    FakePlatform &platform = FakePlatform::Get();
    return platform.Enter("VANOSMBIsEnableSpotlight", "", kQuery)
        .value_or(platform.spotlight ? 1 : 0);
}

int VANOSMBSetSpotlight(bool enable) {
    const auto answer = FakePlatform::Get().Enter("VANOSMBSetSpotlight", enable ? "true" : "false");
    if (answer.value_or(0) >= 0) {
        FakePlatform::Get().spotlight = enable;
    }
    return answer.value_or(0);
}

namespace VANO::VANOTIFYD {

MonitorQueue::MonitorQueue(const Json::Value &newDescription) : description(newDescription) {
    FakePlatform::Get().AddMonitorQueue(1);
}

MonitorQueue::~MonitorQueue() {
    FakePlatform::Get().AddMonitorQueue(-1);
}

bool MonitorQueue::Upsert(const MonitorQueue &queue, const std::string &consumer,
                          _tag_monitor_queue_type_ type) {
    const Json::Value &location =
        queue.description.isObject() ? queue.description["queue"] : Json::Value::nullSingleton();
    FakePlatform::Get().AddMonitorCall({"Upsert", location.isString() ? location.asString() : "",
                                        consumer, type, queue.description});
    return Simple("MonitorQueue::Upsert",
                  CompactText(queue.description) + ", " + consumer + ", " + std::to_string(type),
                  1) != 0;
}

bool MonitorQueue::Delete(const std::string &queue, const std::string &consumer,
                          _tag_monitor_queue_type_ type) {
    FakePlatform::Get().AddMonitorCall({"Delete", queue, consumer, type, {}});
    return Simple("MonitorQueue::Delete", queue + ", " + consumer + ", " + std::to_string(type),
                  1) != 0;
}

} // namespace VANO::VANOTIFYD
