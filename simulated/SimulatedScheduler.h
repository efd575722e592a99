#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "roles/Registration.h"
#include "roles/Work.h"
#include "simulated/SimulatedActivity.h"

namespace tarn {

class SimulatedActivity;
class SimulatedQueue;
struct SimulatedLane;

/// Runs everything that would be many threads one piece at a time, on virtual time.
///
/// Queues and platform threads are both a SimulatedQueue. Where work submits or waits, the scheduler may
/// leave it and go on with other work, as the seed has it; so a seed is one interleaving, and the same seed
/// is the same one again. Time stands still while anything can run, and then jumps to the next timer or
/// deadline. Queues that wait for each other in a circle end the process with a report.
///
/// Work that is left keeps a stack of its own. There is one thread, that of the test: nothing races, and a
/// loaded machine does not slow it down.
class SimulatedScheduler {
public:
    using Time = std::chrono::nanoseconds;

    explicit SimulatedScheduler(std::uint64_t seed);

    /// Runs what is left, as runUntilIdle().
    ~SimulatedScheduler();
    SimulatedScheduler(const SimulatedScheduler&) = delete;
    SimulatedScheduler& operator=(const SimulatedScheduler&) = delete;

    /// A serial queue, or a platform thread that delivers callbacks.
    std::shared_ptr<SimulatedQueue> createQueue(std::string label);

    /// Submits `work` to `queue` when it is `time`; not any more once the registration is gone, and then
    /// `work` does not run even if it was submitted.
    [[nodiscard]] RegistrationHandle at(Time time, const std::shared_ptr<SimulatedQueue>& queue,
                                        std::function<void()> work);

    Time now() const { return now_; }

    /// For the test: runs all that can run before time moves.
    void runReady() { runUntil(now_); }

    /// For the test: runs all that happens in the next `duration`.
    void advance(Time duration) { runUntil(now_ + duration); }

    /// For the test: runs until nothing is left, moving time as far as needed.
    void runUntilIdle() { runUntil(Time::max()); }

    /// A number below `limit` that the seed chooses.
    std::size_t random(std::size_t limit);

    /// For work: perhaps goes on with other work first. Roles that stand for other threads call it where
    /// these could come between.
    void yieldPoint();

private:
    friend class SimulatedActivity;
    friend class SimulatedQueue;
    friend class SimulatedSignal;
    using Lane = std::shared_ptr<SimulatedLane>;

    /// Is called when its time has come, from within the scheduler: it only makes something runnable.
    using Timer = std::function<void()>;

    /// What runs next: the first work of a lane, or an activity that was left.
    struct Choice {
        Lane lane;
        SimulatedActivity* activity;
    };

    /// yieldPoint() yields once in so many calls.
    static constexpr std::size_t yieldOneIn = 8;

    void runUntil(Time limit);
    Choice choose();
    bool moveTime();
    void leave();
    void wake(SimulatedActivity& activity);
    SimulatedActivity& spareActivity();
    std::shared_ptr<Timer> addTimer(Time time, Timer fire);

    void submit(const Lane& lane, Work work);
    void takeTurn(const Lane& lane);
    void giveUp(const Lane& lane);
    void runFirst(const Lane& lane);

    template <class Callable>
    void runInside(const Lane& lane, Callable& work) noexcept {
        current_->inside.push_back(lane.get());
        work();
        current_->inside.pop_back();
    }

    std::mt19937_64 engine_;
    Time now_{0};
    Time limit_{0};          // how far time may move for runUntil()
    bool testIdles_ = false; // in runUntil(): goes on when nothing else can
    std::vector<Lane> runnable_;
    std::vector<SimulatedActivity*> ready_;
    std::multimap<Time, std::weak_ptr<Timer>> timers_;
    std::vector<std::unique_ptr<SimulatedActivity>> activities_; // the first is the test's
    std::vector<SimulatedActivity*> spare_;
    SimulatedActivity* current_;
};

} // namespace tarn
