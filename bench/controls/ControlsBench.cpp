// What the media controls cost and how fast they answer, on a bus of their own.

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "bench/controls/BusClient.h"
#include "platform/linux/controls/LinuxMediaControls.h"
#include "tests/system/controls/BusListener.h"
#include "tests/system/controls/FakePlayer.h"
#include "tests/system/controls/PrivateBus.h"

namespace tarn {
namespace {

using Microseconds = BusClient::Microseconds;
using std::chrono::steady_clock;

constexpr int samples = 2000;

NowPlayingInfo track(int number, float rate) {
    return {.title = "Track " + std::to_string(number),
            .duration = 180.0,
            .elapsedTime = 0.0,
            .playbackRate = rate,
            .artist = "Someone",
            .albumTitle = "Songs"};
}

std::vector<double> sorted(const std::function<Microseconds()>& measure, int count) {
    std::vector<double> times;
    times.reserve(static_cast<std::size_t>(count));
    for (int sample = 0; sample < count; ++sample)
        times.push_back(measure().count());
    std::sort(times.begin(), times.end());
    return times;
}

double median(const std::vector<double>& times) { return times[times.size() / 2]; }
double nearlyAll(const std::vector<double>& times) { return times[times.size() * 99 / 100]; }

/// How often the threads of the controls have waited so far.
long waits() {
    long result = 0;
    for (const auto& task : std::filesystem::directory_iterator("/proc/self/task")) {
        std::ifstream status(task.path() / "status");
        std::string key;
        std::string name;
        status >> key >> name;
        if (name != "bus" && name != "remote")
            continue;
        while (status >> key)
            if (long count = 0; key == "voluntary_ctxt_switches:" && status >> count)
                result += count;
    }
    return result;
}

class Bench {
public:
    int run() {
        publish(1, 1);
        player_ = std::make_unique<FakePlayer>(controls_.remoteCommands());
        if (!listener_.waitForPlayer())
            return fail("the player does not appear");
        compareReads("while it plays");
        player_->hold();
        listener_.begin("Play");
        if (!player_->waitForCommands(1))
            return fail("the play command does not arrive");
        compareReads("while an activation is pending");
        player_->letGo();
        if (!listener_.answer(std::chrono::seconds(10)))
            return fail("the play command is not answered");
        countMessages();
        timePublications();
        return timeReturns();
    }

private:
    static int fail(const char* what) {
        std::fprintf(stderr, "bench_controls: %s\n", what);
        return 1;
    }

    void publish(int number, float rate) {
        controls_.setNowPlayingInfo(NowPlayingService::Origin::local, track(number, rate),
                                    NowPlayingService::mergePolicyReplace);
    }

    void compareReads(const char* when) {
        const auto pings = sorted([this] { return client_.pingPlayer(); }, samples);
        const auto position = sorted([this] { return client_.readPosition(); }, samples);
        const auto all = sorted([this] { return client_.readAllOfPlayer(); }, samples);
        std::printf("%s (median, 99th percentile, slowest; us):\n", when);
        const auto line = [&](const char* what, const std::vector<double>& times) {
            std::printf("  %-24s %8.0f %8.0f %8.0f   %.2f times a ping\n", what, median(times),
                        nearlyAll(times), times.back(), median(times) / median(pings));
        };
        line("ping", pings);
        line("read Position", position);
        line("read all of Player", all);
    }

    void countMessages() {
        constexpr std::chrono::seconds period(10);
        while (listener_.next(std::chrono::milliseconds(100))) {
        }
        const long before = waits();
        int messages = 0;
        const auto end = steady_clock::now() + period;
        while (steady_clock::now() < end)
            if (listener_.next(
                    std::chrono::duration_cast<std::chrono::milliseconds>(end - steady_clock::now())))
                ++messages;
        std::printf("playing for %d s: %d messages on the bus, %ld wake-ups of the controls\n",
                    static_cast<int>(period.count()), messages, waits() - before);
    }

    void timePublications() {
        int number = 1;
        const auto times = sorted(
            [&] {
                const auto begin = steady_clock::now();
                publish(++number, 1);
                return Microseconds(steady_clock::now() - begin);
            },
            samples);
        std::printf("publishing, on the publishing thread: median %.2f us, 99th percentile %.2f us\n",
                    median(times), nearlyAll(times));
    }

    int timeReturns() {
        constexpr int rounds = 20;
        std::vector<double> times;
        times.reserve(rounds);
        for (int round = 0; round < rounds; ++round)
            times.push_back(timeReturn(std::chrono::seconds(0)));
        std::sort(times.begin(), times.end());
        std::printf(
            "from the return of the bus to the player on it: median %.0f us, slowest of %zu %.0f us\n",
            median(times), times.size(), times.back());
        const long before = waits();
        const double later = timeReturn(std::chrono::seconds(10));
        std::printf("the same when it was gone for 10 s: %.0f us, %ld wake-ups of the controls\n", later,
                    waits() - before);
        return times.back() < 2e6 && later < 2e6 ? 0 : fail("the player came back too late");
    }

    double timeReturn(std::chrono::seconds outage) {
        bus_.kill();
        std::this_thread::sleep_for(outage);
        bus_.start();
        const auto begin = steady_clock::now();
        BusListener listener(bus_.address());
        static_cast<void>(listener.waitForPlayer());
        return Microseconds(steady_clock::now() - begin).count();
    }

    PrivateBus bus_;
    LinuxMediaControls controls_{[](const std::string&) { return std::nullopt; }, {bus_.address(), ""}};
    std::unique_ptr<FakePlayer> player_;
    BusListener listener_{bus_.address()};
    BusClient client_{bus_.address()};
};

} // namespace
} // namespace tarn

int main() { return tarn::Bench().run(); }
