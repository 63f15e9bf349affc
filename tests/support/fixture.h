#ifndef FILEINDEX_TESTS_FIXTURE_H
#define FILEINDEX_TESTS_FIXTURE_H

// What every test of the library starts from and must leave behind.
//
//     class StatusTest : public LibraryTest {};
//
//     TEST_F(StatusTest, AnUnreadableFileIsAnError) {
//         PutFile(kStatusFile, "{");
//         Status status;
//         EXPECT_FALSE(status.Load());
//         ExpectError(FILEINDEX_ERR_LOAD);
//         ExpectLog({"config:22 Failed to load json from /usr/vano/etc/fileindex/status.conf"});
//     }
//
// Before each test: no settings, no lock files, empty volumes /volume1 and /volume2, no daemon, a
// fresh fake platform without shares, no faults, an empty trace and log, LOG_LEVEL 3, last error 0.
//
// After each test it is a failure when a share record is alive or was released twice, a descriptor
// was left open, one of the two lock files is locked, a file lies beside the settings files, or a
// log line was written that no ExpectLog() has taken.

#include <gtest/gtest.h>
#include <map>
#include <string>
#include <vector>

#include <fileindex/config.h>
#include <fileindex/error_handler.h>

#include "support/appliance.h"
#include "support/daemon_peer.h"
#include "support/event_trace.h"
#include "support/fake_platform.h"
#include "support/fault.h"
#include "support/files.h"
#include "support/matchers.h"
#include "support/sockets.h"
#include "support/system_log.h"

namespace VANO::TESTS {

using namespace VANO::FILEINDEX;

// Names the instances of a table-driven test by their rows' member `what`.
struct RowName {
    template <class Info>
    std::string operator()(const Info &row) const {
        return row.param.what;
    }
};

class LibraryTest : public ::testing::Test {
  protected:
    void SetUp() override;
    void TearDown() override;

    // All log lines since the last look, exactly, at error priority: "config:22 Failed to ...".
    // "utils:* text" accepts any line number. ExpectLog({}) wants silence.
    void ExpectLog(const std::vector<std::string> &texts, const char *file = __builtin_FILE(),
                   int line = __builtin_LINE());

    // The last error is `code`; it is set back to 0 for the next look.
    void ExpectError(_tag_fileindex_err_ code, const char *file = __builtin_FILE(),
                     int line = __builtin_LINE());

    // The test leaves so many more descriptors open, as the library is required to; they are closed
    // afterwards.
    void ExpectLeakedDescriptors(int count) { expectedLeaks_ += count; }

    // The test itself puts other files beside the settings files.
    void AllowStrayFiles() { strayFilesAllowed_ = true; }

    static std::vector<std::string> Effects() { return EventTrace::Get().Effects(); }

    FakePlatform &platform = FakePlatform::Get();

  private:
    std::map<int, std::string> descriptors_; // number to what it stands for
    int expectedLeaks_ = 0;
    bool strayFilesAllowed_ = false;
};

} // namespace VANO::TESTS

#endif
