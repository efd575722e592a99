#pragma once

#include <chrono>
#include <cstdint>
#include <functional>

#include "player/EventLoop.h"
#include "player/Output.h"

namespace tarn {

/// Calls when a frame of an output has been heard. Player thread.
///
/// The output's clock is an estimate that moves. A call that comes too early is followed by another one, at
/// growing distances while the clock stands: an output that does not get on costs next to nothing.
class EndTimer {
public:
    EndTimer(EventLoop& loop, std::function<void()> call) : loop_(loop), call_(std::move(call)) {}

    /// May be called as often as one likes.
    void set(const Output& output, std::int64_t frame);

    void cancel();

private:
    void arm(std::chrono::nanoseconds time);

    EventLoop& loop_;
    const std::function<void()> call_;
    RegistrationHandle timer_;
    bool pending_ = false;
    std::chrono::nanoseconds time_{0};
    std::int64_t frame_ = -1;
    std::int64_t heardAtCall_ = -1;
    std::chrono::nanoseconds retry_{0};
};

} // namespace tarn
