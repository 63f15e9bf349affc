#ifndef FILEINDEX_FUZZ_WORLD_H
#define FILEINDEX_FUZZ_WORLD_H

// The small appliance that a target's operations run on: the fake platform with a few shares, and
// someone who listens where the indexing daemon would. It is only made inside scripts/sandbox.

#include <json/value.h>
#include <string>
#include <vector>

#include "support/appliance.h"
#include "support/descriptors.h"
#include "support/files.h"

namespace VANO::FUZZ {

using TESTS::kFolderFile;
using TESTS::kStatusFile;

// The shares' names; each lies at "/volume1/<name>" and has the folders "a" and "2016".
const std::vector<std::string> &ShareNames();
std::string QueueOf(const std::string &share);

// The world of one input. It begins without settings, marks and events, with no last error and an
// empty log. At its end nothing may be left behind: no descriptor, no share record, no lock and no
// file beside the settings.
class Run {
  public:
    Run();
    Run(const Run &) = delete;
    Run &operator=(const Run &) = delete;
    ~Run();

    // The commands that reached the daemon since the last look. That each message is well formed is
    // checked here.
    std::vector<Json::Value> Commands();

  private:
    Descriptors descriptors_;
};

using TESTS::PutFile;
// The content; "" for a file that is not there.
std::string Get(const std::string &path);

} // namespace VANO::FUZZ

#endif
