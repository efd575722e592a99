#pragma once

#include <deque>
#include <mutex>
#include <semaphore>

#include "roles/SerialQueue.h"

namespace tarn {

/// The queue of the main thread's run loop. While that thread waits for work, sync() runs in place, under the
/// queue's exclusion: waking a thread costs more than anything that the main queue does.
class MainQueue final : public SerialQueue {
public:
    void async(Work work) override;
    void sync(const std::function<void()>& work) override;
    bool isCurrent() const override;
    const std::string& label() const override { return label_; }

    /// Runs work on the calling thread until end(), and none runs in place any more when it returns. Work
    /// left over then stays queued.
    void runLoop();

    /// Any thread: lets runLoop() return after the work that runs now, or at once when it is called later.
    void end();

private:
    const std::string label_ = "main";
    bool lend();
    void takeBack();
    void wakeIfItWaits(std::unique_lock<std::mutex> lock);

    std::counting_semaphore<> wake_{0};
    std::mutex mutex_; // guards what follows
    std::deque<Work> line_;
    bool ended_ = false;
    bool waits_ = false;  // the main thread, for the next wake-up
    bool isLent_ = false; // to a thread in sync(); the main thread waits meanwhile
};

} // namespace tarn
