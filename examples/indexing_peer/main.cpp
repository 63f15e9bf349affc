// A small indexing daemon that indexes nothing: it does what a daemon has to do towards the library
// and prints it. See options.cpp for what it prints.

#include <csignal>
#include <cstdlib>
#include <iostream>
#include <map>
#include <poll.h>
#include <vector>

#include "command_socket.h"
#include "json_text.h"
#include "options.h"
#include "pause_state.h"
#include "queue_worker.h"
#include "queues.h"
#include "stop_signal.h"

namespace {

using peer::JsonLine;
using peer::OneLine;

// One line on standard output, handed to the system before this returns.
bool Print(const std::string &line) {
    return static_cast<bool>(std::cout << line << '\n' << std::flush);
}

class Peer {
  public:
    explicit Peer(peer::Options options) : options_(std::move(options)) {}

    int Run() {
        std::string reason;
        if (!socket_.Listen(reason)) {
            std::cerr << "indexing_peer: " << reason << '\n';
            return EXIT_FAILURE;
        }
        pause_.ReadStatusFile();
        while (std::cout && !stop_.HasCome()) {
            Wait();
            socket_.Work([this](const auto &type, const auto &data) { OnCommand(type, data); },
                         [](const auto &why) { (void)Print("refused command: " + why); });
            WorkOffQueues();
        }
        if (!std::cout) {
            std::cerr << "indexing_peer: cannot print\n";
            return EXIT_FAILURE;
        }
        return EXIT_SUCCESS;
    }

  private:
    void Wait() const {
        std::vector<pollfd> waiting{{stop_.Get(), POLLIN, 0}};
        socket_.AddTo(waiting);
        (void)::poll(waiting.data(), waiting.size(), static_cast<int>(options_.interval.count()));
    }

    void OnCommand(const std::string &type, const Json::Value &data) {
        (void)Print("command " + OneLine(type) + " " + JsonLine(data));
        pause_.Follow(type, data);
    }

    void WorkOffQueues() {
        if (pause_.IsPaused()) {
            return;
        }
        const auto queues = options_.queues.empty() ? peer::QueuesOfAllShares() : options_.queues;
        for (const std::string &queue : queues) {
            std::string reason;
            const peer::QueueResult result = peer::WorkOffQueue(queue, handlers_, reason);
            if (result == peer::QueueResult::kStopped) {
                return;
            }
            Complain(queue, reason);
        }
    }

    // Once, not at every look.
    void Complain(const std::string &queue, const std::string &reason) {
        std::string &last = complaints_[queue];
        if (reason != last && !reason.empty()) {
            std::cerr << "indexing_peer: " << OneLine(reason) << '\n';
        }
        last = reason;
    }

    bool PrintLine(const char *kind, const std::string &queue, const std::string &rest) {
        return !stop_.HasCome() && Print(std::string(kind) + " " + std::to_string(++count_) + " " +
                                         OneLine(queue) + ": " + rest);
    }

    peer::Options options_;
    peer::StopSignal stop_;
    peer::CommandSocket socket_;
    peer::PauseState pause_;
    std::map<std::string, std::string> complaints_;
    unsigned long count_ = 0;
    const peer::QueueHandlers handlers_{[this](const std::string &queue, const peer::Event &event) {
                                            return PrintLine("event", queue,
                                                             std::to_string(event.code) + " " +
                                                                 OneLine(event.path) + " " +
                                                                 JsonLine(event.data));
                                        },
                                        [this](const std::string &queue, const std::string &line) {
                                            return PrintLine("malformed", queue, OneLine(line));
                                        }};
};

} // namespace

int main(int argc, char **argv) {
    int status = EXIT_SUCCESS;
    const auto options = peer::ParseOptions(argc, argv, status);
    if (!options) {
        return status;
    }
    (void)std::signal(SIGPIPE,
                      SIG_IGN); // a reader of our output that has gone is an error of write
    return Peer(*options).Run();
}
