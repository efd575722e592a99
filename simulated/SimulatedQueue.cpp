#include "simulated/SimulatedQueue.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <utility>

#include "simulated/SimulatedActivity.h"
#include "simulated/SimulatedScheduler.h"

namespace tarn {

SimulatedQueue::SimulatedQueue(SimulatedScheduler& scheduler, std::string label)
    : scheduler_(scheduler), lane_(std::make_shared<SimulatedLane>()) {
    lane_->label = std::move(label);
}

void SimulatedQueue::async(Work work) {
    auto& scheduler = scheduler_; // the work may drop the last handle before this returns
    scheduler.submit(lane_, std::move(work));
    scheduler.yieldPoint();
}

void SimulatedQueue::sync(const std::function<void()>& work) {
    auto& scheduler = scheduler_;
    auto lane = lane_;
    const auto& inside = scheduler.current_->inside;
    if (std::find(inside.begin(), inside.end(), lane.get()) != inside.end()) {
        std::fprintf(stderr, "sync() on \"%s\" from work of that queue\n", lane->label.c_str());
        std::abort();
    }
    scheduler.yieldPoint();
    scheduler.takeTurn(lane);
    scheduler.runInside(lane, work);
    scheduler.giveUp(lane);
    scheduler.yieldPoint();
}

bool SimulatedQueue::isCurrent() const {
    const auto& inside = scheduler_.current_->inside;
    return !inside.empty() && inside.back() == lane_.get();
}

const std::string& SimulatedQueue::label() const { return lane_->label; }

} // namespace tarn
