#include "ratio_report.h"

#include <algorithm>
#include <cstdio>
#include <unistd.h>

namespace bench {

namespace {

double nanosecondsPer(benchmark::TimeUnit unit) {
    switch (unit) {
        case benchmark::kNanosecond: return 1;
        case benchmark::kMicrosecond: return 1e3;
        case benchmark::kMillisecond: return 1e6;
        case benchmark::kSecond: return 1e9;
    }
    return 1;
}

double median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    size_t n = values.size();
    return n % 2 ? values[n / 2] : (values[n / 2 - 1] + values[n / 2]) / 2;
}

}  // namespace

RatioReporter::RatioReporter() : ConsoleReporter(isatty(STDOUT_FILENO) ? OO_Color : OO_None) {}

void RatioReporter::comparePair(const std::string& routine, const std::string& moduleName,
                                const std::string& rawName, const std::string& sideName) {
    pairs_.push_back(Pair{routine, moduleName, rawName, sideName});
}

void RatioReporter::ownWork(const std::string& routine, const std::string& name) {
    own_.push_back(Own{routine, name});
}

void RatioReporter::perUnit(const std::string& name, const std::string& label, double units) {
    units_.push_back(Unit{name, label, units});
}

void RatioReporter::scaling(const std::string& label, const std::string& larger,
                            const std::string& smaller, double target) {
    scalings_.push_back(Scaling{label, larger, smaller, target});
}

void RatioReporter::ReportRuns(const std::vector<Run>& runs) {
    ConsoleReporter::ReportRuns(runs);
    for (const Run& run : runs) {
        Results& r = results_[run.run_name.function_name];
        if (run.error_occurred) {
            r.failed = true;
            continue;
        }
        bool single = run.run_type == Run::RT_Iteration;
        if (!single && run.aggregate_name != "median") continue;
        auto add = [single](Series& s, double value) {
            if (single)
                s.repetitions.push_back(value);
            else
                s.median = value;
        };
        add(r.time, run.GetAdjustedRealTime() * nanosecondsPer(run.time_unit));
        for (const auto& counter : run.counters) add(r.counters[counter.first], counter.second);
    }
}

bool RatioReporter::ran(const std::string& name) const { return results_.count(name) != 0; }

bool RatioReporter::typical(const std::string& name, double* value,
                            const std::string& counter) const {
    auto it = results_.find(name);
    if (it == results_.end() || it->second.failed) return false;
    const Series* s = &it->second.time;
    if (!counter.empty()) {
        auto c = it->second.counters.find(counter);
        if (c == it->second.counters.end()) return false;
        s = &c->second;
    }
    if (s->median >= 0) {
        *value = s->median;
        return true;
    }
    if (s->repetitions.empty()) return false;
    *value = median(s->repetitions);
    return true;
}

