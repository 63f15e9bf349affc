#ifndef INDEXING_PEER_COMMAND_SOCKET_H
#define INDEXING_PEER_COMMAND_SOCKET_H

#include <chrono>
#include <cstddef>
#include <functional>
#include <json/value.h>
#include <poll.h>
#include <string>
#include <vector>

#include "owned_fd.h"

namespace peer {

// The daemon's side of the command socket.
//
// Every connection carries one message: a 4-byte length in host byte order, then so many bytes, the
// last of them zero; before it the JSON text {"type": NAME, "data": ANYTHING}. Nothing is answered.
// What breaks that, or is not complete in time, is refused and the connection closed.
class CommandSocket {
  public:
    using OnCommand = std::function<void(const std::string &type, const Json::Value &data)>;
    using OnRefusal = std::function<void(const std::string &reason)>;

    CommandSocket() = default;
    CommandSocket(const CommandSocket &) = delete;
    CommandSocket &operator=(const CommandSocket &) = delete;
    // Removes the socket, so that the next caller hears at once that nobody listens.
    ~CommandSocket();

    // Takes the place of a socket whose daemon has died. False, with a reason, beside a living one.
    [[nodiscard]] bool Listen(std::string &reason);

    // Adds what poll() is to wait for.
    void AddTo(std::vector<pollfd> &waiting) const;

    // Reads what has arrived, without blocking.
    void Work(const OnCommand &onCommand, const OnRefusal &onRefusal);

  private:
    using Clock = std::chrono::steady_clock;

    struct Connection {
        OwnedFd fd;
        Clock::time_point deadline;
        std::string received;
    };

    enum class Progress { kWaiting, kComplete, kRefused };

    void AcceptAll();
    static Progress ReadOn(Connection &connection, std::string &reason);
    static bool Dispatch(const Connection &connection, const OnCommand &onCommand,
                         std::string &reason);

    OwnedFd lock_; // held as long as this process listens
    OwnedFd listener_;
    std::vector<Connection> connections_;
};

} // namespace peer

#endif
