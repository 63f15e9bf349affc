#ifndef FILEINDEXCTL_WATCH_LIVE_OUTPUT_H
#define FILEINDEXCTL_WATCH_LIVE_OUTPUT_H

#include <string>
#include <termios.h>

#include "watch/frame.h"
#include "watch/watch_output.h"

namespace CTL {

// The whole terminal, drawn anew in place, while this program is in the foreground; nothing
// otherwise. What stood there before comes back at the end, with the last picture below it.
class LiveOutput : public WatchOutput {
  public:
    explicit LiveOutput(const Style &style) : style_(style) {}
    ~LiveOutput() override;
    LiveOutput(const LiveOutput &) = delete;
    LiveOutput &operator=(const LiveOutput &) = delete;

    [[nodiscard]] std::vector<int> Signals() const override;
    [[nodiscard]] bool Show(const WatchedState &state) override;
    [[nodiscard]] bool ShowCounting(const WatchedState &state) override { return Show(state); }
    [[nodiscard]] bool Handle(int signal) override;
    [[nodiscard]] bool Attend() override;
    [[nodiscard]] int Input() const override;
    [[nodiscard]] bool ReadsTheEnd() override;

  private:
    [[nodiscard]] bool Draw();
    [[nodiscard]] std::string Picture() const;
    [[nodiscard]] bool Enter();
    [[nodiscard]] bool Leave();

    const Style style_;
    WatchedState state_;
    termios former_{};       // how the keyboard was
    bool isQuiet_ = false;   // the keyboard does not echo
    bool isEntered_ = false; // the screen is ours
};

} // namespace CTL

#endif
