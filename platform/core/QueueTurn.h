#pragma once

#include <condition_variable>
#include <mutex>

#include "platform/core/BlockingSection.h"

namespace tarn {

/// On the stack of a thread that waits for its turn on a queue.
class QueueTurn {
public:
    void wait() {
        BlockingSection blocking;
        std::unique_lock lock(mutex_);
        granted_.wait(lock, [this] { return isGranted_; });
    }

    void grant() {
        // Notified under the lock: the waiting thread may destroy this as soon as it has the lock.
        std::lock_guard lock(mutex_);
        isGranted_ = true;
        granted_.notify_one();
    }

private:
    std::mutex mutex_;
    std::condition_variable granted_;
    bool isGranted_ = false;
};

} // namespace tarn
