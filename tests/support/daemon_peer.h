#ifndef FILEINDEX_TESTS_DAEMON_PEER_H
#define FILEINDEX_TESTS_DAEMON_PEER_H

// The indexing daemon's side of the command socket: a real listening socket on
// /var/run/fileindexd.sock, served by a thread.
//
//     DaemonPeer daemon;                            // accepts and reads
//     EXPECT_TRUE(StatusMgr::Resume());
//     EXPECT_THAT(daemon.Commands(), ElementsAre(R"({"data":{},"type":"resume"})"));
//
// A complete command also reaches the event trace as "socket: <JSON text>", in its right place
// among the other effects. Without a DaemonPeer no daemon runs: connecting fails.

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <json/value.h>
#include <memory>
#include <mutex>
#include <poll.h>
#include <string>
#include <thread>
#include <vector>

namespace VANO::TESTS {

// What came over one connection.
struct PeerConnection {
    std::string bytes;        // all of it, as received
    bool closed = false;      // the sender has closed its end
    std::uint32_t length = 0; // the first four bytes
    std::string text;         // what follows, without the terminating zero byte
    bool complete = false;    // length, text and zero byte, and nothing else
};

class DaemonPeer {
  public:
    enum class Mode {
        Read,       // accepts, reads to the end, closes
        Reply,      // reads, and answers every connection with a line of garbage at once
        NoAccept,   // listens and never accepts: connecting succeeds, nobody reads
        NoRead,     // accepts and never reads
        CloseAtOnce // accepts and closes
    };

    explicit DaemonPeer(Mode mode = Mode::Read);
    ~DaemonPeer(); // stops the thread, removes the socket
    DaemonPeer(const DaemonPeer &) = delete;
    DaemonPeer &operator=(const DaemonPeer &) = delete;

    // Everything that was sent before the call; connections in the order of their arrival.
    std::vector<PeerConnection> Connections();

    // The JSON texts of the complete commands, compact with sorted members, and as values.
    std::vector<std::string> Commands();
    std::vector<Json::Value> Messages();

    // Forgets what came so far.
    void Clear();

    // Waits until all that was sent before is received. The other operations do it themselves.
    void Sync();

  private:
    struct Connection;

    void Serve();
    std::vector<pollfd> WhatToWaitFor();
    void Accept();
    void Receive(Connection &connection);
    void Finish(Connection &connection);

    const Mode mode_;
    int listener_;
    int wake_;
    std::thread thread_;
    std::mutex mutex_;
    std::condition_variable synced_;
    unsigned long asked_ = 0; // syncs asked for and answered
    unsigned long answered_ = 0;
    bool stop_ = false;
    std::vector<std::unique_ptr<Connection>> connections_;
};

} // namespace VANO::TESTS

#endif
