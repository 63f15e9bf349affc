#ifndef FILEINDEX_TORTURE_MACHINE_H
#define FILEINDEX_TORTURE_MACHINE_H

// The private machine that operations are tortured on: three shares, two settings files, queues
// that hold events already, a daemon that listens, a system log, and stand-ins for the programs.

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "system/child.h"

namespace VANO::TORTURE {

constexpr char kFolderConf[] = "/usr/vano/etc/fileindex/folder.conf";
constexpr char kStatusConf[] = "/usr/vano/etc/fileindex/status.conf";
constexpr char kFolderLock[] = "/tmp/fileidx_cfg_folder.lock";
constexpr char kStatusLock[] = "/tmp/fileidx_cfg_status.lock";
constexpr char kSettingsDirectory[] = "/usr/vano/etc/fileindex";
constexpr char kMonitorDirectory[] = "/usr/vano/etc/vanotifyd";
constexpr char kQueueName[] = "VANO@file_index_queue";

struct Share {
    const char *name;
    const char *directory;
};
extern const std::vector<Share> kShares;

std::string QueueOf(const Share &share);

// What an operation starts from. No text: no file.
struct Start {
    std::optional<std::string> folders;
    std::optional<std::string> status;
    bool spotlight = true;
};

// Everything on the machine that must be whole, by path; a missing file is not in it.
using Snapshot = std::map<std::string, std::string>;

class Machine {
  public:
    // `standIn` takes the place of the programs that the library starts. Without a daemon nobody
    // listens for commands.
    Machine(const std::string &standIn, bool hasDaemon);
    ~Machine();
    Machine(const Machine &) = delete;
    Machine &operator=(const Machine &) = delete;

    // Brings back the start, whatever happened.
    static void Reset(const Start &start);

    static Snapshot Look();

  private:
    void Start(const std::vector<std::string> &program, const char *socket);

    std::vector<std::unique_ptr<TESTS::Child>> others_; // the system log and the daemon
};

// The events of each share's queue at the start.
std::vector<std::string> EventsAtStart(const Share &share);

} // namespace VANO::TORTURE

#endif
