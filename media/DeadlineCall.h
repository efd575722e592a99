#pragma once

#include <chrono>
#include <functional>

namespace tarn {

using SteadyTime = std::chrono::steady_clock::time_point;

/// Runs `work`, in which a system call may never return (a stuck mount), on a thread of its own that nobody
/// waits for; so `work` owns all that it touches. False when no thread is to be had: while many are left
/// behind no more are begun. Any thread may call.
[[nodiscard]] bool startDetached(std::function<void()> work);

/// The same, but waits until `work` is done or `deadline` has come. False when it is late.
[[nodiscard]] bool callUntil(SteadyTime deadline, std::function<void()> work);

} // namespace tarn
