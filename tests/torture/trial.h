#ifndef FILEINDEX_TORTURE_TRIAL_H
#define FILEINDEX_TORTURE_TRIAL_H

// One operation under torture, in a process of its own, and what must hold afterwards:
//
//   - it neither crashed nor hung, nor let an exception out that it may not;
//   - no descriptor, lock or share record is left over, but for the descriptors that a Lock() which
//     failed leaves open, one for each attempt but the last;
//   - every settings file and monitor description is as it was before or as it is to be, the latter
//     if success was reported; no file is there that belongs to neither state;
//   - no event that was queued before is lost;
//   - the same operation, undisturbed, then succeeds and leaves what it is to leave.

#include <functional>
#include <string>

#include "operations.h"
#include "peer.h"
#include "shared.h"
#include "support/memory_fault.h"
#include "tracer.h"

namespace VANO::TORTURE {

// What was done to the operation, as far as it changes what must hold.
struct Disturbance {
    bool memory = false;  // there was none: exceptions are in order
    bool removal = false; // a file could not be removed: it may be left over
    bool queue = false;   // the queue was busy or the write to it failed: the event may be gone
    int lockFailures = 0; // flock() on a lock file failed so often
};

class Trial {
  public:
    // Runs the operation undisturbed, to learn what it is to leave. Throws when it does not
    // succeed.
    explicit Trial(const Operation &operation);

    // Each returns what does not hold, "" when all does. The hooks note in `disturbance` what they
    // do.
    std::string Run(const Hooks &hooks, const Shared<Disturbance> &disturbance) const;
    std::string Run(const TESTS::MemoryFault &fault, long &requests) const;

    // The hooks kill the caller, and note in `appended` what it has appended to queues by then.
    // What is judged is the files, the operation of whoever comes next, and what the daemon's side
    // makes of the queues.
    std::string RunKilled(const Hooks &hooks, const std::vector<QueuedEvent> &appended) const;

    const Operation &Subject() const { return operation_; }
    const Snapshot &Before() const { return before_; }
    const Snapshot &After() const { return after_; }

  private:
    struct Report;

    // In the process under torture.
    void RunAndJudge(Report &report, const Disturbance &disturbance,
                     const std::function<void()> &begin, const std::function<void()> &end) const;
    std::string Judge(const Report &report, const Disturbance &disturbance) const;
    std::vector<QueuedEvent> ExpectedOfPeer(const std::vector<QueuedEvent> &appended) const;

    const Operation &operation_;
    Snapshot before_;
    Snapshot after_;
};

} // namespace VANO::TORTURE

#endif
