#include "platform/linux/media/DeadlineCall.h"

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <system_error>
#include <thread>

namespace tarn {

namespace {

constexpr int mostThreads = 32;

struct Call {
    std::function<void()> work;
    std::mutex mutex;
    std::condition_variable finished;
    bool done = false;
};

std::atomic<int>& runningThreads() {
    static std::atomic<int> count{0};
    return count;
}

void run(const std::shared_ptr<Call>& call) {
    call->work();
    call->work = nullptr; // what it owns goes on this thread, before anyone can wait for it
    runningThreads().fetch_sub(1);
    std::lock_guard lock(call->mutex);
    call->done = true;
    call->finished.notify_one();
}

} // namespace

bool callUntil(SteadyTime deadline, std::function<void()> work) {
    if (runningThreads().fetch_add(1) >= mostThreads) {
        runningThreads().fetch_sub(1);
        return false;
    }
    auto call = std::make_shared<Call>();
    call->work = std::move(work);
    try {
        std::thread([call] { run(call); }).detach();
    } catch (const std::system_error&) { // no thread to be had
        runningThreads().fetch_sub(1);
        return false;
    }
    std::unique_lock lock(call->mutex);
    return call->finished.wait_until(lock, deadline, [&] { return call->done; });
}

} // namespace tarn
