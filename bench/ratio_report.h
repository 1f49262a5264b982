// The console report of Google Benchmark, followed by tables of ratios between benchmarks that
// ran side by side in the same run.
#pragma once

#include <benchmark/benchmark.h>

#include <map>
#include <ostream>
#include <string>
#include <vector>

namespace bench {

class RatioReporter : public benchmark::ConsoleReporter {
public:
    // Colours only on a terminal; counters inline, since the benchmarks that carry them run
    // interleaved with those that do not.
    RatioReporter();

    // A routine: its benchmark through the module, the benchmark of the raw registry calls it
    // makes, and the benchmark that runs both in alternating blocks (counters module_ns,
    // raw_ns and ratio).
    void comparePair(const std::string& routine, const std::string& moduleName,
                     const std::string& rawName, const std::string& sideName);
    // A module benchmark stopped by its guards before any registry call: the routine's own
    // work, set beside the module's extra time over the raw calls.
    void ownWork(const std::string& routine, const std::string& name);
    // A benchmark whose iterations each handle `units` items (deleted keys).
    void perUnit(const std::string& name, const std::string& label, double units);
    // Ratio of two perUnit benchmarks' time per item, with the largest ratio that meets the
    // target (none when `target` is 0).
    void scaling(const std::string& label, const std::string& larger, const std::string& smaller,
                 double target);

    void ReportRuns(const std::vector<Run>& runs) override;
    // Prints the tables of the benchmarks that ran; returns false when one of them failed or
    // its counterpart is missing.
    bool printSummary(std::ostream& out, double pairTarget) const;
    // One line per routine compared, "ratio <Routine> <module/raw>", the side-by-side ratio with
    // three decimals ("-" when it was not measured): the lines a run is judged by.
    void printRatios(std::ostream& out) const;

private:
    // One value of a benchmark over its repetitions: the median aggregate when Google Benchmark
    // reported one, and the single repetitions it reported.
    struct Series {
        std::vector<double> repetitions;
        double median = -1;
    };
    struct Results {
        Series time;                             // real time per iteration, ns
        std::map<std::string, Series> counters;  // user counters
        bool failed = false;
    };
    // The median over the repetitions of the real time per iteration (`counter` empty) or of
    // a counter.
    bool typical(const std::string& name, double* value, const std::string& counter = "") const;
    bool ran(const std::string& name) const;

    struct Pair {
        std::string routine, module, raw, side;
    };
    struct Own {
        std::string routine, name;
    };
    struct Unit {
        std::string name, label;
        double units;
    };
    struct Scaling {
        std::string label, larger, smaller;
        double target;
    };
    std::vector<Pair> pairs_;
    std::vector<Own> own_;
    std::vector<Unit> units_;
    std::vector<Scaling> scalings_;
    std::map<std::string, Results> results_;
};

}  // namespace bench
