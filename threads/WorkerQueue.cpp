#include "threads/WorkerQueue.h"

#include <deque>
#include <mutex>
#include <utility>

#include "threads/QueueFrame.h"
#include "threads/QueueTurn.h"
#include "threads/WorkerPool.h"

namespace tarn {

/// Whoever holds the queue runs its work: nobody while it is idle, a worker (or the pool on its behalf), or a
/// thread in sync(). Giving it up means handing it to the next in line, so that the order is kept.
class WorkerQueue::State final : public WorkerPool::Task, public std::enable_shared_from_this<State> {
public:
    State(WorkerPool& pool, std::string label) : pool_(pool), label_(std::move(label)) {}

    const std::string& label() const { return label_; }

    void async(Work work) {
        {
            std::lock_guard lock(mutex_);
            line_.push_back({std::move(work), nullptr});
            if (held_)
                return;
            held_ = true;
        }
        pool_.schedule(shared_from_this());
    }

    void sync(const std::function<void()>& work) {
        QueueFrame::abortIfInside(this, label_);
        takeTurn();
        QueueFrame::run(this, work);
        giveUp();
    }

    bool run(WorkerPool::TimePoint end) noexcept override {
        for (bool isFirst = true; !handOver(); isFirst = false) {
            if (!isFirst && std::chrono::steady_clock::now() >= end)
                return true;
            Entry entry = std::move(taken_.front());
            taken_.pop_front();
            QueueFrame frame(this);
            entry.work();
            entry.work = nullptr; // what it held may be the queue's last owner: still on the queue
        }
        return false;
    }

private:
    /// Work for a worker, or a thread that waits in sync().
    struct Entry {
        Work work;
        QueueTurn* turn;
    };

    void takeTurn() {
        QueueTurn turn;
        {
            std::lock_guard lock(mutex_);
            if (!std::exchange(held_, true))
                return;
            line_.push_back({nullptr, &turn});
        }
        turn.wait();
    }

    void giveUp() {
        if (!handOver())
            pool_.schedule(shared_from_this());
    }

    /// Lets go of the queue unless the next in line is work for a worker.
    bool handOver() {
        if (taken_.empty()) {
            std::lock_guard lock(mutex_);
            held_ = !line_.empty();
            if (!held_)
                return true;
            taken_.swap(line_);
        }
        QueueTurn* turn = taken_.front().turn;
        if (turn == nullptr)
            return false;
        taken_.pop_front();
        turn->grant();
        return true;
    }

    WorkerPool& pool_;
    const std::string label_;
    std::deque<Entry> taken_; // from the line, all at once, by whoever holds the queue; before the line
    std::mutex mutex_;        // guards what follows
    std::deque<Entry> line_;
    bool held_ = false;
};

WorkerQueue::WorkerQueue(WorkerPool& pool, std::string label)
    : state_(std::make_shared<State>(pool, std::move(label))) {}

void WorkerQueue::async(Work work) { state_->async(std::move(work)); }

void WorkerQueue::sync(const std::function<void()>& work) {
    auto state = state_; // the work may drop the last handle
    state->sync(work);
}

bool WorkerQueue::isCurrent() const { return QueueFrame::isInnermost(state_.get()); }

const std::string& WorkerQueue::label() const { return state_->label(); }

} // namespace tarn
