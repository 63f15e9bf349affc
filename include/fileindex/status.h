#ifndef FILEINDEX_STATUS_H
#define FILEINDEX_STATUS_H

#include <string>

#include <fileindex/config.h>
#include <fileindex/export.h>

namespace VANO::FILEINDEX {

/// The indexing status file: the global pause, the shares that ran out of space, the shares that
/// need a new index, and one-shot marks of steps done.
///
/// Every operation works on the loaded `root` alone; StatusMgr wraps each in lock, load, save and
/// unlock. Where the file holds another JSON type than expected, an exception of the JSON library
/// passes to the caller unless said otherwise.
class FILEINDEX_API Status : public Config {
  public:
    ~Status() override;

    /// Config::LoadJson().
    bool Load() override;

    /// Config::SaveJson().
    bool Save() override;

    /// @return "/tmp/fileidx_cfg_status.lock"
    std::string GetLockPath() const override;

    /// @return "/usr/vano/etc/fileindex/status.conf"
    std::string GetPath() const override;

    /// Pauses indexing.
    ///
    /// @param resume_time end of the pause in seconds since the epoch; 0 for no end.
    /// @return always true.
    bool Pause(long long resume_time);

    /// Ends any pause by storing -1. @return always true.
    bool Resume();

    /// @param resume_time receives -1 when not paused, 0 for a pause without end, otherwise the
    ///                    end of the pause in seconds since the epoch, which may have passed.
    /// @return false when the stored value cannot be converted to a signed 64-bit integer; one line
    ///         is logged and `resume_time` left unwritten. Nothing throws.
    bool GetPauseInfo(long long &resume_time);

    /// Marks a share as out of space, or clears the mark. Marking one that is not yet marked runs
    /// the administrator notification first; when that fails, one line is logged.
    ///
    /// @return always true.
    bool ShareSetNoSpace(const std::string &share, bool no_space);

    /// @return whether the share is marked as out of space. Nothing throws.
    bool ShareIsNoSpace(const std::string &share);

    /// Marks a share as needing a new index, or clears the mark. @return always true.
    bool ShareSetNeedReindex(const std::string &share, bool need);

    /// @return whether the share is marked as needing a new index. Nothing throws.
    bool ShareIsNeedReindex(const std::string &share);

    /// @return whether the step `key` is marked as done: its member converts to true. One that
    ///         cannot be converted, such as a string, throws.
    bool IsUpdated(const std::string &key);

    /// Marks the step `key` as done. The mark stands at the top level of the file, so a key named
    /// like another member overwrites it.
    ///
    /// @return always true.
    bool SetUpdated(const std::string &key);
};

} // namespace VANO::FILEINDEX

#endif
