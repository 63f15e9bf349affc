#ifndef FILEINDEX_CONFIG_SETTINGS_LOCK_H
#define FILEINDEX_CONFIG_SETTINGS_LOCK_H

#include <fileindex/config.h>

namespace VANO::FILEINDEX {

// Holds the exclusive lock of a settings object for a scope, so that every way out unlocks, an
// exception included. The object must outlive it.
class SettingsLock {
  public:
    explicit SettingsLock(Config &settings) : settings_(settings), held_(settings.Lock(true)) {}
    SettingsLock(const SettingsLock &) = delete;
    SettingsLock &operator=(const SettingsLock &) = delete;
    // Also after a failed Lock(), which leaves its last descriptor open.
    ~SettingsLock() { settings_.Unlock(); }

    [[nodiscard]] bool IsHeld() const { return held_; }

  private:
    Config &settings_;
    bool held_;
};

} // namespace VANO::FILEINDEX

#endif
