#ifndef FILEINDEX_TESTS_FAKE_PLATFORM_H
#define FILEINDEX_TESTS_FAKE_PLATFORM_H

// The platform as tests have it: the executable's own definitions of every function of
// vano_platform.h and of MonitorQueue stand before those of libvanoplatform.so. Every call is put
// in the event trace, and every answer can be set.
//
//     FakePlatform &platform = FakePlatform::Get();           // `platform` in the fixture
//     platform.AddShare("photos", "/volume1/photos");          // makes the directory too
//     platform.AddShare("secret", "/volume1/secret").encrypted = true;
//     platform.ignoreCase = true;                              // /Photos finds photos
//     platform.Answer("VLIBServiceStart", {-1});               // the next call answers -1
//     platform.AnswerAlways("VANOGetFSType", 12);
//     EXPECT_THAT(platform.Trace(), ElementsAre("VANOShareGet(photos)", "VANOShareFree(photos)"));
//
// An answer that was set is the function's result and leaves its output parameters alone; without
// one the function behaves like a small well-ordered appliance.

#include <cstddef>
#include <functional>
#include <json/value.h>
#include <list>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

struct _tag_VANOSHARE;

namespace VANO::TESTS {

struct FakeShare {
    std::string name;
    std::string path;
    bool encrypted = false;
    bool readOnly = false;
    bool encryption = false;
};

// One call of MonitorQueue::Upsert or Delete. `description` is null for a Delete.
struct MonitorCall {
    std::string operation; // "Upsert" or "Delete"
    std::string queue;     // the location; of an Upsert the description's "queue"
    std::string consumer;
    int type;
    Json::Value description;
};

class FakePlatform {
  public:
    static FakePlatform &Get();

    // Back to a platform without shares that answers everything with success.
    void Reset();

    // A share and its directory. The reference stays valid until Reset() or RemoveShare().
    FakeShare &AddShare(const std::string &name, const std::string &path);
    void RemoveShare(const std::string &name);
    FakeShare *FindShare(const std::string &name); // null when there is none

    // The results of the next calls of a function, by its name ("MonitorQueue::Upsert" too), and
    // of all further ones.
    void Answer(const std::string &function, const std::vector<int> &results);
    void AnswerAlways(const std::string &function, int result);

    // Called at the start of every call of that function, with its trace entry; what it returns, if
    // anything, is the result. For answers that depend on the arguments, and for doing something in
    // the middle of an operation.
    using Hook = std::function<std::optional<int>(const std::string &entry)>;
    void On(const std::string &function, Hook hook);
    void Before(const std::string &function, std::function<void()> action); // no answer

    // The whole event trace; the platform's part of it; and how many calls a function had.
    std::vector<std::string> Trace();
    std::size_t Calls(const std::string &function);

    // Share records that were handed out and not released, and calls that no platform stands: a
    // record released twice, null pointers, argument lists without their end.
    std::size_t LiveRecords();
    int LiveMonitorQueues(); // likewise, of objects
    std::vector<std::string> Violations();

    // What the platform is like.
    bool ignoreCase = false;             // share names match without regard to ASCII case
    int fileSystemType = 1;              // VANOGetFSType
    int remoteType = 2;                  // VANOFSIsRemoteFS
    int imageType = 3;                   // VANOFSIsImageFS
    std::set<std::string> hiddenNames;   // VANOEAIsHiddenDir; "@eaDir" at first
    std::set<std::string> recyclePaths;  // VANOShareIsShareRecycle, exact paths
    std::set<std::string> snapshotPaths; // VLIBFhsPathInSnapshot, exact paths
    std::set<std::string> mountPoints;   // VANOFSDirIsMntPoint, exact paths
    bool quotaIsEnough = true;           // VANOQuotaIsEnough
    bool spotlight = false;              // VANOSMBIsEnableSpotlight, VANOSMBSetSpotlight
    int lastError = 0;                   // VLIBCErrGet, VLIBCErrSetEx
    std::string lastErrorFile;           // VLIBCErrorGetFile
    int lastErrorLine = 0;               // VLIBCErrorGetLine
    std::vector<MonitorCall> monitorCalls;

    // For benchmarks: calls are neither recorded nor counted, and no set answer is looked for.
    bool quiet = false;

    // For the definitions of the platform's functions: records the call and finds a set answer.
    std::optional<int> Enter(const std::string &function, const std::string &arguments, bool query);
    // The share whose directory is the path or lies above it; null when there is none.
    FakeShare *FindShareOfPath(std::string_view fullPath);
    void Violation(const std::string &text);
    void AddMonitorCall(MonitorCall call);
    void AddMonitorQueue(int count);
    _tag_VANOSHARE *NewRecord(const FakeShare &share);
    void FreeRecord(_tag_VANOSHARE *record);

  private:
    FakePlatform() { Reset(); }

    std::list<FakeShare> shares_;
    std::map<std::string, std::vector<int>> answers_;
    std::map<std::string, int> always_;
    std::map<std::string, Hook> hooks_;
    std::map<std::string, std::size_t> calls_;
    std::set<_tag_VANOSHARE *> records_;
    int monitorQueues_ = 0;
    std::vector<std::string> violations_;
};

} // namespace VANO::TESTS

#endif
