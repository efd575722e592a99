#include "tests/player/ThreadLoop.h"

#include <utility>

namespace tarn {

namespace {

struct Timer final : Registration {
    explicit Timer(std::shared_ptr<std::function<void()>> workToKeep) : work(std::move(workToKeep)) {}
    const std::shared_ptr<std::function<void()>> work;
};

} // namespace

ThreadLoop::ThreadLoop() {
    std::lock_guard lock(mutex_); // so that the thread sees itself in thread_
    thread_ = std::thread([this] { run(); });
}

std::chrono::nanoseconds ThreadLoop::now() const {
    return std::chrono::steady_clock::now().time_since_epoch();
}

void ThreadLoop::post(std::function<void()> work) {
    std::lock_guard lock(mutex_);
    posted_.push_back(std::move(work));
    changed_.notify_one();
}

RegistrationHandle ThreadLoop::at(std::chrono::nanoseconds time, std::function<void()> work) {
    auto shared = std::make_shared<Work>(std::move(work));
    std::lock_guard lock(mutex_);
    timers_.emplace(time, shared);
    changed_.notify_one();
    return std::make_unique<Timer>(std::move(shared));
}

void ThreadLoop::finishPosted() {
    std::unique_lock lock(mutex_);
    idle_.wait(lock, [this] { return posted_.empty() && !busy_; });
}

void ThreadLoop::finish() {
    if (!thread_.joinable())
        return;
    {
        std::lock_guard lock(mutex_);
        finishing_ = true;
        changed_.notify_one();
    }
    thread_.join();
}

/// The next timer, if its time has come; with the lock held.
std::shared_ptr<ThreadLoop::Work> ThreadLoop::dueTimer() {
    while (!timers_.empty() && timers_.begin()->first <= now()) {
        auto work = timers_.begin()->second.lock();
        timers_.erase(timers_.begin());
        if (work)
            return work;
    }
    return nullptr;
}

void ThreadLoop::run() {
    std::unique_lock lock(mutex_);
    while (true) {
        if (!posted_.empty()) {
            Work work = std::move(posted_.front());
            posted_.pop_front();
            busy_ = true;
            lock.unlock();
            work();
            work = nullptr;
            lock.lock();
            busy_ = false;
            idle_.notify_all();
        } else if (finishing_) {
            return;
        } else if (auto timer = dueTimer()) {
            lock.unlock();
            (*timer)();
            timer.reset();
            lock.lock();
        } else if (timers_.empty()) {
            changed_.wait(lock);
        } else {
            changed_.wait_until(lock, std::chrono::steady_clock::time_point(timers_.begin()->first));
        }
    }
}

} // namespace tarn
