#include "threads/MainQueue.h"

#include <cassert>
#include <utility>

#include "threads/QueueFrame.h"
#include "threads/QueueTurn.h"

namespace tarn {

void MainQueue::async(Work work) {
    std::unique_lock lock(mutex_);
    line_.push_back(std::move(work));
    if (!isLent_)
        wakeIfItWaits(std::move(lock));
}

void MainQueue::sync(const std::function<void()>& work) {
    QueueFrame::abortIfInside(this, label_);
    if (lend()) {
        QueueFrame::run(this, work);
        return takeBack();
    }
    QueueTurn turn;
    async([&] {
        work();
        turn.grant();
    });
    turn.wait();
}

bool MainQueue::isCurrent() const { return QueueFrame::isInnermost(this); }

void MainQueue::runLoop() {
    std::unique_lock lock(mutex_);
    while (!ended_) {
        if (line_.empty()) {
            waits_ = true;
            lock.unlock();
            wake_.acquire();
            lock.lock();
            assert(!waits_ && !isLent_); // whoever holds the queue wakes nobody before it is back
            continue;
        }
        auto work = std::move(line_.front());
        line_.pop_front();
        lock.unlock();
        QueueFrame::run(this, work);
        work = nullptr;
        lock.lock();
    }
}

void MainQueue::end() {
    std::unique_lock lock(mutex_);
    ended_ = true;
    if (!isLent_)
        wakeIfItWaits(std::move(lock));
}

/// To the calling thread, when the main thread waits for work. False when it does not.
bool MainQueue::lend() {
    std::lock_guard lock(mutex_);
    if (!waits_ || isLent_)
        return false;
    return isLent_ = true;
}

void MainQueue::takeBack() {
    std::unique_lock lock(mutex_);
    isLent_ = false;
    if (!line_.empty() || ended_)
        wakeIfItWaits(std::move(lock));
}

/// The main thread wants the lock as soon as it wakes up, so the lock is let go first.
void MainQueue::wakeIfItWaits(std::unique_lock<std::mutex> lock) {
    const bool waited = std::exchange(waits_, false);
    lock.unlock();
    if (waited)
        wake_.release();
}

} // namespace tarn
