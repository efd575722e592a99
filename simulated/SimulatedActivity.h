#pragma once

#include <deque>
#include <memory>
#include <string>
#include <vector>

#include "roles/Work.h"

namespace tarn {

class SimulatedActivity;
class SimulatedScheduler;

/// A queue as the scheduler sees it. Free while nobody holds it.
struct SimulatedLane {
    /// Work to be run, or an activity that waits for its turn in sync().
    struct Entry {
        Work work;
        SimulatedActivity* turn;
    };

    std::string label;
    std::deque<Entry> line;
    SimulatedActivity* holder = nullptr;
};

/// A stack that the scheduler can leave and come back to.
class SimulatedActivity {
public:
    /// The stack of the caller.
    SimulatedActivity();

    /// A stack of its own, for the work of lanes. It begins when it is switched to.
    explicit SimulatedActivity(SimulatedScheduler& scheduler);

    /// It must not be inside any lane.
    ~SimulatedActivity();

    /// Goes on with `next` where that was left; returns when something switches back to this one, which is
    /// the running one.
    void switchTo(SimulatedActivity& next);

    /// The lanes whose work it is in, innermost last.
    std::vector<const SimulatedLane*> inside;

    /// The lane for whose turn it waits.
    const SimulatedLane* waitsFor = nullptr;

    /// For a spare activity: the lane to begin with.
    std::shared_ptr<SimulatedLane> first;

private:
    struct Stack;

    static void begin(unsigned high, unsigned low);
    [[noreturn]] void run();

    SimulatedScheduler* const scheduler_;
    const std::unique_ptr<Stack> stack_;
};

} // namespace tarn
