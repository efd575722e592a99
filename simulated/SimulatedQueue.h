#pragma once

#include "roles/SerialQueue.h"

namespace tarn {

class SimulatedScheduler;
struct SimulatedLane;

/// A serial queue, or a platform thread, of the scheduler.
class SimulatedQueue final : public SerialQueue {
public:
    SimulatedQueue(SimulatedScheduler& scheduler, std::string label);

    void async(Work work) override;
    void sync(const std::function<void()>& work) override;
    bool isCurrent() const override;
    const std::string& label() const override;

private:
    friend class SimulatedScheduler;

    SimulatedScheduler& scheduler_;
    const std::shared_ptr<SimulatedLane> lane_;
};

} // namespace tarn
