#include "bench/measure.h"

#include <algorithm>
#include <benchmark/benchmark.h>
#include <ctime>
#include <stdexcept>

#include "bench/report.h"

namespace VANO::BENCH {

namespace {

constexpr double kSecondsOfRepetition = 0.3;
constexpr double kSecondsOfQuickRepetition = 0.01;

// Processor time counts the peer's thread and the kernel's work too. It leaves out only what other
// programs take of the core; nothing that is measured here sleeps or waits for a disk.
double Now() {
    timespec now{};
    (void)::clock_gettime(GetOptions().wall ? CLOCK_MONOTONIC : CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

// What reading the clock adds to a sample.
double ClockCost() {
    static const double cost = [] {
        std::vector<double> samples(1001);
        for (double &sample : samples) {
            const double begin = Now();
            sample = Now() - begin;
        }
        return Median(samples);
    }();
    return cost;
}

double TimeOf(const Operation &operation, std::size_t calls) {
    if (operation.prepare) {
        operation.prepare();
    }
    bool right = true;
    const double clockCost = ClockCost();
    const double begin = Now();
    for (std::size_t i = 0; i < calls; ++i) {
        right = operation.run() && right;
    }
    const double elapsed = Now() - begin - clockCost;
    Require(right && (!operation.check || operation.check()), "wrong answer");
    Require(elapsed > 0, "no time has passed");
    return elapsed / static_cast<double>(calls);
}

void SetUpBenchmark(benchmark::internal::Benchmark *benchmark, std::size_t repetitions) {
    benchmark->UseManualTime()
        ->MinTime(GetOptions().quick ? kSecondsOfQuickRepetition : kSecondsOfRepetition)
        ->Repetitions(static_cast<int>(repetitions));
}

// Runs the benchmark's loop; whatever is thrown becomes its error.
template <typename Loop>
void Guard(benchmark::State &state, Loop loop) {
    try {
        loop();
    } catch (const std::exception &problem) {
        state.SkipWithError(problem.what());
    }
}

void Compare(benchmark::State &state, const Comparison &comparison) {
    Guard(state, [&] {
        const Pair pair = comparison.setUp();
        std::vector<double> numerator;
        std::vector<double> denominator;
        for (auto _ : state) {
            numerator.push_back(TimeOf(pair.numerator, comparison.calls));
            denominator.push_back(TimeOf(pair.denominator, comparison.calls));
            state.SetIterationTime((numerator.back() + denominator.back()) *
                                   static_cast<double>(comparison.calls));
        }
        state.counters["numerator"] = Median(numerator);
        state.counters["denominator"] = Median(denominator);
    });
}

void Follow(benchmark::State &state, const Series &series, std::size_t size) {
    Guard(state, [&] {
        const Operation operation = series.setUp(size);
        std::vector<double> times;
        for (auto _ : state) {
            times.push_back(TimeOf(operation, 1));
            state.SetIterationTime(times.back());
        }
        state.counters["value"] = Median(times);
    });
}

} // namespace

Options &GetOptions() {
    static Options options;
    return options;
}

std::size_t Size(std::size_t full, std::size_t quick) {
    return GetOptions().quick ? quick : full;
}

void Require(bool condition, const char *what) {
    if (!condition) {
        throw std::runtime_error(what);
    }
}

void AddComparison(const Comparison &comparison) {
    DescribeComparison(comparison);
    SetUpBenchmark(benchmark::RegisterBenchmark(
                       comparison.key.c_str(),
                       [comparison](benchmark::State &state) { Compare(state, comparison); }),
                   GetOptions().repetitions);
}

void AddFigure(const Figure &figure) {
    DescribeFigure(figure);
    benchmark::RegisterBenchmark(figure.key.c_str(),
                                 [figure](benchmark::State &state) {
                                     Guard(state, [&] {
                                         for (auto _ : state) {
                                             state.counters["value"] = figure.measure();
                                             state.SetIterationTime(1);
                                         }
                                     });
                                 })
        ->UseManualTime()
        ->Iterations(1);
}

void AddSeries(const Series &series) {
    for (const std::size_t size : series.sizes) {
        const std::string name = SeriesKey(series.axis, series.name, size);
        SetUpBenchmark(
            benchmark::RegisterBenchmark(
                name.c_str(), [=](benchmark::State &state) { Follow(state, series, size); }),
            1);
    }
}

} // namespace VANO::BENCH
