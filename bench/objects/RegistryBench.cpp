// Lookups among 20,000 mirrored tracks against the same among 20, and the memory of a track. Twenty tracks
// are in every cache; so the 20,000 are looked up in two ways, twenty of them again and again, and all in
// turn. What the memory costs alone in the latter is shown by bare maps of the standard library with the same
// keys, in the same order, amid as many other things as the tracks are.

#include <benchmark/benchmark.h>

#include <cstdio>

#include "bench/objects/Tracks.h"
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

template <class Lookup, class BareLookup>
void registerLookup(const std::string& name, Lookup lookup, BareLookup bareLookup) {
    auto add = [&](const std::string& side, std::size_t count, std::size_t distinct, auto lookupOfSide) {
        benchmark::RegisterBenchmark((name + side).c_str(), [=](benchmark::State& state) {
            lookUp(state, count, distinct, lookupOfSide);
        });
    };
    add("/tarn", many, few, lookup);
    add("/20 tracks", few, few, lookup);
    add(" (all)/tarn", many, many, lookup);
    add(" (all)/20 tracks", few, few, lookup);
    add(" (all)/bare map", many, many, bareLookup);
}

template <class Map, class Key>
auto lookUpIn(const MutexProtected<Map>& bareMap, const Key& key) {
    return bareMap.withLocked([&](const Map& map) { return map.find(key)->second; });
}

auto objectByName(const Tracks& all, std::size_t track) {
    return lookUpIn(all.bareMaps().objectOfName, *all.name(track));
}

void registerLookups() {
    registerLookup(
        "asset by id",
        [](const Tracks& all, std::size_t track) {
            return all.assets().assetWithIdentifier(all.name(track));
        },
        objectByName);
    registerLookup(
        "record by asset",
        [](const Tracks& all, std::size_t track) { return all.assets().vlAssetWithAsset(all.asset(track)); },
        [](const Tracks& all, std::size_t track) {
            return lookUpIn(all.bareMaps().objectOfAddress, all.asset(track));
        });
    registerLookup(
        "item by id",
        [](const Tracks& all, std::size_t track) {
            return all.items().playerItemWithIdentifier(all.name(track));
        },
        objectByName);
    registerLookup(
        "id by item",
        [](const Tracks& all, std::size_t track) {
            return all.items().identifierForPlayerItem(all.item(track));
        },
        [](const Tracks& all, std::size_t track) {
            return lookUpIn(all.bareMaps().nameOfAddress, all.item(track));
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
