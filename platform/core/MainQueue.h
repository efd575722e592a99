#pragma once

#include <deque>
#include <mutex>
#include <semaphore>

#include "platform/SerialQueue.h"

namespace tarn {

/// The queue of the main thread's run loop.
class MainQueue final : public SerialQueue {
public:
    void async(Work work) override;
    void sync(const std::function<void()>& work) override;
    bool isCurrent() const override;
    const std::string& label() const override { return label_; }

    /// Runs work on the calling thread until end(). Work left over then stays queued.
    void runLoop();

    /// Any thread: lets runLoop() return after the work that runs now, or at once when it is called later.
    void end();

private:
    const std::string label_ = "main";
    void wakeIfItWaits(std::unique_lock<std::mutex> lock);

    std::counting_semaphore<> wake_{0};
    std::mutex mutex_; // guards what follows
    std::deque<Work> line_;
    bool ended_ = false;
    bool waits_ = false;
};

} // namespace tarn
