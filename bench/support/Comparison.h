#pragma once

#include <span>
#include <string_view>

namespace tarn {

/// What a comparison is to show: how many times as fast as the peer at least.
struct Goal {
    std::string_view measure;
    double ratio;
};

/// The main() of a benchmark program that compares: runs its Google Benchmark benchmarks, named
/// "<measure>/tarn" and "<measure>/<peer>", several times in a random order, and prints one line a measure
/// with the ratio of the medians of their processor times beside its goal. Returns the exit status.
int compareWithPeers(int argc, char** argv, std::span<const Goal> goals);

} // namespace tarn
