#include "bench/report.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <map>
#include <sstream>
#include <thread>

#include "bench/measure.h"

namespace VANO::BENCH {

namespace {

constexpr char kSeriesPrefix[] = "series";

struct Fact {
    std::string name;
    double value;
    double atMost;
};

// What is known of a key before it is measured, and what it reports of itself meanwhile.
struct KeyInfo {
    std::string key;
    std::string text;
    std::string unit; // empty for a ratio
    Target direction;
    double target;
    std::map<std::string, Fact> facts;
};

std::vector<KeyInfo> &Keys() {
    static std::vector<KeyInfo> keys;
    return keys;
}

KeyInfo *FindKey(const std::string &key) {
    const auto found = std::find_if(Keys().begin(), Keys().end(),
                                    [&](const KeyInfo &info) { return info.key == key; });
    return found != Keys().end() ? &*found : nullptr;
}

bool IsMet(const KeyInfo &info, double value) {
    return (info.direction == Target::kAtMost ? value <= info.target : value >= info.target) &&
           std::all_of(info.facts.begin(), info.facts.end(),
                       [](const auto &entry) { return entry.second.value <= entry.second.atMost; });
}

std::string Text(const char *format, double value) {
    char text[64];
    (void)std::snprintf(text, sizeof(text), format, value);
    return text;
}

std::string Duration(double seconds) {
    if (seconds >= 1) {
        return Text("%.2f s", seconds);
    }
    if (seconds >= 1e-3) {
        return Text("%.2f ms", seconds * 1e3);
    }
    return Text("%.2f us", seconds * 1e6);
}

void PrintRow(const KeyInfo &info, const Json::Value &entry) {
    const bool isRatio = info.unit.empty();
    const std::string unit = isRatio ? "" : " " + info.unit;
    const double value = entry[isRatio ? "ratio" : info.unit].asDouble();
    const std::string target =
        (info.direction == Target::kAtMost ? "<= " : ">= ") + Text("%g", info.target) + unit;
    (void)std::printf("%-20s %10s %10s  %-4s %12s %12s  %s\n", info.key.c_str(),
                      (Text("%.3g", value) + unit).c_str(), target.c_str(),
                      entry["met"].asBool() ? "yes" : "NO",
                      isRatio ? Duration(entry["numerator_seconds"].asDouble()).c_str() : "",
                      isRatio ? Duration(entry["denominator_seconds"].asDouble()).c_str() : "",
                      info.text.c_str());
    for (const auto &[name, fact] : info.facts) {
        (void)std::printf("%20s %s\n", Text("%g", fact.value).c_str(), name.c_str());
    }
}

double CounterOf(const benchmark::BenchmarkReporter::Run &run, const char *name) {
    const auto found = run.counters.find(name);
    return found != run.counters.end() ? found->second.value : std::nan("");
}

std::string ProcessorName() {
    std::ifstream info("/proc/cpuinfo");
    std::string line;
    while (std::getline(info, line)) {
        if (line.rfind("model name", 0) == 0) {
            return line.substr(line.find(':') + 2);
        }
    }
    return "unknown";
}

} // namespace

double Median(std::vector<double> values) {
    if (values.empty()) {
        return std::nan("");
    }
    const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    if (values.size() % 2 != 0) {
        return *middle;
    }
    return (*middle + *std::max_element(values.begin(), middle)) / 2;
}

void DescribeComparison(const Comparison &comparison) {
    Keys().push_back(
        {comparison.key, comparison.text, "", comparison.direction, comparison.target, {}});
}

void DescribeFigure(const Figure &figure) {
    Keys().push_back({figure.key, figure.text, figure.unit, Target::kAtMost, figure.target, {}});
}

void ReportFact(const std::string &key, const std::string &name, double value, double atMost) {
    FindKey(key)->facts[name] = {name, value, atMost};
}

std::string SeriesKey(const std::string &axis, const std::string &name, std::size_t size) {
    return std::string(kSeriesPrefix) + "/" + axis + "/" + name + "/" + std::to_string(size);
}

bool Report::ReportContext(const Context & /*context*/) {
    return true;
}

void Report::Problem(const std::string &benchmark, const std::string &what) {
    problems_ = true;
    (void)std::fprintf(stderr, "%s: %s\n", benchmark.c_str(), what.c_str());
}

void Report::ReportRuns(const std::vector<Run> &runs) {
    std::vector<Run> single;
    for (const Run &run : runs) {
        if (run.error_occurred) {
            Problem(run.run_name.function_name, run.error_message);
        } else if (run.run_type == Run::RT_Iteration) {
            single.push_back(run);
        }
    }
    if (single.empty()) {
        return;
    }
    const std::string &name = single.front().run_name.function_name;
    (void)std::fprintf(stderr, "measured %s\n", name.c_str());
    std::istringstream parts(name);
    std::string prefix;
    std::string axis;
    std::string line;
    std::string size;
    if (std::getline(parts, prefix, '/') && prefix == kSeriesPrefix &&
        std::getline(parts, axis, '/') && std::getline(parts, line, '/') &&
        std::getline(parts, size)) {
        series_[axis][line][size] = CounterOf(single.front(), "value");
        return;
    }
    AddKey(name, single);
}

void Report::AddKey(const std::string &key, const std::vector<Run> &runs) {
    const KeyInfo &info = *FindKey(key);
    const bool isRatio = info.unit.empty();
    std::vector<double> values;
    std::vector<double> numerators;
    std::vector<double> denominators;
    for (const Run &run : runs) {
        numerators.push_back(CounterOf(run, "numerator"));
        denominators.push_back(CounterOf(run, "denominator"));
        const double quotient = numerators.back() / denominators.back();
        values.push_back(!isRatio                            ? CounterOf(run, "value")
                         : info.direction == Target::kAtMost ? quotient
                                                             : 1 / quotient);
    }
    const double value = Median(values);
    if (!std::isfinite(value) || value < 0 || (isRatio && value == 0)) {
        Problem(key, "impossible value " + std::to_string(value));
        return;
    }
    Json::Value &entry = details_[key];
    entry["compared"] = info.text;
    entry[isRatio ? "ratio" : info.unit] = value;
    entry[info.direction == Target::kAtMost ? "at_most" : "at_least"] = info.target;
    entry["met"] = IsMet(info, value);
    if (isRatio) {
        entry["numerator_seconds"] = Median(numerators);
        entry["denominator_seconds"] = Median(denominators);
    }
    for (const auto &[name, fact] : info.facts) {
        entry[name] = fact.value;
    }
}

void Report::PrintTable() const {
    (void)std::printf("%-20s %10s %10s  %-4s %12s %12s  %s\n", "key", "measured", "target", "met",
                      "time", "against", "what");
    for (const KeyInfo &info : Keys()) {
        if (details_.isMember(info.key)) {
            PrintRow(info, details_[info.key]);
        }
    }
    if (GetOptions().quick) {
        (void)std::puts("A quick run: sizes are smaller than said, and the figures mean nothing.");
    }
}

Json::Value Report::AsJson() const {
    Json::Value json(Json::objectValue);
    for (const KeyInfo &info : Keys()) {
        if (details_.isMember(info.key)) {
            json[info.key] = details_[info.key][info.unit.empty() ? "ratio" : info.unit];
        }
    }
    json["details"] = details_;
    json["series"] = series_;
    json["machine"]["processor"] = ProcessorName();
    json["machine"]["cores"] = std::thread::hardware_concurrency();
    json["quick"] = GetOptions().quick;
    return json;
}

} // namespace VANO::BENCH
