// Tortures the library; see --help and docs/reliability.md. To be run through scripts/sandbox.

#include <CLI/CLI.hpp>
#include <array>
#include <gtest/gtest.h>
#include <iostream>

#include "parts.h"
#include "support/files.h"
#include "testbed.h"
#include "tracer.h"

namespace {

using namespace VANO::TORTURE;

constexpr int kSkipped = 77;

struct Part {
    const char *name;
    const char *help;
    long (*run)(const Options &);
    bool traces;
    bool hasDaemon; // otherwise it brings its own
};

constexpr std::array<Part, 6> kParts{{
    {"calls", "Make every system call fail, once and ever after", SweepCalls, true, true},
    {"allocations", "Refuse every request for memory, once and ever after", SweepAllocations, false,
     true},
    {"kills", "Kill writing operations at every system call", SweepKills, true, true},
    {"peer-kills", "Kill who works a queue off at every system call", SweepPeerKills, true, true},
    {"power-loss", "Look at every state that a lost power line may leave", SweepPowerLoss, true,
     true},
    {"stress", "Many processes and threads at once", Stress, false, false},
}};

int Skip(const char *reason) {
    std::cerr << "torture: " << reason << '\n';
    return kSkipped;
}

int Run(const std::vector<const Part *> &parts, const Options &options) {
    VANO::TESTS::RequireSandbox();
    long failures = 0;
    for (const Part *part : parts) {
        if (part->traces && !CanTrace()) {
            return Skip("this machine lets no system call be traced");
        }
        const Testbed testbed(STAND_IN_PATH, part->hasDaemon);
        failures += part->run(options);
    }
    return failures == 0 ? 0 : 1;
}

} // namespace

int main(int argc, char **argv) {
    ::testing::FLAGS_gtest_throw_on_failure = true; // what the test kit cannot do ends the program
    CLI::App app("Tortures the library and sums up in a line for each part.", "torture");
    Options options;
    std::vector<const Part *> chosen;
    app.require_subcommand(1, 0);
    app.fallthrough();
    app.add_flag("--short", options.isShort, "A sample of the cases");
    app.add_flag("--verbose", options.verbose, "A line for each operation too");
    app.add_option("--seed", options.seed, "Chooses the sample and the order of stress");
    app.add_option("--seconds", options.seconds, "How long to stress");
    app.add_option("--processes", options.processes, "How many processes stress");
    app.add_option("--threads", options.threads, "How many threads each has");
    app.add_option("--operation", options.operation, "Only this operation");
    for (const Part &part : kParts) {
        app.add_subcommand(part.name, part.help)->callback([&chosen, &part] {
            chosen.push_back(&part);
        });
    }
    CLI11_PARSE(app, argc, argv);
    try {
        return Run(chosen, options);
    } catch (const std::exception &exception) {
        std::cerr << "torture: " << exception.what() << '\n';
        return 2;
    }
}
