#ifndef FILEINDEX_TESTS_FAULT_H
#define FILEINDEX_TESTS_FAULT_H

// System calls that fail, lie or are recorded on demand. The executable's own definitions stand
// before the C library's for everything that the library calls; they pass on to the real ones
// unless a test has asked for something else.
//
//     Fault::Fail(Call::Rename, EACCES);            // the next rename fails
//     Fault::Fail(Call::Write, ENOSPC, 2);          // the second write from now fails
//     Fault::FailAlways(Call::Connect, ECONNREFUSED);
//     Fault::FailPath(Call::Open, ".lock", EACCES); // every open of a path that ends so
//     Fault::Return(Call::Rand, {3, 9});            // results instead of calls
//     Fault::On(Call::Write, [](CallInfo &info) -> std::optional<long> {
//         info.size = info.size / 2;                // a short write, done for real
//         return std::nullopt;                      // or a value: the result, with errno as set
//     });
//     Fault::Record(Call::Flock);                   // "flock(/tmp/x.lock, 6)" in the event trace
//     Fault::Quiet(Call::Usleep);                   // succeeds without doing anything
//     EXPECT_EQ(Fault::Calls(Call::Open), 3U);      // counted while anything is set for the call
//
// The variants of one call (open, open64 and openat, and so on) count as one, but for opens with
// O_PATH, which open nothing that can be read or written. Calls by the test kit itself
// are left alone, those by the test's own code are not: set faults right before the call under
// test. The fixture resets everything.

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace VANO::TESTS {

enum class Call {
    Chmod,
    Close,
    Connect,
    Fallocate,
    Fchmod,
    Fchown,
    Flock,
    Fstat,
    Fsync,
    Ftruncate,
    Lstat,
    Mkdir,
    Mkostemp,
    Open,
    OpenPath,
    Rand,
    Read,
    Realpath,
    Rename,
    Setsockopt,
    Signal,
    Socket,
    Stat,
    Time,
    Unlink,
    Usleep,
    Write,
    Count_ // how many there are
};

struct CallInfo {
    Call call;
    std::string path;           // of the argument, or what the descriptor stands for
    std::string otherPath;      // rename's second
    int fd = -1;                // where the call takes one
    long number = 0;            // open flags, flock operation, mode, microseconds, option name ...
    std::size_t size = 0;       // read and write; a hook may make it smaller
    const void *data = nullptr; // write's buffer, setsockopt's value, connect's address

    // What a recorded call looks like: "write(/tmp/x, 12)"; and what stands before its bracket.
    [[nodiscard]] std::string Text() const;
    [[nodiscard]] std::string Name() const;
};

class Fault {
  public:
    // Nothing: the call happens. A value: it is the result (of realpath: 0 for null, and nothing
    // else), with errno as the hook leaves it.
    using Hook = std::function<std::optional<long>(CallInfo &info)>;

    static void Fail(Call call, int error, int nth = 1);
    static void FailAlways(Call call, int error);
    static void FailWhen(Call call, int error, std::function<bool(const CallInfo &)> isMeant);
    static void FailPath(Call call, const std::string &suffix, int error);
    static void Return(Call call, const std::vector<long> &results);
    static void Quiet(Call call);
    static void On(Call call, Hook hook);
    static void Before(Call call, std::function<void(CallInfo &)> action); // then the call happens
    static void Record(Call call);
    static void Count(Call call); // only counts, see Calls()

    static std::size_t Calls(Call call);
    static std::vector<CallInfo> Log(Call call); // the calls themselves, as counted
    static void Reset();
};

} // namespace VANO::TESTS

#endif
