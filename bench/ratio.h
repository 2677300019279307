/* SPDX-License-Identifier: Apache-2.0 */
#ifndef BENCH_RATIO_H
#define BENCH_RATIO_H

// Benchmarks in pairs: the library's work and its baseline in the same run. On a shared machine, absolute
// times mean little, but their ratio does.
//
// Register both under one name, "<work>/dvs" and "<work>/floor", and list the goal in the program's kGoals:
//
//     const ratio::Goal kGoals[] = {{"serialize/32", 1.15}, ...};
//     int main(int argc, char **argv) { return ratio::Main(argc, argv, kGoals); }
//
// After Google Benchmark's own lines, prints one line per pair with the ratio of the fastest repetitions,
// which other work on the machine disturbs least.

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdio>
#include <limits>
#include <map>
#include <span>
#include <string>

namespace ratio {

struct Goal {
    const char *work;
    double atMost; // multiple of the floor
};

class Reporter : public benchmark::ConsoleReporter {
public:
    void ReportRuns(const std::vector<Run> &runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run &run : runs) {
            if (run.run_type != Run::RT_Iteration || run.error_occurred) continue;
            const std::string &name = run.run_name.function_name;
            const auto slash = name.rfind('/');
            if (slash == std::string::npos) continue;
            double &best =
                best_[name.substr(0, slash)].try_emplace(name.substr(slash + 1), kNone).first->second;
            // If part of the work is another process's, the benchmark requests real time.
            const bool real = !run.run_name.time_type.empty();
            best = std::min(best, real ? run.GetAdjustedRealTime() : run.GetAdjustedCPUTime());
        }
    }

    void PrintRatios(std::span<const Goal> goals) const {
        std::printf("\n%-28s %12s %12s %7s %7s\n", "work", "libdvs ns", "floor ns", "ratio", "goal");
        for (const Goal &goal : goals) {
            const auto found = best_.find(goal.work);
            if (found == best_.end() || !found->second.contains("dvs") || !found->second.contains("floor"))
                continue;
            const double dvs = found->second.at("dvs"), floor = found->second.at("floor");
            const bool reached = dvs <= goal.atMost * floor;
            std::printf("%-28s %12.1f %12.1f %7.2f %7.2f%s\n", goal.work, dvs, floor, dvs / floor,
                        goal.atMost, reached ? "" : "  above");
        }
    }

private:
    static constexpr double kNone = std::numeric_limits<double>::max();
    std::map<std::string, std::map<std::string, double>> best_;
};

inline int Main(int argc, char **argv, std::span<const Goal> goals) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;
    Reporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    reporter.PrintRatios(goals);
    return 0;
}

} // namespace ratio

#endif
