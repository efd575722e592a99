#include "threads/WorkerPool.h"

#include <cassert>
#include <utility>

#include "threads/BlockingSection.h"
#include "threads/Burst.h"

namespace tarn {

thread_local WorkerPool::Worker* WorkerPool::currentWorker_ = nullptr;

WorkerPool::~WorkerPool() {
    assert(currentWorker_ == nullptr || &currentWorker_->pool != this);
    std::unique_lock lock(mutex_);
    stopping_ = true;
    for (const auto& worker : std::exchange(idle_, {}))
        worker->wake.release();
    retired_.wait(lock, [this] { return workers_.empty(); });
    for (const auto& worker : finished_)
        worker->thread.join();
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
    return workers_.size();
}

/// A worker that wakes up wants the lock, so it is woken without.
void WorkerPool::makeReady(std::shared_ptr<Task> task) {
    std::shared_ptr<Worker> woken;
    {
        std::lock_guard lock(mutex_);
        woken = giveLocked(std::move(task));
    }
    if (woken != nullptr)
        woken->wake.release();
}

/// Gives the task to an idle worker and returns it, to be woken. Without one the task waits for a new worker,
/// or for the next that is done.
std::shared_ptr<WorkerPool::Worker> WorkerPool::giveLocked(std::shared_ptr<Task> task) {
    if (idle_.empty()) {
        ready_.push_back(std::move(task));
        spawnLocked();
        return nullptr;
    }
    auto worker = std::move(idle_.back());
    idle_.pop_back();
    worker->given = std::move(task);
    return worker;
}

/// Makes a worker, unless enough of them run or live.
void WorkerPool::spawnLocked() {
    const std::size_t running = workers_.size() - idle_.size() - blocked_;
    if (running >= maxRunning || workers_.size() >= maxThreads)
        return;
    const auto self = workers_.insert(workers_.end(), std::make_shared<Worker>(*this));
    (*self)->thread = std::thread([this, self] { work(self); });
}

void WorkerPool::beginBlocking(Worker& worker) {
    worker.blocked = true;
    std::shared_ptr<Worker> woken;
    {
        std::lock_guard lock(mutex_);
        ++blocked_;
        if (worker.next != nullptr)
            woken = giveLocked(std::move(worker.next));
        else if (!ready_.empty())
            spawnLocked();
    }
    if (woken != nullptr)
        woken->wake.release();
}

void WorkerPool::endBlocking(Worker& worker) {
    worker.blocked = false;
    std::lock_guard lock(mutex_);
    --blocked_;
}

void WorkerPool::work(Workers::iterator self) {
    Worker* worker = nullptr;
    {
        std::lock_guard lock(mutex_); // whoever made this worker may still be about it
        worker = self->get();
    }
    currentWorker_ = worker;
    joinFinished();
    while (auto task = waitForTask(self))
        runSlices(*worker, std::move(task));
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
    return takeReadyLocked();
}

std::shared_ptr<WorkerPool::Task> WorkerPool::takeReadyLocked() {
    if (ready_.empty())
        return nullptr;
    auto task = std::move(ready_.front());
    ready_.pop_front();
    return task;
}

/// Null when the thread shall end.
std::shared_ptr<WorkerPool::Task> WorkerPool::waitForTask(Workers::iterator self) {
    std::unique_lock lock(mutex_);
    Worker& worker = **self;
    if (auto task = takeReadyLocked())
        return task;
    if (!stopping_ && idle_.size() < maxIdle) {
        idle_.push_back(*self);
        lock.unlock();
        worker.wake.acquire();
        if (worker.given != nullptr)
            return std::exchange(worker.given, nullptr);
        lock.lock(); // the pool stops
    }
    finished_.splice(finished_.end(), workers_, self);
    retired_.notify_all();
    return nullptr;
}

void WorkerPool::joinFinished() {
    Workers finished;
    {
        std::lock_guard lock(mutex_);
        if (stopping_)
            return;
        finished.swap(finished_);
    }
    for (const auto& worker : finished)
        worker->thread.join();
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
