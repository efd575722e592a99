#include "platform/core/WorkerPool.h"

#include <cassert>
#include <utility>

#include "platform/core/BlockingSection.h"
#include "platform/core/Burst.h"

namespace tarn {

thread_local WorkerPool::Worker* WorkerPool::currentWorker_ = nullptr;

WorkerPool::~WorkerPool() {
    assert(currentWorker_ == nullptr || &currentWorker_->pool != this);
    std::unique_lock lock(mutex_);
    stopping_ = true;
    wake_.notify_all();
    retired_.wait(lock, [this] { return threads_.empty(); });
    for (auto& thread : finished_)
        thread.join();
}

void WorkerPool::schedule(std::shared_ptr<Task> task) {
    Worker* worker = currentWorker_;
    if (worker != nullptr && &worker->pool == this && !worker->blocked && worker->next == nullptr)
        worker->next = std::move(task);
    else
        makeReady(std::move(task));
}

std::size_t WorkerPool::threads() const {
    std::lock_guard lock(mutex_);
    return threads_.size();
}

void WorkerPool::makeReady(std::shared_ptr<Task> task) {
    std::lock_guard lock(mutex_);
    ready_.push_back(std::move(task));
    wakeOrSpawnLocked();
}

/// Sees to it that a worker comes for the last ready task. Those before it have theirs on the way.
void WorkerPool::wakeOrSpawnLocked() {
    if (ready_.empty())
        return;
    if (idle_ >= ready_.size()) {
        wake_.notify_one();
        return;
    }
    std::size_t running = threads_.size() - idle_ - blocked_;
    if (running >= maxRunning || threads_.size() >= maxThreads)
        return; // the next worker that is done takes it
    auto self = threads_.emplace(threads_.end());
    *self = std::thread([this, self] { work(self); });
}

void WorkerPool::beginBlocking(Worker& worker) {
    worker.blocked = true;
    std::lock_guard lock(mutex_);
    if (worker.next != nullptr)
        ready_.push_back(std::move(worker.next));
    ++blocked_;
    wakeOrSpawnLocked();
}

void WorkerPool::endBlocking(Worker& worker) {
    worker.blocked = false;
    std::lock_guard lock(mutex_);
    --blocked_;
}

void WorkerPool::work(Threads::iterator self) {
    Worker worker{*this, nullptr, false};
    currentWorker_ = &worker;
    joinFinished();
    while (auto task = waitForTask(self))
        runSlices(worker, std::move(task));
}

void WorkerPool::runSlices(Worker& worker, std::shared_ptr<Task> task) {
    Burst burst;
    auto end = std::chrono::steady_clock::now() + slice;
    while (task != nullptr) {
        bool left = task->run(end);
        if (auto now = std::chrono::steady_clock::now(); now >= end) {
            Burst::flush();
            end = now + slice;
        }
        if (left) {
            auto other = takeNext(worker);
            if (other == nullptr)
                continue;
            makeReady(std::exchange(task, std::move(other)));
        } else {
            task = takeNext(worker);
        }
    }
}

/// What the worker goes on with: the task that it gave work to, else one that waits for a worker.
std::shared_ptr<WorkerPool::Task> WorkerPool::takeNext(Worker& worker) {
    if (worker.next != nullptr)
        return std::exchange(worker.next, nullptr);
    std::lock_guard lock(mutex_);
    if (ready_.empty())
        return nullptr;
    auto task = std::move(ready_.front());
    ready_.pop_front();
    return task;
}

/// Null when the thread shall end.
std::shared_ptr<WorkerPool::Task> WorkerPool::waitForTask(Threads::iterator self) {
    std::unique_lock lock(mutex_);
    if (ready_.empty() && !stopping_ && idle_ < maxIdle) {
        ++idle_;
        wake_.wait(lock, [this] { return !ready_.empty() || stopping_; });
        --idle_;
    }
    if (ready_.empty()) {
        retireLocked(self);
        return nullptr;
    }
    auto task = std::move(ready_.front());
    ready_.pop_front();
    return task;
}

void WorkerPool::retireLocked(Threads::iterator self) {
    finished_.splice(finished_.end(), threads_, self);
    retired_.notify_all();
}

void WorkerPool::joinFinished() {
    Threads finished;
    {
        std::lock_guard lock(mutex_);
        if (stopping_)
            return;
        finished.swap(finished_);
    }
    for (auto& thread : finished)
        thread.join();
}

BlockingSection::BlockingSection() : entered_(false) {
    Burst::flush();
    auto* worker = WorkerPool::currentWorker_;
    if (worker == nullptr || worker->blocked)
        return;
    entered_ = true;
    worker->pool.beginBlocking(*worker);
}

BlockingSection::~BlockingSection() {
    if (entered_)
        WorkerPool::currentWorker_->pool.endBlocking(*WorkerPool::currentWorker_);
}

} // namespace tarn
