#pragma once

#include <memory>
#include <string>

#include "roles/SerialQueue.h"

namespace tarn {

class WorkerPool;

/// A serial queue that borrows a worker while it has work.
///
/// sync() runs in place, under the queue's exclusion, when the queue is idle, and otherwise on the calling
/// thread when its turn comes. The queue's state outlives this handle until its work has run, so the last
/// handle may go on the queue itself.
class WorkerQueue final : public SerialQueue {
public:
    /// The pool outlives the queue and its work.
    WorkerQueue(WorkerPool& pool, std::string label);

    void async(Work work) override;
    void sync(const std::function<void()>& work) override;
    bool isCurrent() const override;
    const std::string& label() const override;

private:
    class State;
    std::shared_ptr<State> state_;
};

} // namespace tarn
