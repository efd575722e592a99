#include "media/DeadlineCall.h"

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <system_error>
#include <thread>
#include <utility>

namespace tarn {

namespace {

constexpr int mostThreads = 64;

struct Call {
    std::mutex mutex;
    std::condition_variable finished;
    bool done = false;
};

std::atomic<int>& runningThreads() {
    static std::atomic<int> count{0};
    return count;
}

} // namespace

bool startDetached(std::function<void()> work) {
    if (runningThreads().fetch_add(1) >= mostThreads) {
        runningThreads().fetch_sub(1);
        return false;
    }
    try {
        std::thread([work = std::move(work)]() mutable {
            std::exchange(work, nullptr)();
            runningThreads().fetch_sub(1);
        }).detach();
    } catch (const std::system_error&) { // no thread to be had
        runningThreads().fetch_sub(1);
        return false;
    }
    return true;
}

bool callUntil(SteadyTime deadline, std::function<void()> work) {
    const auto call = std::make_shared<Call>();
    const bool started = startDetached([call, work = std::move(work)]() mutable {
        std::exchange(work, nullptr)(); // what it owns goes on this thread, before anyone can wait for it
        std::lock_guard lock(call->mutex);
        call->done = true;
        call->finished.notify_one();
    });
    if (!started)
        return false;
    std::unique_lock lock(call->mutex);
    return call->finished.wait_until(lock, deadline, [&] { return call->done; });
}

} // namespace tarn
