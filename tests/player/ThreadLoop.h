#pragma once

#include <condition_variable>
#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <thread>

#include "player/EventLoop.h"

namespace tarn {

/// A player thread on real time.
class ThreadLoop final : public EventLoop {
public:
    ThreadLoop();
    ~ThreadLoop() override { finish(); }

    void post(std::function<void()> work) override;
    RegistrationHandle at(std::chrono::nanoseconds time, std::function<void()> work) override;
    bool isCurrent() const override { return std::this_thread::get_id() == thread_.get_id(); }
    std::chrono::nanoseconds now() const override;

    /// Waits until what has been posted, and what that posts, has run.
    void finishPosted();

    /// Runs what has been posted and ends the thread.
    void finish();

private:
    using Work = std::function<void()>;

    void run();
    std::shared_ptr<Work> dueTimer();

    std::mutex mutex_;
    std::condition_variable changed_;
    std::condition_variable idle_;
    std::deque<Work> posted_;
    std::multimap<std::chrono::nanoseconds, std::weak_ptr<Work>> timers_;
    bool busy_ = false;
    bool finishing_ = false;
    std::thread thread_;
};

} // namespace tarn
