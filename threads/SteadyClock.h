#pragma once

#include "roles/Clock.h"

namespace tarn {

/// The machine's monotonic clock, counted from the clock's creation.
class SteadyClock final : public Clock {
public:
    SteadyClock();

    std::chrono::nanoseconds now() const override;
    std::shared_ptr<OneShotSignal> makeSignal() override;

private:
    const std::chrono::steady_clock::time_point origin_;
};

} // namespace tarn
