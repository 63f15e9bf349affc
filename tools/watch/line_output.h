#ifndef FILEINDEXCTL_WATCH_LINE_OUTPUT_H
#define FILEINDEXCTL_WATCH_LINE_OUTPUT_H

#include <map>
#include <string>

#include "watch/watch_output.h"

namespace CTL {

// Plain lines: at first one for the service and one for each share, later those that have changed.
class LineOutput : public WatchOutput {
  public:
    [[nodiscard]] bool Show(const WatchedState &state) override;

  private:
    void ShowChange(const std::string &stamp, const std::string &what, const std::string &text);

    std::map<std::string, std::string> last_;
};

// One JSON object a line, one for each look.
class JsonOutput : public WatchOutput {
  public:
    [[nodiscard]] bool Show(const WatchedState &state) override;
};

} // namespace CTL

#endif
