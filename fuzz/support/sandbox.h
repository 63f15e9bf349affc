#ifndef FILEINDEX_FUZZ_SANDBOX_H
#define FILEINDEX_FUZZ_SANDBOX_H

#include <bitset>
#include <string>

namespace VANO::FUZZ {

// Ends the process outside of scripts/sandbox.
void RequireSandbox();

// The descriptors that are open now: none may have come or gone when the input is done. (Between
// inputs libFuzzer opens some of its own.)
class Descriptors {
  public:
    Descriptors() : open_(Open()) {}
    void CheckNoneLeft() const;

  private:
    static std::bitset<32> Open();
    static std::string Names(const std::bitset<32> &changed);

    std::bitset<32> open_;
};

} // namespace VANO::FUZZ

#endif
