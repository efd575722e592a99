#pragma once

#include "roles/SerialQueue.h"
#include "threads/MainQueue.h"
#include "threads/WorkerPool.h"

namespace tarn {

/// The queues of the process: serial queues on shared workers, and the main queue. Destroying it lets the
/// serial queues' work run out; not from that work.
class WorkerQueues final : public SerialQueues {
public:
    std::shared_ptr<SerialQueue> create(std::string label) override;
    MainQueue& main() override { return main_; }
    void runMainLoop() override { main_.runLoop(); }

    const WorkerPool& pool() const { return pool_; }

private:
    MainQueue main_;
    WorkerPool pool_;
};

} // namespace tarn
