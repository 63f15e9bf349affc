#ifndef FILEINDEX_CONFIG_H
#define FILEINDEX_CONFIG_H

#include <json/value.h>
#include <string>

#include <fileindex/export.h>

/// Verbosity of the event queue's writer: with the value 7, and no other, AddCustomEvent() also
/// logs a busy or failing queue lock and a short write. Initially 3. A plain variable without
/// synchronisation.
extern FILEINDEX_API int LOG_LEVEL;

namespace VANO::FILEINDEX {

using ::LOG_LEVEL;

/// A JSON document kept in one settings file and guarded across processes by an advisory lock on a
/// lock file of its own.
///
/// An object lives for one operation of one thread. A change runs Lock(true), Load(), the derived
/// class's operations, Save(), Unlock(); most readers only Load(). Destruction does not unlock:
/// call Unlock() once after each Lock(), whether it succeeded or not.
///
/// A derived class names its two files and turns `root` into its own records and back.
class FILEINDEX_API Config {
  public:
    Config();
    Config(const Config &) = delete;
    Config &operator=(const Config &) = delete;

    /// Destroys the document only: neither unlocks nor closes the lock file.
    virtual ~Config();

    /// Reads the file and turns `root` into the derived class's records.
    virtual bool Load() = 0;

    /// Turns the records into `root` and writes the file.
    virtual bool Save() = 0;

    /// @return the full path of the lock file.
    virtual std::string GetLockPath() const = 0;

    /// @return the full path of the settings file.
    virtual std::string GetPath() const = 0;

    /// Reads the file GetPath() into `root`. Takes no lock.
    ///
    /// A missing file is the normal first state: true, and `root` stays as it is.
    ///
    /// @return false when the file exists and cannot be read as one JSON value; `root` is then
    ///         unchanged, the last error FILEINDEX_ERR_LOAD, and one line is logged.
    bool LoadJson();

    /// Writes `root` to the file GetPath() with the mode 0644. Takes no lock.
    ///
    /// The file is replaced atomically and flushed to disk: a reader sees the old text or the new
    /// one, and so does the next boot after a power loss. Where it cannot be replaced it is
    /// rewritten in place.
    ///
    /// @return false when the text could not be written; the last error is then
    ///         FILEINDEX_ERR_SAVE and one line is logged. A mode that could not be set is logged
    ///         only.
    bool SaveJson();

    /// Takes the advisory lock on GetLockPath(), creating that file (mode 0644) when missing.
    ///
    /// Never blocks: up to three attempts with a random pause of 0 to 9 ms after each.
    ///
    /// @param exclusive true for the exclusive lock, which every operation of the library takes;
    ///        false for the shared one.
    /// @return false when the file cannot be opened or stays locked; the last error is then
    ///         FILEINDEX_ERR_LOCK and one line is logged. Each attempt opens the lock file again
    ///         and a failed call leaves those descriptors open; Unlock() closes the last of them.
    bool Lock(bool exclusive);

    /// Releases the lock and closes the lock file; does nothing on an object that was never locked.
    /// To be called once: `lock_fd` keeps its value.
    void Unlock();

    Json::Value root; ///< the whole document; an empty object in a new Config
    int lock_fd = -1; ///< descriptor of the lock file, whatever the last attempt to open it gave
};

} // namespace VANO::FILEINDEX

#endif
