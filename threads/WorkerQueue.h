#pragma once

#include <memory>
#include <string>

#include "roles/SerialQueue.h"

namespace tarn {

class WorkerPool;

/// A serial queue without a thread of its own.
///
/// The problem: work of one queue must never run twice at a time, whoever runs it, and whoever waits for the
/// queue must not wait for a worker that is busy elsewhere or cannot be made.
///
/// The idea: at most one thread is inside a queue at any time, and runs its work in order. Mostly that is a
/// worker, which the pool sends when there is work. A thread in sync() that finds nobody inside goes in by
/// itself, whether or not a worker is on its way, and runs what was submitted before and then its own work.
/// If somebody is inside already, it leaves its work in the line and waits.
///
///          async()                      a worker comes, or sync()
///     idle ───────> waits for a worker ──────────────────────────> somebody is inside ─┐
///      ▲   ──────────────────────────────────────────────────────>   │    ▲   after 64 │ with more
///      │                sync()                                       │    └────────────┘ to do
///      └─────────────────────────────────────────────────────────────┘
///                               nothing left
///
/// What follows:
///
/// 1. sync() on an idle queue costs two locks, and wakes nobody.
/// 2. A thread in sync() waits for a thread that is inside the queue, never for one that is still to come. So
///    as long as no two queues wait for each other, every sync() ends, however few workers there are.
///    Therefore a worker does not end its turn while somebody waits, and somebody who went in runs what
///    others have begun to wait for meanwhile.
/// 3. A worker that was sent and finds somebody inside, or nothing to do, goes away again.
///
/// async() fails with std::bad_alloc when there is no memory to note the work down. It has not been accepted
/// then; what has been is run once, whatever else fails.
///
/// The queue's state outlives this handle until its work has run, so the last handle may go on the queue
/// itself.
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
