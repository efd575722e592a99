// What the media controls cost and how fast they answer, on a bus of their own.

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "bench/controls/BusClient.h"
#include "bench/controls/BusListener.h"
#include "bench/controls/DeafBus.h"
#include "controls/BusAddress.h"
#include "controls/LinuxMediaControls.h"
#include "controls/applications/DesktopApplicationRegistry.h"
#include "tests/controls/FakePlayer.h"
#include "tests/support/CapturedLog.h"
#include "tests/support/TemporaryFolder.h"
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

/// How long things took, in microseconds.
class Times {
public:
    void add(Microseconds time) { times_.push_back(time.count()); }
    void sort() { std::ranges::sort(times_); }

    // Once sorted.
    double median() const { return times_[times_.size() / 2]; }
    double nearlyAll() const { return times_[times_.size() * 99 / 100]; }
    double slowest() const { return times_.back(); }

private:
    std::vector<double> times_;
};

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
        player_ =
            FakePlayer::make(controls_.remoteCommands(), {.rate = 1, .item = std::make_shared<FakeItem>()});
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
        if (countMessages() > 0)
            return fail("the controls speak without need");
        timePublications();
        timeLookups();
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

    /// One after the other in turn, so that all of them meet the same machine.
    void compareReads(const char* when) {
        Times pings;
        Times positions;
        Times all;
        const long before = waits();
        for (int sample = 0; sample < samples; ++sample) {
            pings.add(client_.pingPlayer());
            positions.add(client_.readPosition());
            all.add(client_.readAllOfPlayer());
        }
        const double waitsPerCall = static_cast<double>(waits() - before) / (3.0 * samples);
        std::printf("%s (median, 99th percentile, slowest; us; goal 1000 and 5000 at most):\n", when);
        for (Times* times : {&pings, &positions, &all})
            times->sort();
        const auto line = [&](const char* what, const Times& times) {
            std::printf("  %-24s %8.0f %8.0f %8.0f   %.2f, %.2f and %.2f times a ping\n", what,
                        times.median(), times.nearlyAll(), times.slowest(), times.median() / pings.median(),
                        times.nearlyAll() / pings.nearlyAll(), times.slowest() / pings.slowest());
        };
        line("ping", pings);
        line("read Position", positions);
        line("read all of Player", all);
        std::printf("  the controls wait %.2f times a call: for the call itself\n", waitsPerCall);
    }

    int countMessages() {
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
        std::printf("playing for %d s: %d messages on the bus (goal 0), %ld wake-ups of the controls\n",
                    static_cast<int>(period.count()), messages, waits() - before);
        return messages;
    }

    void timePublications() {
        Times times;
        for (int number = 2; number < samples + 2; ++number) {
            const auto begin = steady_clock::now();
            publish(number, 1);
            times.add(steady_clock::now() - begin);
        }
        times.sort();
        std::printf("publishing, on the publishing thread: median %.2f us, 99th percentile %.2f us\n",
                    times.median(), times.nearlyAll());
    }

    /// Of the application that an extension belongs to, among a desktop's usual number of them.
    static void timeLookups() {
        constexpr int applications = 300;
        const TemporaryFolder folder;
        for (int number = 0; number < applications; ++number)
            folder.write("applications/org.example.Application" + std::to_string(number) + ".desktop",
                         "[Desktop Entry]\nType=Application\nName=Application\n");
        DesktopApplicationRegistry registry({folder.path()}, {"de", "en"});
        const auto lookUp = [&] {
            const auto begin = steady_clock::now();
            static_cast<void>(registry.applicationContainingExtension("org.example.Application7.Watch"));
            return Microseconds(steady_clock::now() - begin);
        };
        const Microseconds reading = lookUp();
        Times times;
        for (int sample = 0; sample < samples; ++sample)
            times.add(lookUp());
        times.sort();
        std::printf(
            "looking up one of %d applications: median %.1f us, 99th percentile %.1f us; the first time, "
            "which reads them, %.0f us\n",
            applications, times.median(), times.nearlyAll(), reading.count());
    }

    int timeReturns() {
        constexpr int rounds = 20;
        Times times;
        for (int round = 0; round < rounds; ++round) {
            bus_.kill();
            times.add(timeReturn());
        }
        times.sort();
        std::printf("from the return of the bus to the player on it: median %.0f us, slowest of %d %.0f us\n",
                    times.median(), rounds, times.slowest());
        bus_.kill();
        if (!outlastQuickTries())
            return fail("the controls do not look for the bus");
        const Microseconds later = timeReturn();
        std::printf("the same when it was gone for longer than they try often: %.0f us\n", later.count());
        return times.slowest() < 2e6 && later.count() < 2e6 ? 0 : fail("the player came back too late");
    }

    /// Waits until only the socket of the bus, or a minute, will make the controls try again.
    bool outlastQuickTries() {
        constexpr int quickTries = 8; // each twice as late as the one before, up to a second
        DeafBus deaf(*busSocketPath(bus_.address()));
        for (int tried = 0; tried < quickTries; ++tried)
            if (!deaf.refuseOne())
                return false;
        return true;
    }

    Microseconds timeReturn() {
        bus_.start();
        const auto begin = steady_clock::now();
        BusListener listener(bus_.address());
        static_cast<void>(listener.waitForPlayer());
        return steady_clock::now() - begin;
    }

    const CapturedLog log_; // keeps the losses of the bus off the report
    PrivateBus bus_;
    LinuxMediaControls controls_{[](const std::string&) { return std::nullopt; }, {bus_.address(), ""}};
    std::shared_ptr<FakePlayer> player_;
    BusListener listener_{bus_.address()};
    BusClient client_{bus_.address()};
};

} // namespace
} // namespace tarn

int main() { return tarn::Bench().run(); }
