#pragma once

#include <deque>
#include <functional>
#include <memory>
#include <semaphore>
#include <string>
#include <thread>
#include <vector>

namespace tarn {

class SimulatedActivity;
class SimulatedScheduler;

/// A queue as the scheduler sees it. Free while nobody holds it.
struct SimulatedLane {
    /// Work to be run, or an activity that waits for its turn in sync().
    struct Entry {
        std::function<void()> work;
        SimulatedActivity* turn;
    };

    std::string label;
    std::deque<Entry> line;
    SimulatedActivity* holder = nullptr;
};

/// A stack that the scheduler can leave and come back to. Runs only while it has the baton, which is passed
/// from one to the next.
class SimulatedActivity {
public:
    /// The stack of the calling thread, which has the baton.
    SimulatedActivity() = default;

    /// A stack of its own, for the work of lanes.
    explicit SimulatedActivity(SimulatedScheduler& scheduler);

    /// It must not be inside any lane.
    ~SimulatedActivity();

    void giveBaton() { baton_.release(); }
    void awaitBaton() { baton_.acquire(); }

    /// The lanes whose work it is in, innermost last.
    std::vector<const SimulatedLane*> inside;

    /// The lane for whose turn it waits.
    const SimulatedLane* waitsFor = nullptr;

    /// For a spare activity: the lane to begin with; none ends it.
    std::shared_ptr<SimulatedLane> first;

private:
    void run(SimulatedScheduler& scheduler);

    std::binary_semaphore baton_{0};
    std::thread thread_;
};

} // namespace tarn
