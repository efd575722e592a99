#include "bench/support/Comparison.h"

#include <algorithm>
#include <cstdio>
#include <map>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

namespace tarn {

namespace {

/// Collects what every repetition took, by measure and side.
class Collector final : public benchmark::BenchmarkReporter {
public:
    bool ReportContext(const Context&) override { return true; }

    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            if (run.run_type != Run::RT_Iteration)
                continue;
            const std::string& name = run.run_name.function_name;
            const auto slash = name.find('/');
            times_[name.substr(0, slash)][name.substr(slash + 1)].push_back(run.GetAdjustedCPUTime());
        }
    }

    double median(const std::string& measure, const std::string& side) {
        auto& times = times_.at(measure).at(side);
        std::ranges::sort(times);
        return times[times.size() / 2];
    }

    const auto& measures() const { return times_; }

private:
    std::map<std::string, std::map<std::string, std::vector<double>>> times_;
};

void printRow(Collector& collector, const std::string& measure, const std::string& peer,
              std::span<const Goal> goals) {
    const double ours = collector.median(measure, "tarn");
    const double theirs = collector.median(measure, peer);
    std::printf("%-16s %12.1f %12.1f  %6.2f x", measure.c_str(), ours, theirs, theirs / ours);
    const auto goal = std::ranges::find(goals, std::string_view(measure), &Goal::measure);
    if (goal != goals.end())
        std::printf("  goal %.1f x  %s", goal->ratio, theirs / ours >= goal->ratio ? "reached" : "MISSED");
    std::printf("  (%s)\n", peer.c_str());
}

} // namespace

int compareWithPeers(int argc, char** argv, std::span<const Goal> goals) {
    std::vector<std::string> defaults{argv[0], "--benchmark_repetitions=15", "--benchmark_min_time=0.02",
                                      "--benchmark_enable_random_interleaving=true"};
    std::vector<char*> arguments;
    arguments.reserve(defaults.size());
    for (auto& argument : defaults)
        arguments.push_back(argument.data());
    arguments.insert(arguments.end(), argv + 1, argv + argc); // what the caller says wins
    int count = static_cast<int>(arguments.size());
    benchmark::Initialize(&count, arguments.data());
    if (benchmark::ReportUnrecognizedArguments(count, arguments.data()))
        return 2;

    Collector collector;
    benchmark::RunSpecifiedBenchmarks(&collector);
    std::printf("%-16s %12s %12s  %8s\n", "measure", "tarn, ns", "peer, ns", "ratio");
    for (const auto& [measure, sides] : collector.measures()) {
        for (const auto& [side, times] : sides) {
            if (side != "tarn")
                printRow(collector, measure, side, goals);
        }
    }
    return 0;
}

} // namespace tarn
