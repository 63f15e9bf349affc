#ifndef FILEINDEX_FUZZ_DESCRIPTORS_H
#define FILEINDEX_FUZZ_DESCRIPTORS_H

#include "support/check.h"
#include "support/files.h"

namespace VANO::FUZZ {

// The descriptors that are open now: none may have come or gone when the input is done. (Between
// inputs libFuzzer opens some of its own.)
class Descriptors {
  public:
    void CheckNoneLeft() const {
        std::string all;
        const auto now = TESTS::OpenDescriptors();
        for (const auto &[fd, target] : now) {
            all += std::to_string(fd) + " is " + target + "; ";
        }
        Check(now == open_, "no descriptor is left open, and none of others is closed", all);
    }

  private:
    std::map<int, std::string> open_ = TESTS::OpenDescriptors();
};

} // namespace VANO::FUZZ

#endif
