#pragma once

#include <memory>
#include <string>
#include <utility>

#include "roles/SerialQueue.h"
#include "threads/Primitives.h"
#include "threads/WorkerPool.h"
#include "threads/WorkerQueue.h"

namespace tarn {

/// The serial queues of the process, all on one pool of workers.
///
/// The main queue is one of them: nothing that it runs needs the main thread itself, which only waits for the
/// end. Destroying this lets submitted work run to its end, so it must not happen on a queue.
class WorkerQueues final : public SerialQueues {
public:
    explicit WorkerQueues(WorkerPool::StartThread start = startThread) : pool_(std::move(start)) {}

    std::shared_ptr<SerialQueue> create(std::string label) override {
        return std::make_shared<WorkerQueue>(pool_, std::move(label));
    }
    SerialQueue& main() override { return main_; }

    /// Waits for endMainLoop(), which may have come before.
    void runMainLoop() override { ended_.acquire(); }

    /// Any thread; once.
    void endMainLoop() { ended_.release(); }

    const WorkerPool& pool() const { return pool_; }

private:
    Semaphore ended_{0};
    WorkerPool pool_;
    WorkerQueue main_{pool_, "main"};
};

} // namespace tarn
