#pragma once

#include <exception>
#include <functional>
#include <mutex>
#include <semaphore>
#include <thread>
#include <utility>

namespace tarn {

// What this room is built of where threads exclude each other, wait for each other and begin. It uses nothing
// else for that, so a test can put a header of its own in the place of this one and have a seed decide which
// thread goes on.

using Mutex = std::mutex;
using Semaphore = std::counting_semaphore<>;

/// Runs `body` on a new thread that nobody joins. False when the system has no thread to give, which every
/// caller has an answer to.
inline bool startThread(std::function<void()> body) noexcept {
    try {
        std::thread(std::move(body)).detach();
        return true;
    } catch (const std::exception&) {
        return false;
    }
}

} // namespace tarn
