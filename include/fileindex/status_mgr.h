#ifndef FILEINDEX_STATUS_MGR_H
#define FILEINDEX_STATUS_MGR_H

#include <string>

#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// The process-safe face of the status file, and the progress report.
///
/// Writers hold the exclusive lock "/tmp/fileidx_cfg_status.lock" for their whole run, the daemon
/// command included. They return false when the lock (FILEINDEX_ERR_LOCK), the load
/// (FILEINDEX_ERR_LOAD), the save (FILEINDEX_ERR_SAVE) or the command fails; a failed command is
/// logged and leaves the change saved. Where status.conf holds a value of an unexpected JSON
/// type, an exception of the JSON library passes to the caller, with the lock released.
///
/// Readers take no lock. A status file that cannot be loaded reads as false.
class StatusMgr {
  public:
    /// Writer. Pauses all indexing and tells the daemon ("pause").
    ///
    /// @param hours duration; 0 for a pause without end. The end time is a 32-bit sum: one beyond
    ///              2038 wraps, and may read as not paused.
    /// @return false for a negative duration too: nothing is touched and the last error is
    ///         FILEINDEX_ERR_BAD_PARAM.
    FILEINDEX_API static bool Pause(const int &hours);

    /// Writer. Ends any pause and tells the daemon ("resume").
    FILEINDEX_API static bool Resume();

    /// Reader. See Status::GetPauseInfo(); on false `resume_time` is unwritten.
    FILEINDEX_API static bool GetPauseInfo(long long &resume_time);

    /// Writer. See Status::ShareSetNoSpace(); waits for the notification tool.
    FILEINDEX_API static bool ShareSetNoSpace(const std::string &share, bool no_space);

    /// Reader. @return whether the share is marked as out of space.
    FILEINDEX_API static bool ShareIsNoSpace(const std::string &share);

    /// Writer. See Status::ShareSetNeedReindex().
    FILEINDEX_API static bool ShareSetNeedReindex(const std::string &share, bool need);

    /// Reader. @return whether the share is marked as needing a new index.
    FILEINDEX_API static bool ShareIsNeedReindex(const std::string &share);

    /// Writer. Clears the share's out-of-space mark and asks the daemon to start its worker again
    /// ("revive_share_worker").
    FILEINDEX_API static bool ShareRevive(const std::string &share);

    /// Reader. @return whether the step `key` is marked as done. A value that the JSON library
    /// cannot convert to a boolean, such as a string, makes its exception pass.
    FILEINDEX_API static bool IsUpdated(const std::string &key);

    /// Writer. Marks the step `key` as done.
    FILEINDEX_API static bool SetUpdated(const std::string &key);

    /// Reader. How far the indexing of one folder has come, told from the status file, the share's
    /// queue files and the clock; the daemon is not asked. Costs a scan of the share's queue.
    ///
    /// @param path share path of the folder.
    /// @return "finished" (also when the state cannot be told, which is logged),
    ///         "processing", "paused" (also for a folder that cannot be indexed) or "err_no_space".
    FILEINDEX_API static std::string GetFolderStatus(const std::string &path);

    /// Reader. How far the service as a whole has come. The queues' contents are not read.
    ///
    /// @param status receives "finished", "processing" or "paused".
    /// @return false, with `status` unchanged, when the settings, a share or the pause cannot be
    ///         read.
    FILEINDEX_API static bool GetStatus(std::string &status);
};

} // namespace VANO::FILEINDEX

#endif
