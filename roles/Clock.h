#pragma once

#include <chrono>
#include <memory>

namespace tarn {

/// Signalled once by one thread, waited for by another.
class OneShotSignal {
public:
    virtual ~OneShotSignal() = default;

    /// From any thread; a second call changes nothing.
    virtual void signal() = 0;

    /// Waits at most `limit` from now on; false when the limit passed without the signal. Never on the main
    /// queue or a thread that delivers events.
    [[nodiscard]] virtual bool wait(std::chrono::nanoseconds limit) = 0;
};

/// Steady time (unmoved by changes of the wall clock), and the waits that are measured by it.
class Clock {
public:
    virtual ~Clock() = default;

    /// Time since an origin that is fixed for the life of the process.
    virtual std::chrono::nanoseconds now() const = 0;

    virtual std::shared_ptr<OneShotSignal> makeSignal() = 0;
};

} // namespace tarn
