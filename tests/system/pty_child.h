#ifndef FILEINDEX_TESTS_PTY_CHILD_H
#define FILEINDEX_TESTS_PTY_CHILD_H

#include <string>
#include <sys/types.h>
#include <termios.h>
#include <vector>

// A program on a terminal of its own, as a person runs it.

namespace VANO::TESTS {

// Killed with this object.
class PtyChild {
  public:
    // `settings` are assignments of environment variables on top of the test's own.
    PtyChild(const std::vector<std::string> &command, const std::vector<std::string> &settings,
             unsigned short rows, unsigned short columns);
    ~PtyChild();
    PtyChild(const PtyChild &) = delete;
    PtyChild &operator=(const PtyChild &) = delete;

    void Type(const std::string &keys) const; // "\x03" is Ctrl-C
    void Resize(unsigned short rows, unsigned short columns) const;
    void Signal(int number) const;

    // Everything that it has written so far.
    const std::string &Output();

    // Whether it has been suspended since the last such call.
    [[nodiscard]] bool HasStopped() const;

    // The exit status, or 128 + the number of the signal that ended it; all its output is there
    // then. -1 when it does not end.
    int Wait();

    // How the keyboard is set.
    [[nodiscard]] termios Settings() const;

  private:
    void ReadWhatIsThere();

    int master_ = -1;
    pid_t pid_ = -1;
    bool isWaitedFor_ = false;
    std::string output_;
};

} // namespace VANO::TESTS

#endif
