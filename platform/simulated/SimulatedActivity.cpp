#include "platform/simulated/SimulatedActivity.h"

#include <utility>

#include "platform/simulated/SimulatedScheduler.h"

namespace tarn {

SimulatedActivity::SimulatedActivity(SimulatedScheduler& scheduler)
    : thread_([this, &scheduler] { run(scheduler); }) {}

SimulatedActivity::~SimulatedActivity() {
    if (!thread_.joinable())
        return;
    first = nullptr;
    giveBaton();
    thread_.join();
}

void SimulatedActivity::run(SimulatedScheduler& scheduler) {
    for (;;) {
        awaitBaton();
        SimulatedScheduler::Choice next{std::exchange(first, nullptr), nullptr};
        if (next.lane == nullptr)
            return;
        // Fresh work runs on this stack as well; only work that was left needs another.
        while (next.lane != nullptr) {
            scheduler.runFirst(next.lane);
            next = scheduler.choose();
        }
        scheduler.spare_.push_back(this);
        scheduler.current_ = next.activity;
        next.activity->giveBaton();
    }
}

} // namespace tarn
