#include "support/daemon_peer.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <gtest/gtest.h>
#include <json/reader.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include "support/appliance.h"
#include "support/event_trace.h"
#include "support/files.h"
#include "support/sockets.h"

namespace VANO::TESTS {

namespace {

constexpr char kGarbage[] = "\xff{]garbage\n";

// The peer that the event trace asks for news; there is one at a time.
std::mutex &CurrentMutex() {
    static std::mutex &mutex = *new std::mutex;
    return mutex;
}
DaemonPeer *g_current = nullptr;

void SyncCurrent() {
    const std::lock_guard<std::mutex> lock(CurrentMutex());
    if (g_current != nullptr) {
        g_current->Sync();
    }
}

bool ParseJson(Json::Value &value, const std::string &text) {
    const std::unique_ptr<Json::CharReader> reader(Json::CharReaderBuilder().newCharReader());
    return reader->parse(text.data(), text.data() + text.size(), &value, nullptr);
}

// What a command looks like in the trace and in Commands(): its own text when it is no JSON.
std::string CommandText(const std::string &text) {
    Json::Value value;
    return ParseJson(value, text) ? CompactText(value) : text;
}

} // namespace

struct DaemonPeer::Connection {
    int fd;
    PeerConnection content;
};

DaemonPeer::DaemonPeer(Mode mode) : mode_(mode), listener_(-1), wake_(-1) {
    const KitScope kit;
    listener_ = ListenAt(kDaemonSocket, SOCK_STREAM | SOCK_NONBLOCK);
    wake_ = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    thread_ = std::thread(&DaemonPeer::Serve, this);
    static const bool registered = [] {
        EventTrace::Get().AddSource(SyncCurrent);
        return true;
    }();
    (void)registered;
    const std::lock_guard<std::mutex> lock(CurrentMutex());
    EXPECT_EQ(g_current, nullptr) << "two daemons at a time";
    g_current = this;
}

DaemonPeer::~DaemonPeer() {
    const KitScope kit;
    Sync();
    {
        const std::lock_guard<std::mutex> lock(CurrentMutex());
        g_current = nullptr;
    }
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        stop_ = true;
    }
    (void)::eventfd_write(wake_, 1);
    thread_.join();
    for (const auto &connection : connections_) {
        if (connection->fd >= 0) {
            ::close(connection->fd);
        }
    }
    ::close(listener_);
    ::close(wake_);
    ::unlink(kDaemonSocket);
}

void DaemonPeer::Sync() {
    const KitScope kit;
    std::unique_lock<std::mutex> lock(mutex_);
    const unsigned long ticket = ++asked_;
    (void)::eventfd_write(wake_, 1);
    synced_.wait(lock, [&] { return answered_ >= ticket || stop_; });
}

// Every round takes all that is there, so an asked-for round has seen what was sent before it.
std::vector<pollfd> DaemonPeer::WhatToWaitFor() {
    const std::lock_guard<std::mutex> lock(mutex_);
    std::vector<pollfd> waits{{wake_, POLLIN, 0}};
    if (mode_ != Mode::NoAccept) {
        waits.push_back({listener_, POLLIN, 0});
    }
    for (const auto &connection : connections_) {
        if (connection->fd >= 0 && mode_ != Mode::NoRead) {
            waits.push_back({connection->fd, POLLIN, 0});
        }
    }
    return waits;
}

void DaemonPeer::Serve() {
    const KitScope kit;
    for (;;) {
        std::vector<pollfd> waits = WhatToWaitFor();
        (void)::poll(waits.data(), waits.size(), -1);
        const std::lock_guard<std::mutex> lock(mutex_);
        eventfd_t ignored = 0;
        (void)::eventfd_read(wake_, &ignored);
        if (mode_ != Mode::NoAccept) {
            Accept();
        }
        for (const auto &connection : connections_) {
            if (mode_ != Mode::NoRead) {
                Receive(*connection);
            }
        }
        answered_ = asked_;
        synced_.notify_all();
        if (stop_) {
            return;
        }
    }
}

void DaemonPeer::Accept() {
    for (;;) {
        const int fd = ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
        if (fd < 0) {
            return;
        }
        if (mode_ == Mode::Reply) {
            (void)::send(fd, kGarbage, sizeof(kGarbage), MSG_NOSIGNAL);
        }
        connections_.push_back(std::make_unique<Connection>(Connection{fd, {}}));
        if (mode_ == Mode::CloseAtOnce) {
            ::close(fd);
            connections_.back()->fd = -1;
        }
    }
}

void DaemonPeer::Receive(Connection &connection) {
    std::array<char, 65536> buffer;
    while (connection.fd >= 0) {
        const ssize_t got = ::recv(connection.fd, buffer.data(), buffer.size(), 0);
        if (got < 0 && (errno == EAGAIN || errno == EINTR)) {
            return;
        }
        if (got <= 0) {
            Finish(connection);
            return;
        }
        connection.content.bytes.append(buffer.data(), static_cast<std::size_t>(got));
    }
}

void DaemonPeer::Finish(Connection &connection) {
    ::close(connection.fd);
    connection.fd = -1;
    PeerConnection &content = connection.content;
    content.closed = true;
    if (content.bytes.size() >= sizeof(content.length)) {
        std::memcpy(&content.length, content.bytes.data(), sizeof(content.length));
        content.text = content.bytes.substr(sizeof(content.length));
        content.complete = content.text.size() == content.length && !content.text.empty() &&
                           content.text.back() == '\0';
    }
    if (content.complete) {
        content.text.pop_back();
        EventTrace::Get().AddPolled("socket: " + CommandText(content.text));
    }
}

std::vector<PeerConnection> DaemonPeer::Connections() {
    Sync();
    const std::lock_guard<std::mutex> lock(mutex_);
    std::vector<PeerConnection> contents;
    for (const auto &connection : connections_) {
        contents.push_back(connection->content);
    }
    return contents;
}

std::vector<std::string> DaemonPeer::Commands() {
    std::vector<std::string> texts;
    for (const PeerConnection &connection : Connections()) {
        if (connection.complete) {
            texts.push_back(CommandText(connection.text));
        }
    }
    return texts;
}

std::vector<Json::Value> DaemonPeer::Messages() {
    std::vector<Json::Value> values;
    for (const PeerConnection &connection : Connections()) {
        Json::Value value;
        if (connection.complete) {
            EXPECT_TRUE(ParseJson(value, connection.text)) << connection.text;
            values.push_back(value);
        }
    }
    return values;
}

void DaemonPeer::Clear() {
    Sync();
    const std::lock_guard<std::mutex> lock(mutex_);
    for (auto it = connections_.begin(); it != connections_.end();) {
        it = (*it)->fd < 0 ? connections_.erase(it) : it + 1;
    }
}

} // namespace VANO::TESTS
