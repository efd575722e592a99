// What is left behind by 10,000 changes of track and by a day of playing with a command a second, on virtual
// time. Ends with 1 when it is more than it may be.

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <string>

#include "simulated/SimulatedPlatform.h"
#include "threads/LiveObjects.h"

namespace tarn {
namespace {

using namespace std::chrono_literals;

constexpr long allowedKiB = 1024;

long anonymousKiB() {
    std::ifstream status("/proc/self/status");
    for (std::string key; status >> key;)
        if (long size = 0; key == "RssAnon:" && status >> size)
            return size;
    return 0;
}

long entries(const char* folder) {
    return static_cast<long>(std::distance(std::filesystem::directory_iterator(folder), {}));
}

struct Usage {
    long memory = anonymousKiB();
    long threads = entries("/proc/self/task");
    long files = entries("/proc/self/fd");
    std::map<std::string, std::int64_t> objects = LiveObjects::counts();
};

/// Prints how `part` has changed the process since `before`; false when that is too much.
bool compare(const char* part, const Usage& before) {
    Usage now;
    std::int64_t objects = 0;
    for (const auto& [kind, count] : now.objects)
        objects += count - (before.objects.contains(kind) ? before.objects.at(kind) : 0);
    long memory = now.memory - before.memory;
    std::printf("%-40s memory %+ld KiB (at most %+ld), threads %+ld, files %+ld, objects %+ld\n", part,
                memory, allowedKiB, now.threads - before.threads, now.files - before.files,
                static_cast<long>(objects));
    return memory <= allowedKiB && now.threads == before.threads && now.files == before.files && objects == 0;
}

std::shared_ptr<MediaItem> makeItem(SimulatedPlatform& platform) {
    return platform.media.makeItem(platform.media.openAsset("file").asset);
}

/// A queue of three that is fed as it goes, by items that end and by a listener who skips.
void changeTracks(SimulatedPlatform& platform, int changes) {
    auto player = platform.media.makeQueuePlayer({makeItem(platform), makeItem(platform)});
    for (int change = 0; change < changes; ++change) {
        player->insertItem(makeItem(platform), nullptr);
        player->play();
        if (change % 3 == 0)
            player->advanceToNextItem();
        platform.scheduler.advance(60s);
    }
}

void playForHours(SimulatedPlatform& platform, int hours) {
    static constexpr float rates[] = {1.0F, 1.5F, 2.0F, -0.5F, 1.0F};
    auto player = platform.media.makeQueuePlayer({makeItem(platform)});
    for (int second = 0; second < hours * 3600; ++second) {
        if (!player->currentItem())
            player->insertItem(makeItem(platform), nullptr);
        player->setRate(rates[second / 7 % 5]);
        if (second % 61 == 0)
            player->currentItem()->seekToTime({second % 60, 1});
        platform.scheduler.advance(1s);
    }
}

bool soak() {
    SimulatedPlatform platform(1);
    platform.media.addFile("file");
    changeTracks(platform, 300); // so that what is made once is there
    playForHours(platform, 1);
    platform.scheduler.runReady();
    bool good = true;
    Usage before;
    changeTracks(platform, 10'000);
    platform.scheduler.runReady();
    good &= compare("10,000 changes of track", before);
    before = {};
    playForHours(platform, 24);
    platform.scheduler.runReady();
    good &= compare("24 hours with a command a second", before);
    return good;
}

} // namespace
} // namespace tarn

int main() { return tarn::soak() ? 0 : 1; }
