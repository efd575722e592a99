#include "threads/SteadyClock.h"

#include <condition_variable>
#include <mutex>

#include "threads/BlockingSection.h"

namespace tarn {

namespace {

class SteadySignal final : public OneShotSignal {
public:
    void signal() override {
        std::lock_guard lock(mutex_);
        signalled_ = true;
        changed_.notify_all();
    }

    bool wait(std::chrono::nanoseconds limit) override {
        BlockingSection blocking;
        auto end = std::chrono::steady_clock::now() + limit;
        std::unique_lock lock(mutex_);
        return changed_.wait_until(lock, end, [this] { return signalled_; });
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    bool signalled_ = false;
};

} // namespace

SteadyClock::SteadyClock() : origin_(std::chrono::steady_clock::now()) {}

std::chrono::nanoseconds SteadyClock::now() const { return std::chrono::steady_clock::now() - origin_; }

std::shared_ptr<OneShotSignal> SteadyClock::makeSignal() { return std::make_shared<SteadySignal>(); }

} // namespace tarn
