#include "player/DescriptorWatches.h"

#include <sys/epoll.h>

#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

namespace tarn {

class DescriptorWatches::Watch final : public Registration {
public:
    Watch(DescriptorWatches& watches, std::uint64_t key, int watched)
        : watches_(watches), key_(key), watched_(watched) {}
    ~Watch() override {
        epoll_ctl(watches_.epoll_.get(), EPOLL_CTL_DEL, watched_, nullptr);
        watches_.calls_.erase(key_);
    }

private:
    DescriptorWatches& watches_;
    const std::uint64_t key_;
    const int watched_;
};

DescriptorWatches::DescriptorWatches() : epoll_(epoll_create1(EPOLL_CLOEXEC)) {
    if (!epoll_)
        throw std::system_error(errno, std::generic_category(), "epoll_create1");
}

RegistrationHandle DescriptorWatches::add(int watched, std::function<void()> readable) {
    const std::uint64_t key = ++lastKey_;
    epoll_event event{};
    event.events = EPOLLIN;
    event.data.u64 = key;
    epoll_ctl(epoll_.get(), EPOLL_CTL_ADD, watched, &event);
    calls_.emplace(key, std::make_shared<std::function<void()>>(std::move(readable)));
    return std::make_unique<Watch>(*this, key, watched);
}

void DescriptorWatches::callReady() {
    std::array<epoll_event, 16> ready{};
    const int count = epoll_wait(epoll_.get(), ready.data(), static_cast<int>(ready.size()), 0);
    for (int i = 0; i < count; ++i) {
        const auto found = calls_.find(ready[static_cast<std::size_t>(i)].data.u64);
        if (found == calls_.end()) // a call before has dropped it
            continue;
        const auto call = found->second; // which may drop itself
        (*call)();
    }
}

} // namespace tarn
