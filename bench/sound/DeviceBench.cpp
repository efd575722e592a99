// The service among a sound server and a session bus: how fast it steps aside for a call and comes back, and
// what its media controls cost it while it plays and while it is paused.

#include <algorithm>
#include <cstdio>
#include <exception>
#include <functional>
#include <thread>

#include <tarn/Client.h>

#include "bench/controls/BusListener.h"
#include "bench/controls/RunningService.h"
#include "bench/sound/Hearing.h"
#include "bench/sound/PulseThread.h"
#include "bench/support/ProcessUsage.h"
#include "tests/support/AudioFixture.h"
#include "tests/system/controls/PrivateBus.h"
#include "tests/system/sound/SoundServerProcess.h"

namespace tarn {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;

constexpr int calls = 20;
constexpr seconds period(10);
constexpr char player[] = "player,org.example.MusicBox";

double toMilliseconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double, std::milli>(time).count();
}

/// How long things took, in milliseconds.
class Times {
public:
    void add(std::chrono::nanoseconds time) {
        times_.insert(std::ranges::upper_bound(times_, toMilliseconds(time)), toMilliseconds(time));
    }

    double median() const { return times_[times_.size() / 2]; }
    double slowest() const { return times_.back(); }

private:
    std::vector<double> times_;
};

struct CallTimes {
    Times toSilence;
    Times toSound;
};

/// A service with a client and a long track.
class PlayingService {
public:
    PlayingService(std::vector<std::string> environment, const std::string& program,
                   const std::filesystem::path& track)
        : service_(std::move(environment), program) {
        finish(client_.upsertAsset({.identifier = "asset", .URL = client::fileURL(track), .title = "Track"}));
        finish(client_.upsertItem("item", "asset"));
        finish(client_.upsertQueuePlayer(player, {"item"}));
    }

    void setRate(float rate) { finish(client_.setRate(player, rate)); }
    ProcessUsage usage() const { return ProcessUsage(service_.pid()); }

private:
    template <class Future>
    static void finish(Future future) {
        if (future.wait_for(seconds(20)) != std::future_status::ready)
            throw std::runtime_error("the service does not answer");
        future.get();
    }

    RunningService service_;
    client::Client client_{{.socketPath = service_.socketPath()}};
};

class Bench {
public:
    void run() {
        PlayingService full(environment(), TARND, track_);
        if (!listener_.waitForPlayer())
            throw std::runtime_error("the player does not appear");
        timeCalls(full);
        PlayingService bare(environment(), BARE_SERVICE, track_);
        compareCosts(full, bare);
    }

private:
    std::vector<std::string> environment() const {
        std::vector<std::string> result = sound_.environment();
        result.push_back(bus_.environment());
        return result;
    }

    /// Beside a stream that does nothing but obey the server.
    void timeCalls(PlayingService& service) {
        service.setRate(1);
        const CallTimes ours = callTimes();
        service.setRate(0);
        hearing_.waitFor(false);
        const PulsePlayer music(pulse_, PulsePlayer::Kind::music);
        const CallTimes floor = callTimes();
        const auto report = [](const char* what, const Times& times, const Times& least, int goal) {
            std::printf("%-36s %8.1f %8.1f   %8.1f %8.1f   goal %d ms  %s\n", what, times.median(),
                        times.slowest(), least.median(), least.slowest(), goal,
                        times.slowest() <= goal ? "reached" : "MISSED");
        };
        std::printf("%d calls (median, slowest; ms)            tarnd               a bare stream\n", calls);
        report("from asking for its stream to silence", ours.toSilence, floor.toSilence, 200);
        report("from its end to sound", ours.toSound, floor.toSound, 300);
    }

    CallTimes callTimes() {
        CallTimes times;
        hearing_.waitFor(true);
        for (int round = 0; round < calls; ++round) {
            auto begin = std::chrono::steady_clock::now();
            auto call = std::make_unique<PulsePlayer>(pulse_, PulsePlayer::Kind::call);
            times.toSilence.add(hearing_.waitFor(false) - begin);
            begin = std::chrono::steady_clock::now();
            call.reset();
            times.toSound.add(hearing_.waitFor(true) - begin);
        }
        return times;
    }

    /// At the same time, so that both meet the same machine.
    void compareCosts(PlayingService& full, PlayingService& bare) {
        std::printf("in %d s, with the media controls and without:\n", static_cast<int>(period.count()));
        for (const float rate : {1.0F, 0.0F}) {
            full.setRate(rate);
            bare.setRate(rate);
            hearing_.waitFor(rate != 0);
            countMessages(seconds(3)); // until the buffers are as full as they stay
            const ProcessUsage fullBefore = full.usage();
            const ProcessUsage bareBefore = bare.usage();
            const int messages = countMessages(period);
            const ProcessUsage fullAfter = full.usage();
            const ProcessUsage bareAfter = bare.usage();
            std::printf(
                "  %-8s CPU %6.1f and %6.1f ms, context switches %4ld and %4ld, threads %ld and %ld, own "
                "memory %ld and %ld KiB, memory %ld and %ld KiB (%+ld, goal +2048), bus messages %d "
                "(goal 0)\n",
                rate == 0 ? "paused" : "playing", toMilliseconds(fullAfter.cpu - fullBefore.cpu),
                toMilliseconds(bareAfter.cpu - bareBefore.cpu), fullAfter.waits - fullBefore.waits,
                bareAfter.waits - bareBefore.waits, fullAfter.threads, bareAfter.threads, fullAfter.ownMemory,
                bareAfter.ownMemory, fullAfter.memory, bareAfter.memory, fullAfter.memory - bareAfter.memory,
                messages);
        }
    }

    int countMessages(seconds duration) {
        const auto end = std::chrono::steady_clock::now() + duration;
        int messages = 0;
        for (auto left = milliseconds(duration); left > milliseconds(0);
             left = std::chrono::duration_cast<milliseconds>(end - std::chrono::steady_clock::now()))
            messages += listener_.next(left) ? 1 : 0;
        return messages;
    }

    std::filesystem::path makeTrack() const {
        writeWav(folder_ / "track.wav", makeSweep(std::size_t{180} * 44'100, 44'100, 2));
        return folder_ / "track.wav";
    }

    TemporaryFolder folder_;
    const std::filesystem::path track_ = makeTrack();
    SoundServerProcess sound_{{"module-role-cork"}};
    PrivateBus bus_;
    BusListener listener_{bus_.address()};
    Hearing hearing_;
    PulseThread pulse_;
};

} // namespace
} // namespace tarn

int main() {
    try {
        tarn::Bench().run();
        return 0;
    } catch (const std::exception& failure) {
        std::fprintf(stderr, "bench_device: %s\n", failure.what());
        return 1;
    }
}
