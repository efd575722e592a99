#pragma once

#include <chrono>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <string>
#include <utility>

namespace tarn {

/// Things that happen on other threads, to be waited for.
class Events {
public:
    void add(std::string event) {
        std::lock_guard lock(mutex_);
        events_.push_back(std::move(event));
        changed_.notify_all();
    }

    /// Waits for the next event of this name and forgets all before it.
    [[nodiscard]] bool wait(const std::string& event,
                            std::chrono::milliseconds limit = std::chrono::seconds(20)) {
        std::unique_lock lock(mutex_);
        const auto arrived = [&] {
            while (!events_.empty() && events_.front() != event)
                events_.pop_front();
            return !events_.empty();
        };
        if (!changed_.wait_for(lock, limit, arrived))
            return false;
        events_.pop_front();
        return true;
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<std::string> events_;
};

} // namespace tarn
