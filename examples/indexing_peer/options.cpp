#include "options.h"

#include <cstdlib>
#include <getopt.h>
#include <iostream>

namespace peer {

namespace {

constexpr int kExitUsage = 2;
constexpr long kMaxInterval = 60000;

constexpr char kHelp[] = R"(Usage: indexing_peer [--queue FILE]... [--interval MS]

Plays the indexing daemon: listens on /var/run/fileindexd.sock, takes over the
event queues of the shares and prints what it is told and what it finds.

  command NAME DATA               a command from the socket
  refused command: WHY            something else came from the socket
  event N QUEUE: CODE PATH DATA   the N-th event, from that queue file
  malformed N QUEUE: TEXT         a line of a queue file that is no event

While indexing is paused the queues are left alone. Everything is printed at
least once, also when the program was killed: it takes up first what it left.

  --queue FILE    watch this queue file, and no others; may be repeated.
                  Without it: the queues of /usr/vano/etc/shares.json
  --interval MS   look at the queues so often, 1 to 60000; 200 if not given
  --help          this text

SIGTERM and SIGINT end it cleanly. Exit status: 0 after such an end, 1 when it
cannot listen or print, 2 for a mistake in the call.
)";

enum Option : int { kQueue = 'q', kInterval = 'i', kHelpWanted = 'h' };

const option kOptions[] = {{"queue", required_argument, nullptr, kQueue},
                           {"interval", required_argument, nullptr, kInterval},
                           {"help", no_argument, nullptr, kHelpWanted},
                           {nullptr, 0, nullptr, 0}};

bool ParseInterval(std::chrono::milliseconds &interval, const char *text) {
    char *end = nullptr;
    const long value = std::strtol(text, &end, 10);
    if (end == text || *end != '\0' || value < 1 || value > kMaxInterval) {
        std::cerr << "indexing_peer: --interval takes milliseconds from 1 to " << kMaxInterval
                  << ", not '" << text << "'\n";
        return false;
    }
    interval = std::chrono::milliseconds(value);
    return true;
}

} // namespace

std::optional<Options> ParseOptions(int argc, char **argv, int &status) {
    Options options;
    status = kExitUsage;
    for (;;) {
        switch (::getopt_long(argc, argv, "", kOptions, nullptr)) {
        case -1:
            if (optind < argc) {
                std::cerr << "indexing_peer: unexpected '" << argv[optind] << "', see --help\n";
                return std::nullopt;
            }
            return options;
        case kQueue:
            options.queues.emplace_back(optarg);
            break;
        case kInterval:
            if (!ParseInterval(options.interval, optarg)) {
                return std::nullopt;
            }
            break;
        case kHelpWanted:
            std::cout << kHelp;
            status = EXIT_SUCCESS;
            return std::nullopt;
        default: // getopt has said what is wrong
            return std::nullopt;
        }
    }
}

} // namespace peer
