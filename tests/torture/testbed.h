#ifndef FILEINDEX_TORTURE_TESTBED_H
#define FILEINDEX_TORTURE_TESTBED_H

// The private machine that operations are tortured on: three shares, two settings files, queues
// that hold events already, a daemon that listens, a system log, and stand-ins for the programs.

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "support/appliance.h"
#include "system/child.h"

namespace VANO::TORTURE {

using namespace TESTS;

// The directories of the shares media, photos and pictures.
extern const std::vector<std::string> kShares;

// What an operation starts from. No text: no file.
struct Start {
    std::optional<std::string> folders;
    std::optional<std::string> status;
    bool spotlight = true;
};

// Everything on the machine that must be whole, by path; a missing file is not in it.
using Snapshot = std::map<std::string, std::string>;

class Testbed {
  public:
    // `standIn` takes the place of the programs that the library starts. Without a daemon nobody
    // listens for commands.
    Testbed(const std::string &standIn, bool hasDaemon);
    ~Testbed();
    Testbed(const Testbed &) = delete;
    Testbed &operator=(const Testbed &) = delete;

    // Brings back the start, whatever happened.
    static void Reset(const Start &start);

    static Snapshot Look();

  private:
    void Launch(const std::vector<std::string> &program, const char *socket);

    std::vector<std::unique_ptr<Child>> others_; // the system log and the daemon
};

// The events of each share's queue at the start.
std::vector<std::string> EventsAtStart(const std::string &share);

} // namespace VANO::TORTURE

#endif
