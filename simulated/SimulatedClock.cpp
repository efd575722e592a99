#include "simulated/SimulatedClock.h"

#include <utility>
#include <vector>

namespace tarn {

/// Waiting leaves the activity until the signal or the deadline makes it ready.
class SimulatedSignal final : public OneShotSignal {
public:
    explicit SimulatedSignal(SimulatedScheduler& scheduler) : scheduler_(scheduler) {}

    void signal() override {
        signalled_ = true;
        for (auto* wait : std::exchange(waits_, {}))
            end(*wait, true);
        scheduler_.yieldPoint();
    }

    bool wait(std::chrono::nanoseconds limit) override {
        scheduler_.yieldPoint();
        if (signalled_)
            return true;
        Wait wait{scheduler_.current_, false, false};
        waits_.push_back(&wait);
        auto deadline = scheduler_.addTimer(scheduler_.now() + limit, [this, &wait] {
            std::erase(waits_, &wait);
            end(wait, false);
        });
        scheduler_.leave();
        return wait.inTime;
    }

private:
    struct Wait {
        SimulatedActivity* activity;
        bool ended;
        bool inTime;
    };

    void end(Wait& wait, bool inTime) {
        if (std::exchange(wait.ended, true))
            return;
        wait.inTime = inTime;
        scheduler_.wake(*wait.activity);
    }

    SimulatedScheduler& scheduler_;
    bool signalled_ = false;
    std::vector<Wait*> waits_;
};

std::shared_ptr<OneShotSignal> SimulatedClock::makeSignal() {
    return std::make_shared<SimulatedSignal>(scheduler_);
}

} // namespace tarn
