#pragma once

#include <chrono>
#include <cstdint>
#include <optional>

namespace tarn {

/// Where playback is at any moment, from one published position and the rate at which it runs on.
class PositionLine {
public:
    using Time = std::chrono::steady_clock::time_point;
    using Microseconds = std::chrono::microseconds;

    PositionLine() = default;

    /// `elapsed` was heard at `start`; `rate` is 0 while it stands still, below 0 when it runs backwards.
    PositionLine(Microseconds elapsed, Time start, double rate, std::optional<Microseconds> length);

    /// Between zero and the length.
    Microseconds at(Time now) const;

    Time start() const { return start_; }

private:
    Microseconds clamped(double microseconds) const;

    Microseconds elapsed_{0};
    Time start_;
    double rate_ = 0;
    std::optional<Microseconds> length_;
};

} // namespace tarn