bool RatioReporter::printSummary(std::ostream& out, double pairTarget) const {
    bool complete = true;
    char line[200];

    bool anyPair = false;
    for (const Pair& p : pairs_) anyPair = anyPair || ran(p.module) || ran(p.side);
    if (anyPair) {
        out << "\nModule cost over the registry calls it makes, ns per call (median over the "
               "repetitions).\nSeparate: the Module/ and Raw/ benchmarks, fast blocks. Side by "
               "side: both in alternating\nblocks within one benchmark; its ratio is the one "
               "the target applies to.\n";
        std::snprintf(line, sizeof(line), "%-20s %8s %8s %8s | %8s %8s %8s  target <= %.2f\n",
                      "routine", "module", "raw", "ratio", "module", "raw", "ratio", pairTarget);
        out << line;
        std::snprintf(line, sizeof(line), "%-20s %26s | %26s\n", "", "separate", "side by side");
        out << line;
        for (const Pair& p : pairs_) {
            if (!ran(p.module) && !ran(p.side)) continue;
            double moduleNs = 0, rawNs = 0, sideModule = 0, sideRaw = 0, ratio = 0;
            bool separate =
                typical(p.module, &moduleNs, "fast_ns") && typical(p.raw, &rawNs, "fast_ns");
            bool side = typical(p.side, &sideModule, "module_ns") &&
                        typical(p.side, &sideRaw, "raw_ns") && typical(p.side, &ratio, "ratio");
            char first[40] = "       -        -        -";
            char second[40] = "       -        -        -";
            if (separate)
                std::snprintf(first, sizeof(first), "%8.1f %8.1f %8.3f", moduleNs, rawNs,
                              moduleNs / rawNs);
            if (side)
                std::snprintf(second, sizeof(second), "%8.1f %8.1f %8.3f", sideModule, sideRaw,
                              ratio);
            if (!side) complete = false;
            std::snprintf(line, sizeof(line), "%-20s %s | %s  %s\n", p.routine.c_str(), first,
                          second,
                          !side                 ? "not measured"
                          : ratio <= pairTarget ? "met"
                                                : "NOT MET");
            out << line;
        }
    }

    bool anyOwn = false;
    for (const Own& o : own_) anyOwn = anyOwn || ran(o.name);
    if (anyOwn) {
        out << "\nThe routine's own work, ns per call: parameters fetched and checked, stopped "
               "by a null\nparameter before the registry (fast blocks), beside the module's "
               "extra time over the raw\ncalls (side by side)\n";
        std::snprintf(line, sizeof(line), "%-20s %10s %16s\n", "routine", "own", "module - raw");
        out << line;
        for (const Own& o : own_) {
            if (!ran(o.name)) continue;
            double own = 0, moduleNs = 0, rawNs = 0;
            if (!typical(o.name, &own, "fast_ns")) {
                out << o.routine << ": not measured\n";
                complete = false;
                continue;
            }
            bool paired = false;
            for (const Pair& p : pairs_)
                paired =
                    paired || (p.routine == o.routine && typical(p.side, &moduleNs, "module_ns") &&
                               typical(p.side, &rawNs, "raw_ns"));
            if (paired)
                std::snprintf(line, sizeof(line), "%-20s %10.1f %16.1f\n", o.routine.c_str(), own,
                              moduleNs - rawNs);
            else
                std::snprintf(line, sizeof(line), "%-20s %10.1f %16s\n", o.routine.c_str(), own,
                              "-");
            out << line;
        }
    }

    bool anyUnit = false;
    for (const Unit& u : units_) anyUnit = anyUnit || ran(u.name);
    if (anyUnit) {
        out << "\nKey tree deletion, each deletion timed by the thread's CPU clock: median over "
               "the repetitions\nof their mean (time) and of their fastest deletion (fast)\n";
        std::snprintf(line, sizeof(line), "%-32s %12s %12s %12s\n", "tree", "ms per tree",
                      "ns per key", "ns per key");
        out << line;
        std::snprintf(line, sizeof(line), "%-32s %12s %12s %12s\n", "", "time", "time", "fast");
        out << line;
        for (const Unit& u : units_) {
            if (!ran(u.name)) continue;
            double ns = 0, fast = 0;
            if (!typical(u.name, &ns) || !typical(u.name, &fast, "fast_ns")) {
                out << u.label << ": not measured\n";
                complete = false;
                continue;
            }
            std::snprintf(line, sizeof(line), "%-32s %12.3f %12.1f %12.1f\n", u.label.c_str(),
                          ns / 1e6, ns / u.units, fast / u.units);
            out << line;
        }
        auto perKey = [&](const std::string& name, double* ns) {
            for (const Unit& u : units_)
                if (u.name == name && typical(name, ns, "fast_ns")) {
                    *ns /= u.units;
                    return true;
                }
            return false;
        };
        for (const Scaling& s : scalings_) {
            double top = 0, bottom = 0;
            if (!perKey(s.larger, &top) || !perKey(s.smaller, &bottom)) continue;
            double ratio = top / bottom;
            if (s.target > 0)
                std::snprintf(line, sizeof(line), "%s (fast): %.3f (target <= %.2f: %s)\n",
                              s.label.c_str(), ratio, s.target,
                              ratio <= s.target ? "met" : "NOT MET");
            else
                std::snprintf(line, sizeof(line), "%s (fast): %.3f\n", s.label.c_str(), ratio);
            out << line;
        }
    }
    return complete;
}

void RatioReporter::printRatios(std::ostream& out) const {
    char line[120];
    for (const Pair& p : pairs_) {
        if (!ran(p.side)) continue;
        double ratio = 0;
        if (typical(p.side, &ratio, "ratio"))
            std::snprintf(line, sizeof(line), "ratio %s %.3f\n", p.routine.c_str(), ratio);
        else
            std::snprintf(line, sizeof(line), "ratio %s -\n", p.routine.c_str());
        out << line;
    }
}

}  // namespace bench
