#include "player/SystemPoller.h"

#include <cerrno>
#include <utility>

namespace tarn {

void SystemPoller::watch(int descriptor, std::function<void()> readable) {
    descriptors_.push_back({descriptor, POLLIN, 0});
    calls_.push_back(std::move(readable));
}

bool SystemPoller::wait(bool idle) {
    if (poll(descriptors_.data(), descriptors_.size(), idle ? -1 : 0) < 0)
        return errno == EINTR;
    for (std::size_t i = 0; i < descriptors_.size(); ++i)
        if (descriptors_[i].revents != 0)
            calls_[i]();
    return true;
}

} // namespace tarn
