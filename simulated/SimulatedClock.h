#pragma once

#include "roles/Clock.h"
#include "simulated/SimulatedScheduler.h"

namespace tarn {

/// The scheduler's virtual time.
class SimulatedClock final : public Clock {
public:
    explicit SimulatedClock(SimulatedScheduler& scheduler) : scheduler_(scheduler) {}

    std::chrono::nanoseconds now() const override { return scheduler_.now(); }
    std::shared_ptr<OneShotSignal> makeSignal() override;

private:
    SimulatedScheduler& scheduler_;
};

} // namespace tarn
