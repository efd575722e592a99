#pragma once

#include <functional>

namespace tarn {

/// What the player thread sleeps in. Player thread.
class Poller {
public:
    virtual ~Poller() = default;

    /// Has `readable` called by wait() whenever there is something to be read from `descriptor`, which
    /// outlives the wait.
    virtual void watch(int descriptor, std::function<void()> readable) = 0;

    /// Calls for what has happened; waits for it first when the thread is `idle`. False when it cannot go on.
    virtual bool wait(bool idle) = 0;
};

} // namespace tarn
