// Lookups among 20,000 mirrored tracks against the same among 20, and the memory of a track. Twenty tracks
// are in every cache; so the 20,000 are looked up in two ways, twenty of them again and again, and all in
// turn.

#include <benchmark/benchmark.h>

#include <cstdio>

#include "bench/registry/Tracks.h"
#include "bench/support/Comparison.h"

namespace tarn {
namespace {

constexpr std::size_t few = 20;
constexpr std::size_t many = 20'000;

const Tracks& tracks(std::size_t count) {
    static const Tracks small(few);
    static const Tracks large(many);
    return count == few ? small : large;
}

/// Looks up `distinct` tracks in turn, in no order of the memory.
template <class Lookup>
void lookUp(benchmark::State& state, std::size_t count, std::size_t distinct, Lookup lookup) {
    const Tracks& all = tracks(count);
    std::size_t track = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(lookup(all, track * (count / distinct)));
        track = (track + 7919) % distinct;
    }
}

template <class Lookup>
void registerLookup(const std::string& name, Lookup lookup) {
    auto add = [&](const std::string& side, std::size_t count, std::size_t distinct) {
        benchmark::RegisterBenchmark(
            (name + side).c_str(), [=](benchmark::State& state) { lookUp(state, count, distinct, lookup); });
    };
    add("/tarn", many, few);
    add("/20 tracks", few, few);
    add(" (all)/tarn", many, many);
    add(" (all)/20 tracks", few, few);
}

void registerLookups() {
    registerLookup("asset by id", [](const Tracks& all, std::size_t track) {
        return all.assets().assetWithIdentifier(all.name(track));
    });
    registerLookup("record by asset", [](const Tracks& all, std::size_t track) {
        return all.assets().vlAssetWithAsset(all.asset(track));
    });
    registerLookup("item by id", [](const Tracks& all, std::size_t track) {
        return all.items().playerItemWithIdentifier(all.name(track));
    });
    registerLookup("id by item", [](const Tracks& all, std::size_t track) {
        return all.items().identifierForPlayerItem(all.item(track));
    });
}

} // namespace
} // namespace tarn

int main(int argc, char** argv) {
    double bytes = tarn::tracks(tarn::many).bytesPerTrack();
    std::printf("memory of a track: %.0f bytes  goal at most 2048  %s\n", bytes,
                bytes <= 2048 ? "reached" : "MISSED");
    tarn::registerLookups();
    static constexpr tarn::Goal goals[] = {
        {"asset by id", 0.8}, {"record by asset", 0.8}, {"item by id", 0.8}, {"id by item", 0.8}};
    return tarn::compareWithPeers(argc, argv, goals);
}
