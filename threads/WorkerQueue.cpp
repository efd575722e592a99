#include "threads/WorkerQueue.h"

#include <cassert>
#include <cstddef>
#include <deque>
#include <mutex>
#include <utility>

#include "threads/BlockingSection.h"
#include "threads/Primitives.h"
#include "threads/QueueFrame.h"
#include "threads/WorkerPool.h"

namespace tarn {

class WorkerQueue::State final : public WorkerPool::Task, public std::enable_shared_from_this<State> {
public:
    State(WorkerPool& pool, std::string label) : pool_(pool), label_(std::move(label)) {}

    const std::string& label() const { return label_; }

    void async(Work work) {
        std::unique_lock lock(mutex_);
        line_.push_back({std::move(work), false});
        callWorker(std::move(lock));
    }

    void sync(const std::function<void()>& work) {
        QueueFrame::abortIfInside(this, label_);
        std::unique_lock lock(mutex_);
        if (isInside_)
            return waitFor(work, std::move(lock));
        isInside_ = true;
        runLine(lock, line_.size());
        lock.unlock();
        QueueFrame::run(this, work);
        lock.lock();
        leave(std::move(lock));
    }

    void runTurn() noexcept override {
        std::unique_lock lock(mutex_);
        isScheduled_ = false;
        if (isInside_)
            return;
        isInside_ = true;
        runLine(lock, turn);
        leave(std::move(lock));
    }

private:
    /// How many pieces of work a worker runs before other queues, and the answers, have their turn.
    static constexpr std::size_t turn = 64;

    struct Entry {
        Work work;
        bool isWaitedFor;
    };

    void waitFor(const std::function<void()>& work, std::unique_lock<Mutex> lock) {
        // Shared, because whoever releases it is still at it when this thread goes on.
        const auto done = std::make_shared<Semaphore>(0);
        line_.push_back({[&work, done] {
                             work();
                             done->release();
                         },
                         true});
        ++waiting_;
        lock.unlock();
        BlockingSection blocking;
        done->acquire();
    }

    /// Runs the first `count` entries, and all up to the last one that somebody waits for.
    void runLine(std::unique_lock<Mutex>& lock, std::size_t count) noexcept {
        for (std::size_t done = 0; !line_.empty() && (done < count || waiting_ > 0); ++done) {
            Entry entry = std::move(line_.front());
            line_.pop_front();
            waiting_ -= entry.isWaitedFor ? 1 : 0;
            lock.unlock();
            {
                const QueueFrame frame(this);
                entry.work();
                entry.work = nullptr; // what it held may be the queue's last owner: still on the queue
            }
            lock.lock();
        }
    }

    void leave(std::unique_lock<Mutex> lock) {
        runLine(lock, 0);
        isInside_ = false;
        callWorker(std::move(lock));
    }

    /// Unless there is nothing to do, or somebody who will see to it.
    void callWorker(std::unique_lock<Mutex> lock) noexcept {
        if (line_.empty() || isInside_ || std::exchange(isScheduled_, true))
            return;
        lock.unlock();
        pool_.schedule(shared_from_this());
    }

    WorkerPool& pool_;
    const std::string label_;
    Mutex mutex_; // guards what follows
    std::deque<Entry> line_;
    std::size_t waiting_ = 0;  // threads, for entries of the line
    bool isInside_ = false;    // some thread
    bool isScheduled_ = false; // stands in the pool's line
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
