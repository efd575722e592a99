#include "platform/core/MainQueue.h"

#include <utility>

#include "platform/core/QueueFrame.h"
#include "platform/core/QueueTurn.h"

namespace tarn {

void MainQueue::async(std::function<void()> work) {
    {
        std::lock_guard lock(mutex_);
        line_.push_back(std::move(work));
    }
    changed_.notify_one(); // without the lock, which the main thread wants at once
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
    for (;;) {
        changed_.wait(lock, [this] { return ended_ || !line_.empty(); });
        if (ended_)
            return;
        auto work = std::move(line_.front());
        line_.pop_front();
        lock.unlock();
        QueueFrame::run(this, work);
        work = nullptr;
        lock.lock();
    }
}

void MainQueue::end() {
    std::lock_guard lock(mutex_);
    ended_ = true;
    changed_.notify_one();
}

} // namespace tarn
