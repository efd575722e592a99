#include "threads/WorkerPool.h"

#include <cassert>
#include <system_error>
#include <utility>

#include "threads/BlockingSection.h"
#include "threads/Burst.h"

namespace tarn {

/// On the stack of a worker's thread.
struct WorkerPool::Worker {
    WorkerPool& pool;
    bool isExpected = false; // somebody relies on it to come back to the line
    bool waits = false;      // in a BlockingSection: it comes back nobody knows when
};

thread_local WorkerPool::Worker* WorkerPool::current_ = nullptr;

WorkerPool::WorkerPool(StartThread start) : start_(std::move(start)) {
    std::lock_guard lock(mutex_);
    callWorker();
    if (workers_ == 0)
        throw std::system_error(std::make_error_code(std::errc::resource_unavailable_try_again), "thread");
}

WorkerPool::~WorkerPool() {
    assert(current_ == nullptr || &current_->pool != this);
    {
        std::lock_guard lock(mutex_);
        stopping_ = true;
        for (; sleeping_ > 0; --sleeping_)
            wake_.release();
    }
    lastEnded_.acquire();
    std::lock_guard hasLetGo(mutex_); // the last worker held it up to its end
}

std::size_t WorkerPool::workers() const {
    std::lock_guard lock(mutex_);
    return workers_;
}

void WorkerPool::schedule(std::shared_ptr<Task> task) noexcept {
    bool mustWake = false;
    {
        std::lock_guard lock(mutex_);
        Task* const added = task.get();
        (first_ == nullptr ? first_ : last_->next_) = std::move(task);
        last_ = added;
        const bool isWorker = current_ != nullptr && &current_->pool == this && !current_->waits;
        if (!isWorker || std::exchange(current_->isExpected, true))
            mustWake = callWorker();
    }
    // The worker wants the lock as soon as it is awake, so it is woken without.
    if (mustWake)
        wake_.release();
}

/// Under the lock: sends somebody to the line. True when that is a sleeping worker, for the caller to wake.
/// When nobody can be sent, one of those that are there comes by once it is done.
bool WorkerPool::callWorker() {
    if (sleeping_ > 0) {
        --sleeping_;
        return true;
    }
    if (workers_ < mostWorkers && start_([this] { work(); }))
        ++workers_;
    return false;
}

void WorkerPool::work() {
    Worker self{*this};
    current_ = &self;
    Burst burst;
    while (const auto task = takeFirst(self)) {
        task->runTurn();
        Burst::flush();
    }
}

/// Waits until there is one; null when the worker shall end.
std::shared_ptr<WorkerPool::Task> WorkerPool::takeFirst(Worker& worker) {
    std::unique_lock lock(mutex_);
    worker.isExpected = false;
    while (first_ == nullptr) {
        if (stopping_ || sleeping_ == mostSleeping) {
            if (--workers_ == 0)
                lastEnded_.release();
            return nullptr;
        }
        ++sleeping_;
        lock.unlock();
        wake_.acquire();
        lock.lock();
    }
    auto task = std::move(first_);
    first_ = std::move(task->next_);
    return task;
}

void WorkerPool::beginWaiting(Worker& worker) {
    worker.waits = true;
    bool mustWake = false;
    {
        std::lock_guard lock(mutex_);
        if (first_ != nullptr)
            mustWake = callWorker();
    }
    if (mustWake)
        wake_.release();
}

BlockingSection::BlockingSection() : entered_(false) {
    Burst::flush();
    auto* worker = WorkerPool::current_;
    if (worker == nullptr || worker->waits)
        return;
    entered_ = true;
    worker->pool.beginWaiting(*worker);
}

BlockingSection::~BlockingSection() {
    if (entered_)
        WorkerPool::current_->waits = false;
}

} // namespace tarn
