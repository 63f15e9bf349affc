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
    quiet = false;
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

FakeShare *FakePlatform::FindShareOfPath(std::string_view fullPath) {
    const Lock lock(Mutex());
    FakeShare *found = nullptr;
    for (FakeShare &share : shares_) {
        const std::size_t size = share.path.size();
        // Shares may lie in one another: the deepest counts.
        if (fullPath.substr(0, size) == share.path &&
            (fullPath.size() == size || fullPath[size] == '/') &&
            (found == nullptr || size > found->path.size())) {
            found = &share;
        }
    }
    return found;
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
    if (!quiet) {
        monitorCalls.push_back(std::move(call));
    }
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
constexpr bool kEffect = false;

std::string Text(const char *text) {
    return text != nullptr ? text : "(null)";
}

std::string Text(const _tag_VANOSHARE *share) {
    return share != nullptr ? Text(share->name) : "(null)";
}

std::string Text(long long number) {
    return std::to_string(number);
}

std::string Text(const Json::Value &value) {
    return CompactText(value);
}

const std::string &Text(const std::string &text) {
    return text;
}

// A call with its arguments, which become text only when calls are recorded.
template <typename... Arguments>
std::optional<int> Enter(const char *function, bool query, const Arguments &...arguments) {
    FakePlatform &platform = FakePlatform::Get();
    if (platform.quiet) {
        return std::nullopt;
    }
    std::string text;
    [[maybe_unused]] const char *separator = "";
    ((text += separator + Text(arguments), separator = ", "), ...);
    return platform.Enter(function, text, query);
}

// Copies as snprintf does; the platform's buffers are always terminated.
void CopyOut(char *out, int size, const char *text) {
    if (out != nullptr && size > 0) {
        std::snprintf(out, static_cast<std::size_t>(size), "%s", text);
    }
}

int ShareFlag(const char *function, _tag_VANOSHARE *share, int *flag, bool FakeShare::*member) {
    if (const auto answer = Enter(function, kQuery, share)) {
        return *answer;
    }
    const FakeShare *found = FakePlatform::Get().FindShare(Text(share));
    if (found == nullptr) {
        return -1;
    }
    *flag = found->*member ? 1 : 0;
    return 0;
}

int IsAmong(const char *function, const char *text, const std::set<std::string> &texts) {
    const auto answer = Enter(function, kQuery, text);
    return answer ? *answer : static_cast<int>(texts.count(Text(text)));
}

} // namespace

} // namespace VANO::TESTS

using namespace VANO::TESTS;

int VANOShareGet(const char *name, _tag_VANOSHARE **share) {
    FakePlatform &platform = FakePlatform::Get();
    const auto answer = Enter("VANOShareGet", kQuery, name);
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
    (void)Enter("VANOShareFree", kQuery, share);
    FakePlatform::Get().FreeRecord(share);
}

int VANOShareNamePathGet(const char *fullPath, char *name, int nameSize, char *path, int pathSize) {
    if (const auto answer = Enter("VANOShareNamePathGet", kQuery, fullPath, nameSize, pathSize)) {
        return *answer;
    }
    // "/volume1/photos/a" lies in the share at "/volume1/photos".
    const FakeShare *share =
        fullPath != nullptr ? FakePlatform::Get().FindShareOfPath(fullPath) : nullptr;
    if (share == nullptr) {
        return -1;
    }
    CopyOut(name, nameSize, share->name.c_str());
    CopyOut(path, pathSize, fullPath + share->path.size());
    return 0;
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
    if (const auto answer = Enter("VANOEAMKDir", kEffect, flags, path)) {
        return *answer;
    }
    const KitScope kit;
    return ::mkdir(path, 0777) == 0 || errno == EEXIST ? 0 : -1;
}

int VANOGetFSType(const char *path, int flags) {
    return Enter("VANOGetFSType", kQuery, path, flags).value_or(FakePlatform::Get().fileSystemType);
}

int VANOFSIsRemoteFS(int type) {
    return Enter("VANOFSIsRemoteFS", kQuery, type)
        .value_or(type == FakePlatform::Get().remoteType ? 1 : 0);
}

int VANOFSIsImageFS(int type) {
    return Enter("VANOFSIsImageFS", kQuery, type)
        .value_or(type == FakePlatform::Get().imageType ? 1 : 0);
}

int VANOShareIsShareRecycle(const char *fullPath) {
    return IsAmong("VANOShareIsShareRecycle", fullPath, FakePlatform::Get().recyclePaths);
}

int VLIBFhsPathInSnapshot(const char *fullPath, int *flag) {
    // With an answer too the flag is set, so that a failing probe can be told from a "no".
    *flag = static_cast<int>(FakePlatform::Get().snapshotPaths.count(Text(fullPath)));
    return Enter("VLIBFhsPathInSnapshot", kQuery, fullPath).value_or(0);
}

int VANOFSDirIsMntPoint(const char *fullPath) {
    return IsAmong("VANOFSDirIsMntPoint", fullPath, FakePlatform::Get().mountPoints);
}

int VANOQuotaIsEnough(int reserved, const char *dir, long long bytes) {
    return Enter("VANOQuotaIsEnough", kQuery, reserved, dir, bytes)
        .value_or(FakePlatform::Get().quotaIsEnough ? 1 : 0);
}

int VLIBCErrGet(void) {
    return Enter("VLIBCErrGet", kQuery).value_or(FakePlatform::Get().lastError);
}

void VLIBCErrSetEx(int code, const char *file, int line) {
    FakePlatform &platform = FakePlatform::Get();
    char hex[16];
    std::snprintf(hex, sizeof(hex), "0x%04X", static_cast<unsigned>(code));
    (void)Enter("VLIBCErrSetEx", kEffect, hex);
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
    return Enter("VLIBCUnicodeUTF8StrCaseCmp", kQuery, a, b).value_or(::strcasecmp(a, b));
}

int VLIBCExecv(const char *path, const char *const *argv, int wait) {
    std::string arguments = "[";
    for (std::size_t i = 0; argv != nullptr && argv[i] != nullptr; ++i) {
        arguments += (i == 0 ? "" : ", ") + std::string(argv[i]);
    }
    return Enter("VLIBCExecv", kEffect, path, arguments + "]", wait).value_or(0);
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
    return Enter("VLIBCExec", kEffect, arguments).value_or(0);
}

int VLIBServiceStart(const char *name, int flag) {
    return Enter("VLIBServiceStart", kEffect, name, flag).value_or(0);
}

int VLIBServiceStop(const char *name, int flag) {
    return Enter("VLIBServiceStop", kEffect, name, flag).value_or(0);
}

int VLIBServiceRestart(const char *name) {
    return Enter("VLIBServiceRestart", kEffect, name).value_or(0);
}

int VANOSMBIsEnableSpotlight(void) {
    return Enter("VANOSMBIsEnableSpotlight", kQuery)
        .value_or(FakePlatform::Get().spotlight ? 1 : 0);
}

int VANOSMBSetSpotlight(bool enable) {
    const auto answer = Enter("VANOSMBSetSpotlight", kEffect, enable ? "true" : "false");
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
    return Enter("MonitorQueue::Upsert", kEffect, queue.description, consumer, type).value_or(1) !=
           0;
}

bool MonitorQueue::Delete(const std::string &queue, const std::string &consumer,
                          _tag_monitor_queue_type_ type) {
    FakePlatform::Get().AddMonitorCall({"Delete", queue, consumer, type, {}});
    return Enter("MonitorQueue::Delete", kEffect, queue, consumer, type).value_or(1) != 0;
}

} // namespace VANO::VANOTIFYD
