#pragma once

#include <utility>

#include "roles/SerialQueue.h"
#include "simulated/SimulatedQueue.h"
#include "simulated/SimulatedScheduler.h"

namespace tarn {

/// The scheduler's queues in the role of the process's.
class SimulatedQueues final : public SerialQueues {
public:
    explicit SimulatedQueues(SimulatedScheduler& scheduler)
        : scheduler_(scheduler), main_(scheduler.createQueue("main")) {}

    std::shared_ptr<SerialQueue> create(std::string label) override {
        return scheduler_.createQueue(std::move(label));
    }

    SimulatedQueue& main() override { return *main_; }

    /// For the test: the scheduler runs the main queue with all others. Returns when nothing can run before
    /// time moves.
    void runMainLoop() override { scheduler_.runReady(); }

private:
    SimulatedScheduler& scheduler_;
    const std::shared_ptr<SimulatedQueue> main_;
};

} // namespace tarn
