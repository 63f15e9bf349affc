// The platform as benchmarks have it: answers from memory, as a small well-ordered appliance would,
// so that what is timed is the library. The executable's own definitions stand before those of
// libvanoplatform.so. (The tests' fake records every call; that would cost more than many of the
// operations measured here.)

#include "bench/appliance.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <strings.h>
#include <sys/stat.h>

#include "platform/monitor_queue.h"
#include "platform/vano_platform.h"

using VANO::BENCH::ShareDirectories;

namespace {

constexpr char kMetadataDirectory[] = "@eaDir";
bool g_spotlight = false;

int No(int *flag) {
    *flag = 0;
    return 0;
}

} // namespace

int VANOShareGet(const char *name, _tag_VANOSHARE **share) {
    const auto found = ShareDirectories().find(std::string_view(name));
    if (found == ShareDirectories().end()) {
        return -1;
    }
    auto *record = static_cast<_tag_VANOSHARE *>(std::malloc(sizeof(_tag_VANOSHARE)));
    record->name = ::strdup(found->first.c_str());
    record->path = ::strdup(found->second.c_str());
    *share = record;
    return 0;
}

void VANOShareFree(_tag_VANOSHARE *share) {
    std::free(share->name);
    std::free(share->path);
    std::free(share);
}

int VANOShareNamePathGet(const char *fullPath, char *name, int nameSize, char *path, int pathSize) {
    // "/volume1/photos/a": the share is the second component.
    const char *const begin = std::strchr(fullPath + 1, '/');
    if (begin == nullptr) {
        return -1;
    }
    const char *const end = ::strchrnul(begin + 1, '/');
    const std::string_view directory(fullPath, static_cast<std::size_t>(end - fullPath));
    const std::string_view shareName(begin + 1, static_cast<std::size_t>(end - begin - 1));
    const auto found = ShareDirectories().find(shareName);
    if (found == ShareDirectories().end() || found->second != directory) {
        return -1;
    }
    (void)std::snprintf(name, static_cast<std::size_t>(nameSize), "%s", found->first.c_str());
    (void)std::snprintf(path, static_cast<std::size_t>(pathSize), "%s", end);
    return 0;
}

int VLIBShareIsEncryptedGet(_tag_VANOSHARE * /*share*/, int *flag) {
    return No(flag);
}

int VLIBShareIsReadOnlyGet(_tag_VANOSHARE * /*share*/, int *flag) {
    return No(flag);
}

int VLIBShareIsEncryptionGet(_tag_VANOSHARE * /*share*/, int *flag) {
    return No(flag);
}

int VANOEAIsHiddenDir(const char *name) {
    return std::strcmp(name, kMetadataDirectory) == 0 ? 1 : 0;
}

int VANOEAMKDir(int /*flags*/, const char *path) {
    return ::mkdir(path, 0777) == 0 || errno == EEXIST ? 0 : -1;
}

int VANOGetFSType(const char * /*path*/, int /*flags*/) {
    return 1;
}

int VANOFSIsRemoteFS(int /*type*/) {
    return 0;
}

int VANOFSIsImageFS(int /*type*/) {
    return 0;
}

int VANOShareIsShareRecycle(const char * /*fullPath*/) {
    return 0;
}

int VLIBFhsPathInSnapshot(const char * /*fullPath*/, int *flag) {
    return No(flag);
}

int VANOFSDirIsMntPoint(const char * /*fullPath*/) {
    return 0;
}

int VANOQuotaIsEnough(int /*reserved*/, const char * /*dir*/, long long /*bytes*/) {
    return 1;
}

int VLIBCErrGet(void) {
    return 0;
}

void VLIBCErrSetEx(int /*code*/, const char * /*file*/, int /*line*/) {}

const char *VLIBCErrorGetFile(void) {
    return "";
}

int VLIBCErrorGetLine(void) {
    return 0;
}

int VLIBCUnicodeUTF8StrCaseCmp(const char *a, const char *b) {
    return ::strcasecmp(a, b);
}

int VLIBCExecv(const char * /*path*/, const char *const * /*argv*/, int /*wait*/) {
    return 0;
}

int VLIBCExec(const char * /*path*/, ...) {
    return 0;
}

int VLIBServiceStart(const char * /*name*/, int /*flag*/) {
    return 0;
}

int VLIBServiceStop(const char * /*name*/, int /*flag*/) {
    return 0;
}

int VLIBServiceRestart(const char * /*name*/) {
    return 0;
}

int VANOSMBIsEnableSpotlight(void) {
    return g_spotlight ? 1 : 0;
}

int VANOSMBSetSpotlight(bool enable) {
    g_spotlight = enable;
    return 0;
}

namespace VANO::VANOTIFYD {

MonitorQueue::MonitorQueue(const Json::Value &newDescription) : description(newDescription) {}

MonitorQueue::~MonitorQueue() = default;

bool MonitorQueue::Upsert(const MonitorQueue & /*queue*/, const std::string & /*consumer*/,
                          _tag_monitor_queue_type_ /*type*/) {
    return true;
}

bool MonitorQueue::Delete(const std::string & /*queue*/, const std::string & /*consumer*/,
                          _tag_monitor_queue_type_ /*type*/) {
    return true;
}

} // namespace VANO::VANOTIFYD
