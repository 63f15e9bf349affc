#ifndef FILEINDEX_TORTURE_LOG_NOTES_H
#define FILEINDEX_TORTURE_LOG_NOTES_H

namespace VANO::TORTURE {

// What the library has written to the system log on this thread since ForgetNotes(): only the log
// tells why an operation failed, and that a busy queue dropped an event, which counts as a success.
struct LogNotes {
    int lines = 0;
    bool lockFailed = false;
    bool loadFailed = false;
    bool eventDropped = false;

    // The operation ended at its first lock. Later ones, of the status file, follow other lines.
    [[nodiscard]] bool OnlyLockFailed() const { return lockFailed && lines == 1; }
};

LogNotes &Notes();
void ForgetNotes();

} // namespace VANO::TORTURE

#endif
