#ifndef FILEINDEX_TESTS_TOOLS_CTL_H
#define FILEINDEX_TESTS_TOOLS_CTL_H

// The command line as an administrator meets it: what it says where, what it exits with, and what
// the library has done then.

#include <gtest/gtest.h>
#include <memory>
#include <string>
#include <vector>

#include "support/files.h"
#include "support/matchers.h"
#include "system/child.h"

namespace VANO::TESTS {

using Words = std::vector<std::string>;

inline constexpr char kFolders[] = "/usr/vano/etc/fileindex/folder.conf";
inline constexpr char kStatus[] = "/usr/vano/etc/fileindex/status.conf";
inline constexpr char kFolderLock[] = "/tmp/fileidx_cfg_folder.lock";
inline constexpr char kStatusLock[] = "/tmp/fileidx_cfg_status.lock";
inline constexpr char kShares[] = "/usr/vano/etc/shares.json";
inline constexpr char kMonitors[] = "/usr/vano/etc/vanotifyd";
inline constexpr char kPhotoQueue[] = "/volume1/photos/@eaDir/VANO@file_index_queue";
inline constexpr char kSocket[] = "/run/fileindexd.sock";
inline constexpr char kPeerOut[] = "/tmp/peer.out"; // what the daemon was told
inline constexpr char kPhotoIndex[] = "/volume1/photos/@eaDir/VANO@.fileindexdb";

inline constexpr int kDone = 0;
inline constexpr int kFailed = 1;
inline constexpr int kUsage = 2;
inline constexpr int kNotFound = 3;

// Settings for Save().
inline constexpr char kPhotos[] =
    R"({"/photos":{"path":"/photos","name":"Photos","document":false,"audio":false,"video":false,"photo":true}})";
inline constexpr char kTwo[] =
    R"({"/photos":{"path":"/photos","name":"Photos","document":false,"audio":false,"video":false,"photo":true},)"
    R"("/media/films":{"path":"/media/films","name":"","document":true,"audio":false,"video":true,"photo":false}})";

// Runs fileindexctl with these arguments.
Outcome Ctl(Words arguments);

// The same as a user without rights. Such a user may not be able to run it here: ask for --help
// first.
Outcome CtlAsNobody(const Words &arguments);

// The same on a terminal; what that shows. `settings` are assignments of environment variables,
// `arguments` words of a shell.
std::string CtlOnTerminal(const std::string &settings, const std::string &arguments);

// A machine with the shares photos and media, no settings and no daemon.
class CtlTest : public ::testing::Test {
  protected:
    void SetUp() override;

    // Most changes need somebody who listens. It leaves the queues of the shares as they are,
    // unless its options say otherwise.
    void StartDaemon(Words options = {"--queue", "/tmp/none"});

    // What the daemon was told so far; it is gone then.
    Words Told();

    static void Save(const std::string &folders) { PutFile(kFolders, folders); }

    std::unique_ptr<Child> daemon_;
};

// A call that is wrong.
struct Mistake {
    const char *what;
    Words arguments;
    const char *message;

    friend void PrintTo(const Mistake &mistake, std::ostream *out) { *out << mistake.what; }
};

} // namespace VANO::TESTS

#endif
