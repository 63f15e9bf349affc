#ifndef FILEINDEX_BENCH_MEASURE_H
#define FILEINDEX_BENCH_MEASURE_H

// How benchmarks are written: what is compared with what, and at which sizes a cost is followed.
// Google Benchmark runs them; what they give goes to report.h.

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

namespace VANO::BENCH {

struct Options {
    bool quick = false; // sizes that only show that everything runs
    bool wall = false;  // the time that passes instead of the process's processor time
    std::size_t repetitions = 5;
    std::string filter; // one key, or "series"; empty for everything
    std::string json;   // file for the results; empty for none
};

// Set once by main().
Options &GetOptions();
// `full`, or `quick` in a quick run.
std::size_t Size(std::size_t full, std::size_t quick);

// Something that is timed. A wrong answer is no time: it ends the benchmark as an error.
struct Operation {
    std::function<bool()> run;     // timed; false for a wrong answer
    std::function<void()> prepare; // before each sample, not timed; may be empty
    std::function<bool()> check;   // after each sample, not timed; may be empty
};

struct Pair {
    Operation numerator;
    Operation denominator;
};

enum class Target { kAtMost, kAtLeast };

struct Comparison {
    std::string key;
    std::string text; // what is compared with what
    Target direction; // at most: times are divided. At least: speeds are, over the same work.
    double target;
    std::size_t calls; // of an operation for one sample of its time
    std::function<Pair()> setUp;
};

// Numerator and denominator take turns, sample by sample; the ratio of a repetition is that of the
// medians of its samples, the result the median of the repetitions.
void AddComparison(const Comparison &comparison);

// A figure that is no ratio, measured once.
struct Figure {
    std::string key;
    std::string text;
    std::string unit;
    double target; // at most
    std::function<double()> measure;
};

void AddFigure(const Figure &figure);

// The cost of an operation at growing sizes: a line of the chart.
struct Series {
    std::string axis; // "folders" or "queue"
    std::string name;
    std::vector<std::size_t> sizes;
    std::function<Operation(std::size_t)> setUp;
};

void AddSeries(const Series &series);

// A property that belongs to a key and must hold for its target to count as met.
void ReportFact(const std::string &key, const std::string &name, double value, double atMost);

// Throws std::runtime_error with `what` unless the condition holds.
void Require(bool condition, const char *what);

} // namespace VANO::BENCH

#endif
