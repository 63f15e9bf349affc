#ifndef FILEINDEXCTL_WATCH_SIGNALS_H
#define FILEINDEXCTL_WATCH_SIGNALS_H

#include <csignal>
#include <vector>

#include "base/unique_fd.h"
#include "state/queue_counter.h"

namespace CTL {

// Signals that are waited for instead of interrupting: as long as one of these lives, nothing is
// ever left half done.
class Signals {
  public:
    explicit Signals(const std::vector<int> &numbers);
    ~Signals();
    Signals(const Signals &) = delete;
    Signals &operator=(const Signals &) = delete;

    // The next signal, or 0 when there was none until then, or when there is something to be read
    // from `input` (-1 for none).
    [[nodiscard]] int WaitUntil(Clock::time_point until, int input) const;

  private:
    sigset_t former_{};
    VANO::FILEINDEX::UniqueFd fd_;
};

} // namespace CTL

#endif
