#pragma once

#include <condition_variable>
#include <memory>
#include <mutex>

#include "platform/core/BlockingSection.h"

namespace tarn {

/// On the stack of a thread that waits for its turn on a queue.
class QueueTurn {
public:
    QueueTurn() : place_(placeOfThread()) {}

    void wait() {
        BlockingSection blocking;
        std::unique_lock lock(place_->mutex);
        place_->granted.wait(lock, [this] { return isGranted_; });
    }

    /// The waiting thread may destroy this as soon as it sees the grant; its place lives until it is woken.
    void grant() {
        const auto place = place_;
        {
            std::lock_guard lock(place->mutex);
            isGranted_ = true;
        }
        place->granted.notify_one(); // without the lock, which the woken thread wants at once
    }

private:
    struct Place {
        std::mutex mutex;
        std::condition_variable granted;
    };

    /// A thread waits for one turn at a time.
    static const std::shared_ptr<Place>& placeOfThread() {
        thread_local const auto place = std::make_shared<Place>();
        return place;
    }

    const std::shared_ptr<Place> place_;
    bool isGranted_ = false; // under the place's lock
};

} // namespace tarn
