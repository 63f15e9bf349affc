#ifndef FILEINDEX_BENCH_REPORT_H
#define FILEINDEX_BENCH_REPORT_H

// What came out: a table for people, JSON for programs.

#include <benchmark/benchmark.h>
#include <cstddef>
#include <json/value.h>
#include <string>
#include <vector>

namespace VANO::BENCH {

struct Comparison;
struct Figure;

double Median(std::vector<double> values);

// Keys are reported in the order in which they were described.
void DescribeComparison(const Comparison &comparison);
void DescribeFigure(const Figure &figure);

// The name of a benchmark that is a point of a series.
std::string SeriesKey(const std::string &axis, const std::string &name, std::size_t size);

// Collects what the benchmarks give. An error, or a value that cannot be, is a problem.
class Report : public benchmark::BenchmarkReporter {
  public:
    bool ReportContext(const Context &context) override;
    void ReportRuns(const std::vector<Run> &runs) override;

    void PrintTable() const;

    // An object with a number for each key of the table (the ratio; for peak_memory the figure),
    // and "details", "series", "machine" and "quick".
    [[nodiscard]] Json::Value AsJson() const;

    [[nodiscard]] bool HasProblems() const { return problems_; }

  private:
    void Problem(const std::string &benchmark, const std::string &what);
    void AddKey(const std::string &key, const std::vector<Run> &runs);

    Json::Value details_{Json::objectValue};
    Json::Value series_{Json::objectValue};
    bool problems_ = false;
};

} // namespace VANO::BENCH

#endif
