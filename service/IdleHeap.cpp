#include "service/IdleHeap.h"

#include <malloc.h>

#include <chrono>
#include <mutex>
#include <utility>

namespace tarn {

namespace {

constexpr std::chrono::milliseconds patience{200}; // the rest of a client goes, or the next one comes

}

class IdleHeap::Count {
public:
    explicit Count(EventLoop& loop) : loop_(&loop) {}

    void begin() {
        RegistrationHandle dropped; // behind the lock
        std::lock_guard lock(mutex_);
        if (assets_++ == 0)
            dropped = std::move(timer_);
    }

    void end() {
        std::lock_guard lock(mutex_);
        if (--assets_ == 0 && loop_ != nullptr)
            timer_ = loop_->at(loop_->now() + patience, [] { malloc_trim(0); });
    }

    void close() {
        RegistrationHandle dropped;
        std::lock_guard lock(mutex_);
        loop_ = nullptr;
        dropped = std::move(timer_);
    }

private:
    std::mutex mutex_;
    EventLoop* loop_; // null when it is gone
    std::size_t assets_ = 0;
    RegistrationHandle timer_;
};

IdleHeap::IdleHeap(EventLoop& loop) : count_(std::make_shared<Count>(loop)) {}

IdleHeap::~IdleHeap() { count_->close(); }

std::shared_ptr<MediaAsset> IdleHeap::counted(std::shared_ptr<MediaAsset> asset) {
    struct Use {
        Use(std::shared_ptr<MediaAsset> counted, std::shared_ptr<Count> by)
            : asset(std::move(counted)), count(std::move(by)) {
            count->begin();
        }
        ~Use() {
            asset.reset();
            count->end();
        }
        Use(const Use&) = delete;
        Use& operator=(const Use&) = delete;

        std::shared_ptr<MediaAsset> asset;
        const std::shared_ptr<Count> count;
    };
    const auto use = std::make_shared<Use>(std::move(asset), count_);
    return {use, use->asset.get()};
}

} // namespace tarn
