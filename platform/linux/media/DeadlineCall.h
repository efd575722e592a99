#pragma once

#include <chrono>
#include <functional>

namespace tarn {

using SteadyTime = std::chrono::steady_clock::time_point;

/// Runs `work`, a system call that may never return (a stuck mount), on a thread of its own and waits for it
/// until `deadline`. False when it is late: the thread is left behind until its call returns, so `work` owns
/// all that it touches. While many are left behind no more are begun, and the answer is false at once.
[[nodiscard]] bool callUntil(SteadyTime deadline, std::function<void()> work);

} // namespace tarn
