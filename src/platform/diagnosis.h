#ifndef VANO_PLATFORM_DIAGNOSIS_H
#define VANO_PLATFORM_DIAGNOSIS_H

#include <string>
#include <vector>

// What a provider may tell of itself to whoever looks for faults. The library asks none of it, and
// a provider need not have it: the functions are weak, so one that is missing has a null address.
// Nothing is changed, logged or recorded as an error.

#pragma GCC visibility push(default)

namespace VANO::PLATFORM {

// Something amiss with what the provider keeps in files.
struct StoreFault {
    enum class Kind {
        kMissing,    // the file is not there
        kUnreadable, // it cannot be read
        kMalformed,  // it is no JSON, or JSON of another shape
        kLeftOut,    // one of its entries is not used
    };

    Kind kind;
    std::string file;
    std::string entry;  // of kLeftOut: the share's name
    std::string reason; // a clause: "its directory is no absolute path"
};

// The names of all shares, and of the entries that are left out of the table of shares.
struct ShareList {
    std::string file; // the table
    std::vector<std::string> names;
    std::vector<StoreFault> faults;
};
[[gnu::weak]] ShareList ListShares();

// What the change monitor was told to watch for a consumer.
struct MonitorWatch {
    std::string file;
    std::string queue;
    std::vector<std::string> paths;
};
struct MonitorWatches {
    std::string directory; // where the files are
    std::vector<MonitorWatch> watches;
    std::vector<StoreFault> faults;
};
[[gnu::weak]] MonitorWatches ListMonitorWatches(const std::string &consumer);

// A command line that an administrator can type to do something ("restart") to a service; empty
// when there is no service control.
[[gnu::weak]] std::string ServiceCommand(const std::string &action, const std::string &service);

} // namespace VANO::PLATFORM

#pragma GCC visibility pop

#endif
