#pragma once

#include <atomic>
#include <functional>
#include <memory>
#include <optional>
#include <thread>

#include "controls/RemoteTargets.h"
#include "service/LongFormAudioServer.h"
#include "simulated/SimulatedClient.h"
#include "simulated/SimulatedPlatform.h"
#include "threads/SteadyClock.h"
#include "threads/WorkerQueues.h"

namespace tarn {

/// The service on the scheduler: a seed is one interleaving.
class SimulatedWorld {
public:
#ifdef __SANITIZE_THREAD__
    static constexpr int rounds =
        50; // one thread at a time: the other world is what the thread sanitizer looks at
#else
    static constexpr int rounds = 1050; // of each of the ten stories
#endif

    explicit SimulatedWorld(std::uint64_t seed);
    ~SimulatedWorld();

    VLLongFormAudioServer& service() { return *service_; }
    SimulatedServiceListeners& listeners() { return platform_.listeners; }
    SimulatedNowPlayingService& nowPlaying() { return platform_.nowPlaying; }
    std::size_t random(std::size_t limit) { return platform_.scheduler.random(limit); }

    std::shared_ptr<SerialQueue> createQueue(const std::string& label) {
        return platform_.queues.create(label);
    }

    Clock& clock() { return platform_.clock; }

    /// Lets something happen; to be called until what the test waits for has.
    void progress() { settle(); }

    /// Lets part of what can happen now happen before the test goes on.
    void linger();

    /// Returns when all that was begun is done.
    void settle() { platform_.scheduler.runReady(); }

    /// Returns when what was sent has become commands of the command queue.
    void settleIntake();

private:
    SimulatedPlatform platform_;
    std::shared_ptr<VLLongFormAudioServer> service_;
};

/// The service on real threads, of which the system has only a few, with every role that it needs for
/// commands that find no object.
class ThreadedWorld {
public:
    static constexpr int rounds = 50;

    explicit ThreadedWorld(std::uint64_t seed);
    ~ThreadedWorld();

    VLLongFormAudioServer& service() { return *service_; }
    SimulatedServiceListeners& listeners() { return listeners_; }
    SimulatedNowPlayingService& nowPlaying() { return nowPlaying_; }
    std::size_t random(std::size_t limit) {
        return static_cast<std::size_t>((random_ += 0x9e3779b97f4a7c15u) / 257 % limit);
    }
    std::shared_ptr<SerialQueue> createQueue(const std::string& label) { return queues_.create(label); }
    Clock& clock() { return clock_; }
    void progress() { std::this_thread::yield(); }
    void linger();
    void settle();
    void settleIntake();

private:
    class NoMedia;
    class NoSession;

    std::atomic<std::uint64_t> random_;
    SteadyClock clock_;
    SimulatedLocalization localization_;
    LocalNotificationCenter notifications_;
    std::unique_ptr<MediaEngine> media_;
    std::unique_ptr<AudioSession> audioSession_;
    SimulatedSandboxExtension sandboxExtensions_;
    RemoteTargets remoteCommands_;
    SimulatedNowPlayingService nowPlaying_;
    SimulatedApplicationRegistry applications_;
    std::atomic<int> threadsLeft_; // of which one may be parked by a test
    WorkerQueues queues_;
    WorkerQueues IOThread_;
    SimulatedServiceListeners listeners_;
    std::shared_ptr<VLLongFormAudioServer> service_;
};

} // namespace tarn
