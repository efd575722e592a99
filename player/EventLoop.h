#pragma once

#include <chrono>
#include <functional>

#include "roles/Registration.h"

namespace tarn {

/// The player thread: everything that turns queues into sound runs here, one piece at a time. Any thread may
/// call.
class EventLoop {
public:
    virtual ~EventLoop() = default;

    virtual void post(std::function<void()> work) = 0;

    /// Runs `work` once at `time` by the platform's clock, unless the registration is dropped before.
    [[nodiscard]] virtual RegistrationHandle at(std::chrono::nanoseconds time,
                                                std::function<void()> work) = 0;

    virtual bool isCurrent() const = 0;
    virtual std::chrono::nanoseconds now() const = 0;
};

} // namespace tarn
