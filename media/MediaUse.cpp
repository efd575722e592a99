#include "media/MediaUse.h"

#include <chrono>
#include <mutex>
#include <utility>

namespace tarn {

namespace {

constexpr std::chrono::milliseconds untilUnused{200};

}

class MediaUse::Count {
public:
    Count(EventLoop& loop, std::function<void()> unused) : loop_(&loop), unused_(std::move(unused)) {}

    void begin() {
        RegistrationHandle dropped; // behind the lock
        std::lock_guard lock(mutex_);
        if (assets_++ == 0)
            dropped = std::move(timer_);
    }

    void end() {
        std::lock_guard lock(mutex_);
        if (--assets_ == 0 && loop_ != nullptr)
            timer_ = loop_->at(loop_->now() + untilUnused, unused_);
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
    const std::function<void()> unused_;
    std::size_t assets_ = 0;
    RegistrationHandle timer_;
};

MediaUse::MediaUse(EventLoop& loop, std::function<void()> unused)
    : count_(std::make_shared<Count>(loop, std::move(unused))) {}

MediaUse::~MediaUse() { count_->close(); }

std::shared_ptr<MediaAsset> MediaUse::counted(std::shared_ptr<MediaAsset> asset) {
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
