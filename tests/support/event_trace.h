#ifndef FILEINDEX_TESTS_EVENT_TRACE_H
#define FILEINDEX_TESTS_EVENT_TRACE_H

// One chronological list of everything that the library does to the outside: platform calls, system
// log lines, daemon commands, files that changed, recorded system calls. It is what tests assert
// the ORDER of effects from.
//
//     EventTrace::Get().WatchFile("/usr/vano/etc/fileindex/folder.conf");
//     IndexMgr::Upsert(...);
//     EXPECT_THAT(EventTrace::Get().Effects(),
//                 ElementsAre("file: /usr/vano/etc/fileindex/folder.conf",
//                             "VLIBServiceStart(fileindexd, 1)",
//                             R"(socket: {"data":{},"type":"resume"})",
//                             "log: utils:478 FILEIDXQueuePathGet failed, share=photos"));
//
// The forms of an entry: "<Function>(<arguments>)" for a platform call, "log: <unit>:<line>
// <text>", "socket: <JSON text>", "file: <path>" for a watched file whose content or existence
// changed, and
// "<call>(<path>, ...)" for a recorded system call (fault.h).

#include <functional>
#include <string>
#include <vector>

namespace VANO::TESTS {

class EventTrace {
  public:
    static EventTrace &Get();

    // Takes what the sources still hold, then appends the entry. A query (a platform call without
    // effect) is left out of Effects(). Any thread may add.
    void Add(std::string entry, bool query = false);

    // Appends the entry as it is. For sources only.
    void AddPolled(std::string entry);

    // All entries, and those that are no queries.
    std::vector<std::string> Entries() { return Texts(true); }
    std::vector<std::string> Effects() { return Texts(false); }

    // Forgets the entries and the watched files.
    void Clear();

    // From now on "file: <path>" is added when the file's content differs from the last look. A
    // look is taken before every other event.
    void WatchFile(const std::string &path);

    // A source is asked for news before each entry, so that what reaches the test by another road
    // (a socket) still lands in its right place.
    void AddSource(std::function<void()> poll);

    // Asks the sources. Called by the interposed functions before they change anything.
    void Poll();

  private:
    EventTrace() = default;

    std::vector<std::string> Texts(bool queriesToo);
};

// While it lives, this thread's system calls and polls belong to the test kit: no faults, no
// recording, no recursion.
class KitScope {
  public:
    KitScope() noexcept : outer_(active_) { active_ = true; }
    ~KitScope() { active_ = outer_; }
    KitScope(const KitScope &) = delete;
    KitScope &operator=(const KitScope &) = delete;
    static bool IsActive() noexcept { return active_; }

  private:
    static inline thread_local bool active_ = false;
    bool outer_;
};

} // namespace VANO::TESTS

#endif
