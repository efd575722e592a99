#pragma once

#include <memory>
#include <semaphore>

#include "threads/BlockingSection.h"

namespace tarn {

/// On the stack of a thread that waits for its turn on a queue.
class QueueTurn {
public:
    QueueTurn() : place_(placeOfThread()) {}

    void wait() {
        BlockingSection blocking;
        place_->granted.acquire();
    }

    /// Once. The waiting thread may destroy this as soon as it sees the grant; its place lives on.
    void grant() {
        const auto place = place_;
        place->granted.release();
    }

private:
    struct Place {
        std::counting_semaphore<> granted{0};
    };

    /// A thread waits for one turn at a time.
    static const std::shared_ptr<Place>& placeOfThread() {
        thread_local const auto place = std::make_shared<Place>();
        return place;
    }

    const std::shared_ptr<Place> place_;
};

} // namespace tarn
