#ifndef FILEINDEXCTL_WATCH_WATCH_OUTPUT_H
#define FILEINDEXCTL_WATCH_WATCH_OUTPUT_H

#include <vector>

#include "state/queue_pace.h"
#include "state/service_state.h"

namespace CTL {

struct WatchedState {
    ServiceState service;
    std::vector<QueuePace> progress; // of the shares, in their order
};

// Where `watch` shows what it sees.
class WatchOutput {
  public:
    WatchOutput() = default;
    WatchOutput(const WatchOutput &) = delete;
    WatchOutput &operator=(const WatchOutput &) = delete;
    virtual ~WatchOutput() = default;

    // The signals that it wants to be told of.
    [[nodiscard]] virtual std::vector<int> Signals() const { return {}; }

    // This one and the next three give false when nothing can be written.
    [[nodiscard]] virtual bool Show(const WatchedState &state) = 0;

    // The events are still being counted: some numbers are missing.
    [[nodiscard]] virtual bool ShowCounting(const WatchedState & /*state*/) { return true; }

    // One of those signals has come.
    [[nodiscard]] virtual bool Handle(int /*signal*/) { return true; }

    // Called at least once a second between the looks.
    [[nodiscard]] virtual bool Attend() { return true; }

    // A descriptor to be waited for, or -1; and whether what is there now asks for the end.
    [[nodiscard]] virtual int Input() const { return -1; }
    [[nodiscard]] virtual bool ReadsTheEnd() { return false; }
};

} // namespace CTL

#endif
