#pragma once

#include <condition_variable>
#include <deque>
#include <mutex>

#include "platform/SerialQueue.h"

namespace tarn {

/// The queue of the main thread's run loop.
class MainQueue final : public SerialQueue {
public:
    void async(std::function<void()> work) override;
    void sync(const std::function<void()>& work) override;
    bool isCurrent() const override;
    const std::string& label() const override { return label_; }

    /// Runs work on the calling thread until end(). Work left over then stays queued.
    void runLoop();

    /// Any thread: lets runLoop() return after the work that runs now, or at once when it is called later.
    void end();

private:
    const std::string label_ = "main";
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<std::function<void()>> line_;
    bool ended_ = false;
};

} // namespace tarn
