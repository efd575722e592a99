#pragma once

#include <memory>
#include <utility>

#include "player/EventLoop.h"
#include "simulated/SimulatedQueue.h"
#include "simulated/SimulatedScheduler.h"

namespace tarn {

/// The player thread as one of the scheduler's.
class SimulatedEventLoop final : public EventLoop {
public:
    explicit SimulatedEventLoop(SimulatedScheduler& scheduler)
        : scheduler_(scheduler), queue_(scheduler.createQueue("player")) {}

    void post(std::function<void()> work) override { queue_->async(std::move(work)); }

    RegistrationHandle at(std::chrono::nanoseconds time, std::function<void()> work) override {
        return scheduler_.at(time, queue_, std::move(work));
    }

    bool isCurrent() const override { return queue_->isCurrent(); }
    std::chrono::nanoseconds now() const override { return scheduler_.now(); }

private:
    SimulatedScheduler& scheduler_;
    const std::shared_ptr<SimulatedQueue> queue_;
};

} // namespace tarn
