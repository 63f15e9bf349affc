#ifndef FILEINDEX_TESTS_CHILD_H
#define FILEINDEX_TESTS_CHILD_H

// Whole programs, run as a user or an init script runs them.

#include <chrono>
#include <functional>
#include <string>
#include <sys/types.h>
#include <vector>

namespace VANO::TESTS {

// A program in the background. Its output is appended to files; it is killed with this object.
class Child {
  public:
    Child(const std::vector<std::string> &command, const std::string &outFile,
          const std::string &errorFile);
    ~Child();
    Child(const Child &) = delete;
    Child &operator=(const Child &) = delete;

    void Signal(int number) const;
    bool IsRunning(); // and not waited for

    // The exit status, or 128 + the number of the signal that ended it.
    int Wait();

  private:
    pid_t pid_ = -1;
    bool isWaitedFor_ = false;
    int status_ = -1;
};

struct Outcome {
    int status;
    std::string out;
    std::string error;
};

// Runs a program to its end.
Outcome RunToEnd(const std::vector<std::string> &command);

// Looks until it is so; false after ten seconds.
bool Eventually(const std::function<bool()> &isSo);

std::vector<std::string> LinesOf(const std::string &text);

} // namespace VANO::TESTS

#endif
