#ifndef INDEXING_PEER_PAUSE_STATE_H
#define INDEXING_PEER_PAUSE_STATE_H

#include <json/value.h>
#include <string>

namespace peer {

// Whether indexing rests: the daemon learns it from status.conf when it starts and from the
// commands "pause" and "resume" afterwards.
class PauseState {
  public:
    void ReadStatusFile();

    // Takes the two commands' word for it; other commands do not matter here.
    void Follow(const std::string &command, const Json::Value &data);

    [[nodiscard]] bool IsPaused() const;

  private:
    Json::Int64 resumeTime_ = -1; // -1 running, 0 paused without end, else paused until then
};

} // namespace peer

#endif
