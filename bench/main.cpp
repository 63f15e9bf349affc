// Measures the library; scripts/bench builds and runs this.

#include <CLI/CLI.hpp>
#include <benchmark/benchmark.h>
#include <cstdio>
#include <fstream>
#include <json/writer.h>

#include "bench/appliance.h"
#include "bench/benchmarks.h"
#include "bench/measure.h"
#include "bench/report.h"

using namespace VANO::BENCH;

namespace {

bool WriteJson(const std::string &path, const Json::Value &json) {
    std::ofstream file(path);
    file << json << '\n';
    file.close();
    return static_cast<bool>(file);
}

void AddBenchmarks() {
    AddMembershipBenchmarks();
    AddQueueBenchmarks();
    AddSettingsBenchmarks();
    AddMemoryBenchmarks();
}

int Measure() {
    const Options &options = GetOptions();
    MakeAppliance();
    AddBenchmarks();
    benchmark::SetDefaultTimeUnit(benchmark::kSecond);
    Report report;
    const std::string pattern = options.filter.empty() ? "." : "^" + options.filter + "(/.*)?$";
    if (benchmark::RunSpecifiedBenchmarks(&report, pattern) == 0) {
        (void)std::fprintf(stderr, "no benchmark is called %s\n", options.filter.c_str());
        return 2;
    }
    report.PrintTable();
    if (!options.json.empty() && !WriteJson(options.json, report.AsJson())) {
        (void)std::fprintf(stderr, "cannot write %s\n", options.json.c_str());
        return 1;
    }
    return report.HasProblems() ? 1 : 0;
}

} // namespace

int main(int argc, char **argv) {
    Options &options = GetOptions();
    std::string queue;
    CLI::App app("Measures libfileindex side by side with what bounds it.");
    app.add_flag("--quick", options.quick, "small sizes: shows that everything runs");
    app.add_flag("--wall", options.wall, "elapsed time instead of processor time");
    app.add_option("--filter", options.filter, "one key, or series");
    app.add_option("--json", options.json, "write the results to this file");
    app.add_option("--repetitions", options.repetitions, "repetitions of each comparison")
        ->check(CLI::PositiveNumber);
    app.add_option("--peak-of", queue, "print the peak memory of one scan, for the folder given");
    CLI11_PARSE(app, argc, argv);
    try {
        return queue.empty() ? Measure() : PrintPeakOfScan(queue);
    } catch (const std::exception &problem) {
        (void)std::fprintf(stderr, "fileindex_bench: %s\n", problem.what());
        return 1;
    }
}
