#include "platform/core/MainQueue.h"

#include <utility>

#include "platform/core/QueueFrame.h"
#include "platform/core/QueueTurn.h"

namespace tarn {

void MainQueue::async(Work work) {
    std::unique_lock lock(mutex_);
    line_.push_back(std::move(work));
    wakeIfItWaits(std::move(lock));
}

void MainQueue::sync(const std::function<void()>& work) {
    QueueFrame::abortIfInside(this, label_);
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
