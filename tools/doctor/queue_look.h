#ifndef FILEINDEXCTL_DOCTOR_QUEUE_LOOK_H
#define FILEINDEXCTL_DOCTOR_QUEUE_LOOK_H

#include <cstddef>

#include "status/queue_file.h"

namespace CTL::DOCTOR {

constexpr long long kMostQueueBytes = 16LL * 1024 * 1024;

// What one queue file holds.
struct QueueLook {
    int error = 0; // the errno when it could not be read
    unsigned long long bytes = 0;
    long long age = 0; // seconds since its oldest event, as far as the file system tells
    std::size_t events = 0;
    std::size_t malformed = 0; // lines that are no events
    bool isWhole = true;       // false when no more than kMostQueueBytes were read
};

// A file that is open. A line that is being written can be taken for a malformed one.
[[nodiscard]] QueueLook LookInto(const QueueFile &queue);

} // namespace CTL::DOCTOR

#endif
